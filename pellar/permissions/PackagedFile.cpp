// SPDX-License-Identifier: Apache-2.0
#include "pellar/permissions/PackagedFile.h"

#include "pellar/permissions/PathAliases.h"

#include <archive.h>
#include <archive_entry.h>

#include <array>
#include <memory>

namespace pellar {
namespace {

struct FreeArchive {
    void operator()(archive* opened) const { ::archive_free(opened); }
    void operator()(archive_entry* entry) const { ::archive_entry_free(entry); }
};
using ArchivePointer = std::unique_ptr<archive, FreeArchive>;

constexpr std::size_t blockBytes = 65536;
/// No package has so many; an archive that was made to have them is no sound one.
constexpr std::size_t mostFiles = 2'000'000;

std::string textOf(const char* text, const char* asUTF8)
{
    return text != nullptr ? text : asUTF8 != nullptr ? asUTF8 : "";
}

// A hard link of tar's has no type of its own; it is a regular file's further name.
PackagedFile fileOf(archive_entry* entry)
{
    const bool isHardLink = ::archive_entry_hardlink(entry) != nullptr;
    PackagedFile file;
    file.path = withoutSlashes(
        textOf(::archive_entry_pathname(entry), ::archive_entry_pathname_utf8(entry)));
    file.kind = isHardLink ? FileKind::Regular : kindOf(::archive_entry_filetype(entry));
    file.mode = ::archive_entry_perm(entry) & 07777U;
    file.user = {textOf(::archive_entry_uname(entry), nullptr),
                 static_cast<std::uint32_t>(::archive_entry_uid(entry))};
    file.group = {textOf(::archive_entry_gname(entry), nullptr),
                  static_cast<std::uint32_t>(::archive_entry_gid(entry))};
    return file;
}

std::optional<std::vector<PackagedFile>> allFilesOf(archive* opened)
{
    std::vector<PackagedFile> files;
    archive_entry* entry = nullptr;
    int result = ARCHIVE_OK;
    while ((result = ::archive_read_next_header(opened, &entry)) == ARCHIVE_OK ||
           result == ARCHIVE_WARN) {
        files.push_back(fileOf(entry));
        if (files.size() > mostFiles)
            return std::nullopt;
    }
    return result == ARCHIVE_EOF ? std::optional(std::move(files)) : std::nullopt;
}

/// A member of an archive as the contents of another.
struct Member {
    archive* outer;
    std::array<char, blockBytes> block{};

    static la_ssize_t read(archive*, void* self, const void** bytes)
    {
        auto& member = *static_cast<Member*>(self);
        *bytes = member.block.data();
        return ::archive_read_data(member.outer, member.block.data(), member.block.size());
    }
};

std::optional<std::vector<PackagedFile>> filesOfMember(archive* outer)
{
    const auto member = std::make_unique<Member>(Member{outer});
    const ArchivePointer inner(::archive_read_new());
    ::archive_read_support_filter_all(inner.get());
    ::archive_read_support_format_tar(inner.get());
    if (::archive_read_open(inner.get(), member.get(), nullptr, Member::read, nullptr) !=
        ARCHIVE_OK)
        return std::nullopt;
    return allFilesOf(inner.get());
}

la_ssize_t append(archive*, void* text, const void* bytes, std::size_t length)
{
    static_cast<std::string*>(text)->append(static_cast<const char*>(bytes), length);
    return static_cast<la_ssize_t>(length);
}

unsigned typeOf(FileKind kind)
{
    switch (kind) {
        case FileKind::Regular: return AE_IFREG;
        case FileKind::Directory: return AE_IFDIR;
        case FileKind::SymbolicLink: return AE_IFLNK;
        case FileKind::Other: break;
    }
    return AE_IFSOCK;
}

bool write(archive* opened, archive_entry* entry, const PackagedFile& file)
{
    ::archive_entry_clear(entry);
    ::archive_entry_set_pathname(entry, file.path.c_str());
    ::archive_entry_set_filetype(entry, typeOf(file.kind));
    ::archive_entry_set_perm(entry, file.mode);
    ::archive_entry_set_uid(entry, file.user.number);
    ::archive_entry_set_gid(entry, file.group.number);
    ::archive_entry_set_uname(entry, file.user.name.c_str());
    ::archive_entry_set_gname(entry, file.group.name.c_str());
    return ::archive_write_header(opened, entry) == ARCHIVE_OK;
}

}  // namespace

std::uint32_t numberFor(const PackagedOwner& owner, const AccountNames& accounts)
{
    return accounts.numberOf(owner.name).value_or(owner.number);
}

std::optional<std::vector<PackagedFile>> readDebArchive(int file)
{
    const ArchivePointer outer(::archive_read_new());
    ::archive_read_support_format_ar(outer.get());
    if (::archive_read_open_fd(outer.get(), file, blockBytes) != ARCHIVE_OK)
        return std::nullopt;
    archive_entry* entry = nullptr;
    while (::archive_read_next_header(outer.get(), &entry) == ARCHIVE_OK)
        if (textOf(::archive_entry_pathname(entry), nullptr).starts_with("data.tar"))
            return filesOfMember(outer.get());
    return std::nullopt;
}

std::optional<std::vector<PackagedFile>> readMtree(std::string_view bytes)
{
    const ArchivePointer opened(::archive_read_new());
    ::archive_read_support_filter_gzip(opened.get());
    ::archive_read_support_format_mtree(opened.get());
    if (::archive_read_open_memory(opened.get(), bytes.data(), bytes.size()) != ARCHIVE_OK)
        return std::nullopt;
    return allFilesOf(opened.get());
}

std::optional<std::string> writeMtree(const std::vector<PackagedFile>& files)
{
    std::string text;
    const ArchivePointer opened(::archive_write_new());
    const std::unique_ptr<archive_entry, FreeArchive> entry(::archive_entry_new());
    ::archive_write_set_format_mtree(opened.get());
    ::archive_write_set_options(opened.get(), "!all,type,mode,uid,gid,uname,gname");
    if (::archive_write_open(opened.get(), &text, nullptr, append, nullptr) != ARCHIVE_OK)
        return std::nullopt;
    for (const PackagedFile& file : files)
        if (!file.path.empty() && !write(opened.get(), entry.get(), file))
            return std::nullopt;
    return ::archive_write_close(opened.get()) == ARCHIVE_OK ? std::optional(text) : std::nullopt;
}

}  // namespace pellar
