// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/udisks/ImageDevices.h"

#include "orvane/support/files/FileDescriptor.h"
#include "orvane/support/udisks/DirectDisks.h"
#include "orvane/support/udisks/UDisks.h"
#include "pellar/disks/LoopDevice.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <optional>

namespace orvane {
namespace {

using pellar::Access;

/// A job has the file locked as long as it works on it. The device keeps the file open as it was
/// given to it, so the lock would stay for as long as the device: it is let go by hand.
class FileLock {
public:
    FileLock(int file, Access access)
        : file_(file),
          isOurs_(::flock(file, (access == Access::ReadOnly ? LOCK_SH : LOCK_EX) | LOCK_NB) == 0 ||
                  errno != EWOULDBLOCK)
    {
    }
    FileLock(const FileLock&) = delete;
    FileLock& operator=(const FileLock&) = delete;
    ~FileLock()
    {
        if (isOurs_)
            ::flock(file_, LOCK_UN);
    }
    bool isOurs() const { return isOurs_; }

private:
    int file_;
    bool isOurs_;
};

Refusal refusalToOpen(const std::filesystem::path& image, Access access, int error)
{
    const bool isRefused = error == EACCES || error == EPERM || error == EROFS;
    if (access == Access::ReadWrite && isRefused && ::access(image.c_str(), R_OK) == 0)
        return {Refusal::Kind::IsReadOnly, {}};
    return {Refusal::Kind::Other, errorText(error)};
}

// Of less than a sector the system makes a device without any, which nobody finds again.
bool canBeDisk(const struct stat& status)
{
    constexpr off_t sectorBytes = 512;
    return S_ISREG(status.st_mode) && status.st_size >= sectorBytes;
}

/// Asked before it is opened, which some devices take for an order; and why it is refused is what
/// it is, not how it may be opened.
std::optional<Refusal> objectionTo(const std::filesystem::path& image)
{
    struct stat status = {};
    if (::stat(image.c_str(), &status) != 0)
        return Refusal{Refusal::Kind::Other, errorText(errno)};
    return canBeDisk(status) ? std::nullopt : std::optional(Refusal{Refusal::Kind::IsNoImage, {}});
}

std::optional<Refusal> objectionTo(int file)
{
    struct stat status = {};
    if (::fstat(file, &status) != 0)
        return Refusal{Refusal::Kind::Other, errorText(errno)};
    if (!canBeDisk(status))
        return Refusal{Refusal::Kind::IsNoImage, {}};
    const auto device = pellar::loopDeviceOn(status.st_dev, status.st_ino, pellar::SystemPaths());
    return device.empty() ? std::nullopt : std::optional(Refusal{Refusal::Kind::Attached, device});
}

Answer<std::string> setUp(int file, Access access, const std::stop_token& stop)
{
    auto answer = UDisks(stop).setUpLoop(file, access);
    const auto* const refusal = std::get_if<Refusal>(&answer);
    const bool isOurs = refusal != nullptr && isLeftToOthers(*refusal) && direct::isAllowed();
    return isOurs ? direct::setUpLoop(file, access) : answer;
}

}  // namespace

Answer<std::string> attachImage(const std::filesystem::path& image, Access access,
                                const std::stop_token& stop)
{
    if (const auto objection = objectionTo(image))
        return *objection;
    const int mode = access == Access::ReadOnly ? O_RDONLY : O_RDWR;
    const FileDescriptor file(::open(image.c_str(), mode | O_NONBLOCK | O_CLOEXEC | O_NOCTTY));
    if (!file)
        return refusalToOpen(image, access, errno);
    const FileLock lock(file.get(), access);
    if (!lock.isOurs())
        return Refusal{Refusal::Kind::BeingUsed, {}};
    if (const auto objection = objectionTo(file.get()))
        return *objection;
    return setUp(file.get(), access, stop);
}

Access accessTo(const std::filesystem::path& image)
{
    return ::access(image.c_str(), W_OK) == 0 ? Access::ReadWrite : Access::ReadOnly;
}

}  // namespace orvane
