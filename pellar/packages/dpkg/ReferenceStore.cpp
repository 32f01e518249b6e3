// SPDX-License-Identifier: Apache-2.0
#include "pellar/packages/dpkg/ReferenceStore.h"

#include "pellar/bytes/Digest.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <vector>

namespace pellar {
namespace {

bool isOwn(const std::filesystem::path& path)
{
    struct stat status = {};
    return ::lstat(path.c_str(), &status) == 0 && S_ISDIR(status.st_mode) &&
           status.st_uid == ::geteuid() && (status.st_mode & (S_IWGRP | S_IWOTH)) == 0;
}

bool isDigest(std::string_view text)
{
    return kindOfDigest(text) == DigestKind::SHA256;
}

bool writeAll(int file, std::string_view bytes)
{
    while (!bytes.empty()) {
        const ssize_t count = ::write(file, bytes.data(), bytes.size());
        if (count <= 0)
            return false;
        bytes.remove_prefix(static_cast<std::size_t>(count));
    }
    return true;
}

}  // namespace

ReferenceStore::ReferenceStore(std::filesystem::path directory) : directory_(std::move(directory))
{
    if (directory_.empty())
        return;
    std::error_code error;
    std::filesystem::create_directories(directory_.parent_path(), error);
    ::mkdir(directory_.c_str(), 0700);
    isTrusted_ = isOwn(directory_);
    if (isTrusted_)
        removeOthers();
}

// References without a digest were kept by earlier versions, of whatever system was looked at.
void ReferenceStore::removeOthers() const
{
    std::error_code error;
    std::vector<std::filesystem::path> others;
    for (const auto& entry : std::filesystem::directory_iterator(directory_, error)) {
        const std::string name = entry.path().filename();
        const std::string stem = name.substr(0, name.find('.'));
        const bool isOurs = name.ends_with(".mtree") || name.ends_with(".deb") ||
                            name.find(".mtree.") != std::string::npos;
        if (isOurs && (!isDigest(stem) || name != stem + ".mtree"))
            others.push_back(entry.path());
    }
    for (const std::filesystem::path& path : others)
        ::unlink(path.c_str());
}

std::filesystem::path ReferenceStore::pathOf(const std::string& digest) const
{
    return directory_ / (digest + ".mtree");
}

FileDescriptor ReferenceStore::open(const std::string& digest) const
{
    if (!isTrusted_ || !isDigest(digest))
        return {};
    return FileDescriptor(
        ::open(pathOf(digest).c_str(), O_RDONLY | O_CLOEXEC | O_NOFOLLOW | O_NONBLOCK));
}

// Whole or not at all: half a reference would leave files without one, unseen.
void ReferenceStore::keep(const std::string& digest, std::string_view mtree)
{
    if (!isTrusted_ || !isDigest(digest))
        return;
    std::string temporary = pathOf(digest).native() + ".XXXXXX";
    const FileDescriptor file(::mkostemp(temporary.data(), O_CLOEXEC));
    if (!file)
        return;
    if (!writeAll(file.get(), mtree) || ::rename(temporary.c_str(), pathOf(digest).c_str()) != 0)
        ::unlink(temporary.c_str());
}

}  // namespace pellar
