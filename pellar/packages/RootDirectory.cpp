// SPDX-License-Identifier: Apache-2.0
#include "pellar/packages/RootDirectory.h"

#include "pellar/packages/TextLines.h"

#include <dirent.h>
#include <fcntl.h>
#include <linux/openat2.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <memory>

namespace pellar {
namespace {

FileDescriptor openWithin(int directory, const std::string& path, std::uint64_t flags,
                          std::uint64_t resolve)
{
    open_how how = {};
    how.flags = flags | O_CLOEXEC;
    how.resolve = resolve | RESOLVE_NO_MAGICLINKS;
    long descriptor = -1;
    do  // EAGAIN: a rename was under way while a ".." was looked at (openat2(2))
        descriptor =
            ::syscall(SYS_openat2, directory, path.empty() ? "." : path.c_str(), &how, sizeof how);
    while (descriptor < 0 && (errno == EAGAIN || errno == EINTR));
    return FileDescriptor(static_cast<int>(descriptor));
}

struct CloseDirectory {
    void operator()(DIR* directory) const { ::closedir(directory); }
};

bool isRegular(int descriptor)
{
    struct stat status = {};
    return ::fstat(descriptor, &status) == 0 && S_ISREG(status.st_mode);
}

}  // namespace

std::string withoutSlashes(std::string_view path)
{
    std::string result;
    while (!path.empty()) {
        const std::string_view part = takeField(path, '/');
        if (part.empty() || part == ".")
            continue;
        result += result.empty() ? "" : "/";
        result += part;
    }
    return result;
}

void PathAliases::add(const std::string& link, std::string target)
{
    const std::size_t slash = link.rfind('/');
    if (!target.starts_with('/') && slash != std::string::npos)
        target = link.substr(0, slash + 1) + target;
    target = withoutSlashes(target);
    if (!target.empty() && target.find("..") == std::string::npos && target != link)
        aliases_[link] = target;
}

std::string PathAliases::canonical(std::string_view path) const
{
    constexpr int mostLinks = 4;  // sbin → usr/sbin → usr/bin
    std::string result = withoutSlashes(path);
    for (int i = 0; i < mostLinks; ++i)
        result = once(result);
    return result;
}

std::string PathAliases::once(const std::string& path) const
{
    for (const auto& [link, target] : aliases_)
        if (path.starts_with(link) && (path.size() == link.size() || path[link.size()] == '/'))
            return target + path.substr(link.size());
    return path;
}

std::optional<std::string> RootFiles::read(const std::string& path, std::size_t largest) const
{
    const FileDescriptor file = openFile(path);
    return file ? contentsOf(file.get(), largest) : std::nullopt;
}

std::optional<std::string> contentsOf(int file, std::size_t largest)
{
    std::string contents;
    std::array<char, 65536> buffer{};
    while (contents.size() <= largest) {
        const ssize_t count =
            ::pread(file, buffer.data(), buffer.size(), static_cast<off_t>(contents.size()));
        if (count < 0 && errno == EINTR)
            continue;
        if (count < 0)
            return std::nullopt;
        if (count == 0)
            return contents;
        contents.append(buffer.data(), static_cast<std::size_t>(count));
    }
    return std::nullopt;
}

std::optional<RootDirectory> RootDirectory::open(const std::filesystem::path& path)
{
    FileDescriptor directory(::open(path.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    if (!directory)
        return std::nullopt;
    RootDirectory root(std::move(directory));
    root.findAliases();
    return root;
}

// Only root's own links: whoever owns the link decides where it leads.
void RootDirectory::findAliases()
{
    for (const char* const link : {"bin", "sbin", "lib", "lib32", "lib64", "libx32", "usr/bin",
                                   "usr/sbin", "usr/lib32", "usr/lib64", "usr/libx32"}) {
        const FileDescriptor object = openObject(link);
        struct stat status = {};
        if (!object || ::fstat(object.get(), &status) != 0 || !S_ISLNK(status.st_mode) ||
            status.st_uid != 0)
            continue;
        std::array<char, 256> target{};
        const ssize_t length = ::readlinkat(object.get(), "", target.data(), target.size());
        if (length > 0 && static_cast<std::size_t>(length) < target.size())
            aliases_.add(link, std::string(target.data(), static_cast<std::size_t>(length)));
    }
}

FileDescriptor RootDirectory::openObject(const std::string& path) const
{
    return openWithin(directory_.get(), path, O_PATH | O_NOFOLLOW,
                      RESOLVE_BENEATH | RESOLVE_NO_SYMLINKS | RESOLVE_NO_XDEV);
}

// A pipe or a device that lies where a file should be is not opened: that alone may have effects.
FileDescriptor RootDirectory::openFile(const std::string& path) const
{
    const FileDescriptor object = openWithin(directory_.get(), path, O_PATH, RESOLVE_IN_ROOT);
    if (!object || !isRegular(object.get()))
        return {};
    return FileDescriptor(::open(pathOfDescriptor(object.get()).c_str(), O_RDONLY | O_CLOEXEC));
}

std::vector<std::string> RootDirectory::names(const std::string& directory) const
{
    const FileDescriptor opened =
        openWithin(directory_.get(), directory, O_RDONLY | O_DIRECTORY, RESOLVE_IN_ROOT);
    constexpr std::size_t mostNames = 500'000;  // dpkg has some ten for each package in one
    std::vector<std::string> names;
    const std::unique_ptr<DIR, CloseDirectory> stream(
        opened ? ::opendir(pathOfDescriptor(opened.get()).c_str()) : nullptr);
    while (const dirent* const entry = stream ? ::readdir(stream.get()) : nullptr)
        if (const std::string name = entry->d_name;
            name != "." && name != ".." && names.size() < mostNames)
            names.push_back(name);
    std::sort(names.begin(), names.end());
    return names;
}

bool RootDirectory::has(const std::string& path) const
{
    return bool(openWithin(directory_.get(), path, O_PATH, RESOLVE_IN_ROOT));
}

}  // namespace pellar
