// SPDX-License-Identifier: Apache-2.0
#include "pellar/packages/PackagedFile.h"

#include "pellar/bytes/Digest.h"
#include "pellar/packages/RootDirectory.h"
#include "pellar/packages/TextLines.h"

#include <archive.h>
#include <archive_entry.h>
#include <sys/stat.h>

#include <array>
#include <charconv>
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

template <class Number>
bool setNumber(Number& number, std::string_view text, int base)
{
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number, base);
    return !text.empty() && error == std::errc() && end == text.data() + text.size();
}

bool isOctal(std::string_view text)
{
    return text.size() >= 3 && text[0] <= '3' &&
           text.substr(0, 3).find_first_not_of("01234567") == std::string_view::npos;
}

// "su\040do": what would end the word or the line (vis(3)).
std::string unescaped(std::string_view word)
{
    std::string text;
    while (!word.empty()) {
        const bool isEscape = word.front() == '\\' && isOctal(word.substr(1));
        text +=
            isEscape
                ? static_cast<char>((word[1] - '0') * 64 + (word[2] - '0') * 8 + (word[3] - '0'))
                : word.front();
        word.remove_prefix(isEscape ? 4 : 1);
    }
    return text;
}

std::string escaped(std::string_view text)
{
    std::string word;
    for (const char c : text) {
        const auto byte = static_cast<unsigned char>(c);
        if (byte > 0x20 && byte < 0x7F && c != '\\' && c != '#' && c != '=') {
            word += c;
            continue;
        }
        word += '\\';
        for (const unsigned shift : {6U, 3U, 0U})
            word += static_cast<char>('0' + (byte >> shift & 7U));
    }
    return word;
}

FileKind kindNamed(std::string_view name)
{
    if (name == "file")
        return FileKind::Regular;
    if (name == "dir")
        return FileKind::Directory;
    return name == "link" ? FileKind::SymbolicLink : FileKind::Other;
}

std::string_view nameOf(FileKind kind)
{
    switch (kind) {
        case FileKind::Regular: return "file";
        case FileKind::Directory: return "dir";
        case FileKind::SymbolicLink: return "link";
        case FileKind::Other: break;
    }
    return "socket";
}

/// NO for a keyword whose value is none. Keywords of no use here are left out.
bool take(std::string_view keyword, std::string_view value, PackagedFile& file)
{
    if (keyword == "type")
        file.kind = kindNamed(value);
    else if (keyword == "mode") {
        const bool isNumber = setNumber(file.mode, value, 8);
        file.mode &= 07777U;
        return isNumber;
    } else if (keyword == "uid")
        return setNumber(file.user.number, value, 10);
    else if (keyword == "gid")
        return setNumber(file.group.number, value, 10);
    else if (keyword == "uname")
        file.user.name = unescaped(value);
    else if (keyword == "gname")
        file.group.name = unescaped(value);
    else if (keyword == "sha256digest" || keyword == "sha256" ||
             ((keyword == "md5digest" || keyword == "md5") && file.digest.size() < 64))
        file.digest = value;
    return true;
}

bool takeAll(std::string_view line, PackagedFile& file)
{
    for (std::string_view word = takeWord(line); !word.empty(); word = takeWord(line)) {
        const std::string_view keyword = takeField(word, '=');
        if (!take(keyword, word, file))
            return false;
    }
    return file.digest.empty() || kindOfDigest(file.digest).has_value();
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

// /set type=file uid=0 gid=0 mode=644
// ./usr/bin/sudo time=1700000000.0 mode=4755 size=232416 sha256digest=66…
PackagedFiles parseMtree(std::string_view text)
{
    if (text.size() > mostBytesOfMtree)
        return PackageFault::BeyondBounds;
    std::vector<PackagedFile> files;
    PackagedFile standard;
    while (!text.empty()) {
        std::string_view line = takeField(text, '\n');
        const std::string_view name = takeWord(line);
        if (name.empty() || name.front() == '#' || name == "/unset")
            continue;
        PackagedFile file = standard;
        if (!takeAll(line, file) || (name != "/set" && !name.starts_with("./") && name != "."))
            return PackageFault::Malformed;
        if (name == "/set") {
            standard = std::move(file);
            continue;
        }
        if (files.size() >= mostFilesOfPackage)
            return PackageFault::BeyondBounds;
        file.path = withoutSlashes(unescaped(name));
        if (!file.path.empty())
            files.push_back(std::move(file));
    }
    return files;
}

PackagedFiles readMtree(int file)
{
    std::string text;
    const bool isWhole = unpack(file, [&text](std::string_view bytes) {
        text += bytes;
        return text.size() <= mostBytesOfMtree;
    });
    if (text.size() > mostBytesOfMtree)
        return PackageFault::BeyondBounds;
    return isWhole ? parseMtree(text) : PackagedFiles(PackageFault::Malformed);
}

std::string writeMtree(const std::vector<PackagedFile>& files)
{
    std::string text = "#mtree\n";
    for (const PackagedFile& file : files) {
        if (file.path.empty())
            continue;
        std::array<char, 8> mode{};
        const auto end = std::to_chars(mode.data(), mode.data() + mode.size(), file.mode, 8).ptr;
        text += "./" + escaped(file.path) + " type=" + std::string(nameOf(file.kind)) +
                " mode=" + std::string(mode.data(), end) +
                " uid=" + std::to_string(file.user.number) +
                " gid=" + std::to_string(file.group.number) + " uname=" + escaped(file.user.name) +
                " gname=" + escaped(file.group.name);
        text += file.digest.empty() ? "\n" : " sha256digest=" + file.digest + '\n';
    }
    return text;
}

}  // namespace pellar
