// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/udisks/DiskOperations.h"

#include "orvane/support/udisks/DirectDisks.h"
#include "orvane/support/udisks/UDisks.h"
#include "pellar/disks/LoopDevice.h"
#include "pellar/mounts/Holders.h"
#include "pellar/process/FileDescriptor.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <optional>
#include <system_error>
#include <utility>

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

// Of less than a sector the system makes a device without any, which is never found again.
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

Result<std::string, Refusal> setUp(int file, Access access, const std::stop_token& stop)
{
    auto answer = UDisks(stop).setUpLoop(file, access);
    const bool isOurs = !answer && isLeftToOthers(answer.error()) && DirectDisks::isAllowed();
    return isOurs ? DirectDisks::setUpLoop(file, access) : answer;
}

}  // namespace

Result<std::string, Refusal> attachImage(const std::filesystem::path& image, Access access,
                                         const std::stop_token& stop)
{
    if (const auto objection = objectionTo(image))
        return *objection;
    const int mode = access == Access::ReadOnly ? O_RDONLY : O_RDWR;
    const pellar::FileDescriptor file(
        ::open(image.c_str(), mode | O_NONBLOCK | O_CLOEXEC | O_NOCTTY));
    if (!file)
        return refusalToOpen(image, access, errno);
    const FileLock lock(file.get(), access);
    if (!lock.isOurs())
        return Refusal{Refusal::Kind::BeingUsed, {}};
    if (const auto objection = objectionTo(file.get()))
        return *objection;
    return setUp(file.get(), access, stop);
}

namespace {

template <class Service>
Result<void, Refusal> through(Service&& service, const DiskStep& step)
{
    switch (step.kind) {
        case DiskStep::Kind::Mount: return service.mount(step.node);
        case DiskStep::Kind::Unmount: return service.unmount(step.node);
        case DiskStep::Kind::Eject: return service.eject(step.node);
        case DiskStep::Kind::DetachLoop: return service.detachLoop(step.node);
        case DiskStep::Kind::Attach: break;
    }
    return Refusal{};
}

// UDisks2 may be there and not know the device; then that is the reason, and not the missing table.
Result<void, Refusal> throughAny(UDisks& udisks, const DiskStep& step)
{
    const Result<void, Refusal> answer = through(udisks, step);
    if (answer || !isLeftToOthers(answer.error()) || !DirectDisks::isAllowed())
        return answer;
    const Result<void, Refusal> other = through(DirectDisks(), step);
    const bool saysNothing = answer.error().kind == Refusal::Kind::UnknownDevice && !other &&
                             other.error().kind == Refusal::Kind::NoTable;
    return saysNothing ? answer : other;
}

// Asked of the mounts as they are now: the list of disks may be out of date. Root's own attempt
// would take away what else of the device is mounted before it came to "/".
bool holdsSystem(const std::vector<pellar::Mount>& places)
{
    return std::any_of(places.begin(), places.end(),
                       [](const auto& place) { return place.target == "/"; });
}

// The kernel takes an image off when its device is open no more (loop(4), LOOP_CLR_FD);
// the device manager may have, for a moment.
bool hasComeOff(const std::string& node)
{
    const auto image =
        std::filesystem::path("/sys/block") / std::filesystem::path(node).filename() / "loop";
    std::error_code error;
    for (int i = 0; i < 100 && std::filesystem::exists(image, error); ++i)
        std::this_thread::sleep_for(std::chrono::milliseconds(20));
    return !std::filesystem::exists(image, error);
}

/// How this user may open the file.
Access accessTo(const std::filesystem::path& image)
{
    return ::access(image.c_str(), W_OK) == 0 ? Access::ReadWrite : Access::ReadOnly;
}

Result<void, Refusal> attach(const std::filesystem::path& image, const std::stop_token& stop)
{
    const auto answer = attachImage(image, accessTo(image), stop);
    if (!answer)
        return answer.error();
    return {};
}

/// Who keeps these places busy, "name (number)", as far as this user may see; printable.
std::string holdersText(const std::vector<pellar::Mount>& places)
{
    std::vector<std::string> holders;
    for (const pellar::Mount& place : places)
        for (const std::string& holder : pellar::holdersOf(place.target))
            holders.push_back(holder);
    return pellar::shownNames(holders);
}

Result<void, Refusal> carryOut(UDisks& udisks, const DiskStep& step)
{
    if (step.kind != DiskStep::Kind::Mount && holdsSystem(placesOf(step.node)))
        return Refusal{Refusal::Kind::HoldsSystem, {}};
    Result<void, Refusal> answer = throughAny(udisks, step);
    if (step.kind == DiskStep::Kind::DetachLoop && answer && !hasComeOff(step.node))
        return Refusal{Refusal::Kind::Lingers, {}};
    if (!answer && answer.error().kind == Refusal::Kind::Busy)
        return Refusal{Refusal::Kind::Busy, holdersText(placesOf(step.node))};
    return answer;
}

}  // namespace

Result<void, Refusal> carryOut(const DiskRequest& request, const std::stop_token& stop)
{
    UDisks udisks(stop);
    for (const DiskStep& step : request.steps) {
        const Result<void, Refusal> answer =
            step.kind == DiskStep::Kind::Attach ? attach(step.node, stop) : carryOut(udisks, step);
        if (!answer && answer.error().kind != Refusal::Kind::AlreadySo)
            return answer;
    }
    return {};
}

DiskOperations::~DiskOperations()
{
    *liveness_ = nullptr;
}

bool DiskOperations::isUnderWay(const std::string& identifier) const
{
    return std::any_of(running_.begin(), running_.end(), [&](const auto& running) {
        const auto& identifiers = running.second.identifiers;
        return std::find(identifiers.begin(), identifiers.end(), identifier) != identifiers.end();
    });
}

std::vector<DiskOperations::Answer> DiskOperations::carryOutAll(
    const std::vector<DiskRequest>& requests, const std::stop_token& stop)
{
    std::vector<Answer> answers;
    for (const DiskRequest& request : requests)
        answers.push_back({request, carryOut(request, stop)});
    return answers;
}

void DiskOperations::start(std::vector<DiskRequest> requests, Finished finished)
{
    const Number number = ++latest_;
    Running& running = running_[number];
    running.finished = std::move(finished);
    std::erase_if(requests, [&](const auto& request) {
        const bool isKnown = isUnderWay(request.identifier);
        running.identifiers.push_back(request.identifier);
        return isKnown;
    });
    try {
        running.thread = std::jthread(
            [&loop = loop_, alive = liveness_, number, requests](const std::stop_token& stop) {
                loop.post([alive, number, answers = carryOutAll(requests, stop)] {
                    if (*alive != nullptr)
                        (*alive)->finish(number, answers);
                });
            });
    } catch (const std::system_error& error) {
        const Refusal refusal{Refusal::Kind::Other, errorText(error.code().value())};
        std::vector<Answer> answers;
        for (const DiskRequest& request : requests)
            answers.push_back({request, refusal});
        finish(number, answers);
    }
}

// Taken off first: the callback may start the next.
void DiskOperations::finish(Number number, const std::vector<Answer>& answers)
{
    const auto ended = running_.extract(number);
    std::vector<std::string> failures;
    for (const auto& [request, answer] : answers)
        if (!answer && !isSilent(answer.error()))
            failures.push_back(failureText(request, answer.error(), texts_));
    if (ended.mapped().finished)
        ended.mapped().finished(failures);
}

}  // namespace orvane
