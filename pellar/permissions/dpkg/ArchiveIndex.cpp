// SPDX-License-Identifier: Apache-2.0
#include "pellar/permissions/dpkg/ArchiveIndex.h"

#include "pellar/permissions/Digest.h"
#include "pellar/permissions/Lines.h"
#include "pellar/permissions/PackagedFile.h"

#include <sys/stat.h>

#include <algorithm>
#include <cstdint>
#include <utility>

namespace pellar {
namespace {

const std::string listDirectory = "var/lib/apt/lists";
constexpr std::uint64_t mostBytesOfList = 1U << 30U;  ///< Debian's whole "main" has 50 million
constexpr std::size_t mostLists = 500;

bool isRootsAlone(int file)
{
    struct stat status = {};
    return ::fstat(file, &status) == 0 && status.st_uid == 0 &&
           (status.st_mode & (S_IWGRP | S_IWOTH)) == 0;
}

bool isPackageList(const std::string& name)
{
    const std::size_t mark = name.rfind("_Packages");
    return mark != std::string::npos && (mark + 9 == name.size() || name[mark + 9] == '.');
}

/// Takes a list line by line, as its pieces come.
class ListReader {
public:
    explicit ListReader(std::unordered_map<std::string, std::vector<std::string>>& digests)
        : digests_(digests)
    {
    }

    bool take(std::string_view bytes)
    {
        constexpr std::size_t longestLine = 1U << 20U;
        size_ += bytes.size();
        rest_ += bytes;
        std::string_view lines = rest_;
        for (std::size_t end = 0; (end = lines.find('\n')) != std::string_view::npos;) {
            line(lines.substr(0, end));
            lines.remove_prefix(end + 1);
        }
        rest_.erase(0, rest_.size() - lines.size());
        return size_ <= mostBytesOfList && rest_.size() <= longestLine;
    }

    void endParagraph()
    {
        const DpkgPackage ended = std::exchange(package_, {});
        const std::string digest = std::exchange(digest_, {});
        const auto wanted = digests_.find(ended.name.empty() ? std::string() : ended.fileName());
        if (wanted != digests_.end() && kindOfDigest(digest) == DigestKind::SHA256)
            wanted->second.push_back(digest);
    }

private:
    void line(std::string_view text)
    {
        if (text.empty())
            return endParagraph();
        const char first = text.front();
        if (first != 'P' && first != 'V' && first != 'A' && first != 'S')
            return;
        const std::string_view field = takeField(text, ':');
        text.remove_prefix(std::min(text.find_first_not_of(' '), text.size()));
        if (field == "Package")
            package_.name = text;
        else if (field == "Version")
            package_.version = text;
        else if (field == "Architecture")
            package_.architecture = text;
        else if (field == "SHA256")
            digest_ = text;
    }

    std::unordered_map<std::string, std::vector<std::string>>& digests_;
    std::string rest_;
    std::uint64_t size_ = 0;
    DpkgPackage package_;
    std::string digest_;
};

}  // namespace

ArchiveIndex::ArchiveIndex(const RootFiles& root, std::span<const DpkgPackage> packages)
{
    for (const DpkgPackage& package : packages)
        digests_[package.fileName()];
    std::size_t lists = 0;
    for (const std::string& name : root.names(listDirectory)) {
        if (!isPackageList(name) || ++lists > mostLists)
            continue;
        if (const FileDescriptor list = root.openFile(listDirectory + '/' + name);
            list && isRootsAlone(list.get()))
            add(list.get());
    }
}

// Package: bash
// Architecture: amd64
// Version: 5.2.15-2+b8
// SHA256: 40f5f1ba8ef2f2b5… (apt 2.6.1)
void ArchiveIndex::add(int list)
{
    ListReader reader(digests_);
    if (unpack(list, [&reader](std::string_view bytes) { return reader.take(bytes); }))
        reader.endParagraph();
}

const std::vector<std::string>& ArchiveIndex::digestsOf(const DpkgPackage& package) const
{
    static const std::vector<std::string> none;
    const auto found = digests_.find(package.fileName());
    return found != digests_.end() ? found->second : none;
}

}  // namespace pellar
