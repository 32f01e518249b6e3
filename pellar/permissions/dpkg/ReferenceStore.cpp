// SPDX-License-Identifier: Apache-2.0
#include "pellar/permissions/dpkg/ReferenceStore.h"

#include "pellar/process/FileDescriptor.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cstdio>
#include <fstream>
#include <iterator>

namespace pellar {
namespace {

bool isOwn(const std::filesystem::path& path)
{
    struct stat status = {};
    return ::lstat(path.c_str(), &status) == 0 && S_ISDIR(status.st_mode) &&
           status.st_uid == ::geteuid() && (status.st_mode & (S_IWGRP | S_IWOTH)) == 0;
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
}

std::filesystem::path ReferenceStore::pathOf(const std::string& name) const
{
    return directory_ / (name + ".mtree");
}

std::optional<std::vector<PackagedFile>> ReferenceStore::find(const std::string& name) const
{
    if (!isTrusted_)
        return std::nullopt;
    std::ifstream file(pathOf(name), std::ios::binary);
    if (!file)
        return std::nullopt;
    return readMtree(std::string(std::istreambuf_iterator<char>(file), {}));
}

bool ReferenceStore::has(const std::string& name) const
{
    return isTrusted_ && ::access(pathOf(name).c_str(), R_OK) == 0;
}

// Whole or not at all: half a reference would leave files without one, unseen.
void ReferenceStore::keep(const std::string& name, const std::vector<PackagedFile>& files)
{
    const auto text = isTrusted_ ? writeMtree(files) : std::nullopt;
    if (!text)
        return;
    std::string temporary = pathOf(name).native() + ".XXXXXX";
    const FileDescriptor file(::mkostemp(temporary.data(), O_CLOEXEC));
    if (!file)
        return;
    if (!writeAll(file.get(), *text) || ::rename(temporary.c_str(), pathOf(name).c_str()) != 0)
        ::unlink(temporary.c_str());
}

}  // namespace pellar
