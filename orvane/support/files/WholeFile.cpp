// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/files/WholeFile.h"

#include "pellar/process/FileDescriptor.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <cstdio>

namespace orvane {
namespace {

/// The name that a new file bears until it is whole; removed unless the rename came about.
class TemporaryFile {
public:
    explicit TemporaryFile(const std::filesystem::path& beside)
        : name_(beside.native() + ".XXXXXX"), descriptor_(::mkostemp(name_.data(), O_CLOEXEC))
    {
    }
    TemporaryFile(const TemporaryFile&) = delete;
    TemporaryFile& operator=(const TemporaryFile&) = delete;
    ~TemporaryFile()
    {
        if (descriptor_ && !isRenamed_)
            ::unlink(name_.c_str());
    }

    /// 0, or the error number.
    [[nodiscard]] int become(const std::filesystem::path& file, std::string_view contents,
                             mode_t mode)
    {
        if (!descriptor_ || ::fchmod(descriptor_.get(), mode) != 0)
            return errno;
        if (const int error = writeAll(descriptor_.get(), contents))
            return error;
        if (::fsync(descriptor_.get()) != 0 || std::rename(name_.c_str(), file.c_str()) != 0)
            return errno;
        isRenamed_ = true;
        return 0;
    }

private:
    std::string name_;
    pellar::FileDescriptor descriptor_;
    bool isRenamed_ = false;
};

// Without this the rename itself may be lost in a power failure. Some file systems refuse it,
// which takes nothing away from the file.
void syncDirectory(const std::filesystem::path& directory)
{
    const pellar::FileDescriptor opened(
        ::open(directory.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    if (opened)
        ::fsync(opened.get());
}

std::filesystem::path targetOf(const std::filesystem::path& file)
{
    std::error_code error;
    const std::filesystem::path target = std::filesystem::weakly_canonical(file, error);
    return error ? file : target;
}

Result<void, Failure> replace(const std::filesystem::path& named,
                              const std::filesystem::path& target, std::string_view contents,
                              mode_t mode)
{
    TemporaryFile temporary(target);
    if (const int error = temporary.become(target, contents, mode))
        return cannot("write", named.native(), error);
    syncDirectory(target.has_parent_path() ? target.parent_path() : ".");
    return {};
}

}  // namespace

int writeAll(int descriptor, std::string_view bytes)
{
    while (!bytes.empty()) {
        const ssize_t written = ::write(descriptor, bytes.data(), bytes.size());
        if (written < 0 && errno == EINTR)
            continue;
        if (written < 0)
            return errno;
        bytes.remove_prefix(static_cast<std::size_t>(written));
    }
    return 0;
}

Result<std::string, int> readWholeFile(const std::filesystem::path& file, std::size_t limit)
{
    const pellar::FileDescriptor opened(::open(file.c_str(), O_RDONLY | O_NONBLOCK | O_CLOEXEC));
    if (!opened)
        return errno;
    struct stat status = {};
    if (::fstat(opened.get(), &status) != 0)
        return errno;
    if (!S_ISREG(status.st_mode))
        return EINVAL;

    // Files of /proc and /sys tell a size of 0 or 4096, so the end is where nothing more comes.
    std::string contents;
    std::array<char, 16384> piece;
    while (true) {
        const ssize_t count = ::read(opened.get(), piece.data(), piece.size());
        if (count < 0 && errno == EINTR)
            continue;
        if (count < 0)
            return errno;
        if (count == 0)
            return contents;
        contents.append(piece.data(), static_cast<std::size_t>(count));
        if (contents.size() > limit)
            return EFBIG;
    }
}

Result<void, Failure> replaceFile(const std::filesystem::path& file, std::string_view contents)
{
    return replace(file, targetOf(file), contents, 0600);
}

Result<void, Failure> replacePublicFile(const std::filesystem::path& file,
                                        std::string_view contents)
{
    return replace(file, file, contents, 0644);
}

Result<void, Failure> createPrivateDirectory(const std::filesystem::path& directory)
{
    if (directory.empty())
        return cannot("create the directory", "", ENOENT);
    std::filesystem::path made;
    for (const std::filesystem::path& part : directory) {
        made /= part;
        if (::mkdir(made.c_str(), 0700) == 0 || errno == EEXIST)
            continue;
        // An existing directory above a read-only or automounted place answers otherwise.
        const int error = errno;
        std::error_code ignored;
        if (!std::filesystem::is_directory(made, ignored))
            return cannot("create the directory", made.native(), error);
    }
    std::error_code ignored;
    if (!std::filesystem::is_directory(directory, ignored))
        return cannot("create the directory", directory.native(), ENOTDIR);
    return {};
}

}  // namespace orvane
