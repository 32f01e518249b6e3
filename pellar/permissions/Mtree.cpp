// SPDX-License-Identifier: Apache-2.0
#include "pellar/permissions/Digest.h"
#include "pellar/permissions/Lines.h"
#include "pellar/permissions/PackagedFile.h"
#include "pellar/permissions/PathAliases.h"

#include <array>
#include <charconv>

namespace pellar {
namespace {

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
