// SPDX-License-Identifier: Apache-2.0
#include "pellar/permissions/PackagedFile.h"

#include "pellar/permissions/Digest.h"
#include "pellar/permissions/PathAliases.h"

#include <archive.h>
#include <archive_entry.h>
#include <sys/stat.h>

#include <array>
#include <memory>
#include <unordered_map>

namespace pellar {
namespace {

struct FreeArchive {
    void operator()(archive* opened) const { ::archive_free(opened); }
};
using ArchivePointer = std::unique_ptr<archive, FreeArchive>;

constexpr std::size_t blockBytes = 65536;

// dpkg's own (dpkg-deb(1), -Z, and what it reads from before), and lz4 for apt's indexes. A library
// built without one of them answers ARCHIVE_WARN, and would run a program found by PATH.
bool supportFilters(archive* opened)
{
    return ::archive_read_support_filter_gzip(opened) == ARCHIVE_OK &&
           ::archive_read_support_filter_xz(opened) == ARCHIVE_OK &&
           ::archive_read_support_filter_zstd(opened) == ARCHIVE_OK &&
           ::archive_read_support_filter_bzip2(opened) == ARCHIVE_OK &&
           ::archive_read_support_filter_lzma(opened) == ARCHIVE_OK;
}

std::string textOf(const char* text, const char* asUTF8)
{
    return text != nullptr ? text : asUTF8 != nullptr ? asUTF8 : "";
}

/// Reads a tree of files, within the bounds of a package.
class TarReading {
public:
    explicit TarReading(archive* opened) : opened_(opened) {}

    PackagedFiles read()
    {
        archive_entry* entry = nullptr;
        int result = ARCHIVE_OK;
        while ((result = ::archive_read_next_header(opened_, &entry)) == ARCHIVE_OK ||
               result == ARCHIVE_WARN) {
            if (isBeyondBounds(entry))
                return PackageFault::BeyondBounds;
            add(entry);
        }
        if (result != ARCHIVE_EOF)
            return PackageFault::Malformed;
        return std::move(files_);
    }

private:
    // What a member holds is unpacked even to be skipped.
    bool isBeyondBounds(archive_entry* entry) const
    {
        const la_int64_t before = ::archive_filter_bytes(opened_, 0);
        const la_int64_t size = ::archive_entry_size(entry);
        constexpr auto most = static_cast<la_int64_t>(mostBytesOfPackage);
        return files_.size() >= mostFilesOfPackage || size < 0 || before > most ||
               size > most - before;
    }

    // A hard link of tar's has no type and no contents of its own; it is a regular file's further
    // name, and that stands before it.
    void add(archive_entry* entry)
    {
        const char* const link = ::archive_entry_hardlink(entry);
        PackagedFile file;
        file.path = withoutSlashes(
            textOf(::archive_entry_pathname(entry), ::archive_entry_pathname_utf8(entry)));
        file.kind = link != nullptr ? FileKind::Regular : kindOf(::archive_entry_filetype(entry));
        file.mode = ::archive_entry_perm(entry) & 07777U;
        file.user = {textOf(::archive_entry_uname(entry), nullptr),
                     static_cast<std::uint32_t>(::archive_entry_uid(entry))};
        file.group = {textOf(::archive_entry_gname(entry), nullptr),
                      static_cast<std::uint32_t>(::archive_entry_gid(entry))};
        if (file.kind == FileKind::Regular && (file.mode & (S_ISUID | S_ISGID)) != 0)
            file.digest = link != nullptr ? digests_[withoutSlashes(link)]
                                          : digests_[file.path] = digestOfContents();
        files_.push_back(std::move(file));
    }

    std::string digestOfContents()
    {
        Digester digester(DigestKind::SHA256);
        std::array<char, blockBytes> block{};
        la_ssize_t count = 0;
        while ((count = ::archive_read_data(opened_, block.data(), block.size())) > 0)
            digester.add({block.data(), static_cast<std::size_t>(count)});
        return count == 0 ? digester.finish() : std::string();
    }

    archive* opened_;
    std::vector<PackagedFile> files_;
    std::unordered_map<std::string, std::string> digests_;
};

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

PackagedFiles filesOfMember(archive* outer)
{
    const auto member = std::make_unique<Member>(Member{outer});
    const ArchivePointer inner(::archive_read_new());
    if (!supportFilters(inner.get()) ||
        ::archive_read_support_format_tar(inner.get()) != ARCHIVE_OK ||
        ::archive_read_open(inner.get(), member.get(), nullptr, Member::read, nullptr) !=
            ARCHIVE_OK)
        return PackageFault::Malformed;
    return TarReading(inner.get()).read();
}

}  // namespace

std::uint32_t numberFor(const PackagedOwner& owner, const AccountNames& accounts)
{
    return accounts.numberOf(owner.name).value_or(owner.number);
}

PackagedFiles readDebArchive(int file)
{
    const ArchivePointer outer(::archive_read_new());
    ::archive_read_support_format_ar(outer.get());
    if (::archive_read_open_fd(outer.get(), file, blockBytes) != ARCHIVE_OK)
        return PackageFault::Malformed;
    constexpr int mostMembers = 16;  // deb(5) has three, and may get more
    archive_entry* entry = nullptr;
    for (int i = 0; i < mostMembers; ++i) {
        if (::archive_read_next_header(outer.get(), &entry) != ARCHIVE_OK)
            break;
        if (textOf(::archive_entry_pathname(entry), nullptr).starts_with("data.tar"))
            return filesOfMember(outer.get());
    }
    return PackageFault::Malformed;
}

bool unpack(int file, const std::function<bool(std::string_view)>& take)
{
    const ArchivePointer opened(::archive_read_new());
    archive_entry* entry = nullptr;
    if (!supportFilters(opened.get()) ||
        ::archive_read_support_filter_lz4(opened.get()) != ARCHIVE_OK ||
        ::archive_read_support_format_raw(opened.get()) != ARCHIVE_OK ||
        ::archive_read_support_format_empty(opened.get()) != ARCHIVE_OK ||
        ::archive_read_open_fd(opened.get(), file, blockBytes) != ARCHIVE_OK)
        return false;
    const int opening = ::archive_read_next_header(opened.get(), &entry);
    if (opening == ARCHIVE_EOF)
        return true;  // an empty file
    la_ssize_t count = opening == ARCHIVE_OK ? 0 : -1;
    std::array<char, blockBytes> block{};
    while (count >= 0 &&
           (count = ::archive_read_data(opened.get(), block.data(), block.size())) > 0)
        if (!take({block.data(), static_cast<std::size_t>(count)}))
            return false;
    return count == 0;
}

}  // namespace pellar
