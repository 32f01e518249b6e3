// SPDX-License-Identifier: Apache-2.0
#include "DirectoryScan.h"

#include <dirent.h>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <memory>
#include <set>
#include <string_view>
#include <tuple>
#include <utility>

namespace diskusage {
namespace {

constexpr std::uint64_t blockBytes = 512;  // the unit of stx_blocks, statx(2)
constexpr int directoryFlags = O_RDONLY | O_DIRECTORY | O_NOFOLLOW | O_NONBLOCK | O_CLOEXEC;

struct CloseDirectory {
    void operator()(DIR* directory) const { ::closedir(directory); }
};
using OpenDirectory = std::unique_ptr<DIR, CloseDirectory>;

/// None, with errno, when it cannot be read. `place` may be AT_FDCWD.
OpenDirectory openDirectory(int place, const char* name, int flags)
{
    const int descriptor = ::openat(place, name, flags);
    if (descriptor < 0)
        return nullptr;
    OpenDirectory opened(::fdopendir(descriptor));
    if (!opened)
        ::close(descriptor);
    return opened;
}

/// Nothing that would be mounted by looking at it is.
bool examine(int place, const char* name, struct statx& status)
{
    return ::statx(place, name, AT_SYMLINK_NOFOLLOW | AT_NO_AUTOMOUNT | AT_EMPTY_PATH,
                   STATX_BASIC_STATS | STATX_MNT_ID, &status) == 0;
}

std::pair<std::uint32_t, std::uint32_t> deviceOf(const struct statx& status)
{
    return {status.stx_dev_major, status.stx_dev_minor};
}

/// A bind mount has the device of what it shows, and a btrfs subvolume another one without being
/// mounted; so the mount's own number decides, where the kernel tells it (Linux 5.8).
bool isSameMount(const struct statx& a, const struct statx& b)
{
    if ((a.stx_mask & b.stx_mask & STATX_MNT_ID) != 0)
        return a.stx_mnt_id == b.stx_mnt_id;
    return deviceOf(a) == deviceOf(b);
}

class Scan {
public:
    Scan(const ScanLimits& limits, const std::function<bool(const ScanProgress&)>& goesOn)
        : limits_(limits), goesOn_(goesOn)
    {
    }

    ScanResult run(const std::filesystem::path& directory)
    {
        // The directory itself may be named by a link.
        const OpenDirectory top =
            openDirectory(AT_FDCWD, directory.c_str(), directoryFlags & ~O_NOFOLLOW);
        if (!top || !examine(::dirfd(top.get()), "", root_)) {
            noteUnreadable(errno);
            return std::move(result_);
        }
        forEachName(top.get(), [this](int place, const char* name) {
            const auto before = result_.bytes;
            struct statx status = {};
            if (count(place, name, status))
                keep({name, result_.bytes - before, S_ISDIR(status.stx_mode)});
        });
        foldIntoOthers(limits_.told);
        return std::move(result_);
    }

private:
    /// Until the end or the scan's; `act` is given the directory and a name in it.
    template <class Act>
    void forEachName(DIR* directory, const Act& act)
    {
        while (isGoingOn_) {
            errno = 0;
            const dirent* const entry = ::readdir(directory);
            if (entry == nullptr) {
                if (errno != 0)
                    noteUnreadable(errno);
                return;
            }
            const std::string_view name = entry->d_name;
            if (name != "." && name != "..")
                act(::dirfd(directory), entry->d_name);
        }
    }

    /// Adds the entry and all below it; NO when it has gone or belongs to another mount.
    bool count(int place, const char* name, struct statx& status)
    {
        path_.emplace_back(name);
        const bool isCounted = examineAndCount(place, name, status);
        path_.pop_back();
        return isCounted;
    }

    bool examineAndCount(int place, const char* name, struct statx& status)
    {
        if (!examine(place, name, status)) {
            if (errno != ENOENT)
                noteUnreadable(errno);
            return false;
        }
        if (!isSameMount(status, root_)) {
            ++result_.otherMounts;
            return false;
        }
        const bool isDirectory = S_ISDIR(status.stx_mode);
        ++result_.entries;
        if (isDirectory || status.stx_nlink < 2 || isFirstName(status))
            result_.bytes += status.stx_blocks * blockBytes;
        askWhetherToGoOn();
        if (isDirectory && isGoingOn_)
            countBelow(place, name);
        return true;
    }

    void countBelow(int place, const char* name)
    {
        if (static_cast<int>(path_.size()) >= limits_.depth) {
            ++result_.tooDeep;
            return;
        }
        const OpenDirectory directory = openDirectory(place, name, directoryFlags);
        if (!directory) {
            noteUnreadable(errno);
            return;
        }
        forEachName(directory.get(), [this](int below, const char* child) {
            struct statx status = {};
            count(below, child, status);
        });
    }

    bool isFirstName(const struct statx& status)
    {
        return linked_.emplace(status.stx_dev_major, status.stx_dev_minor, status.stx_ino).second;
    }

    void askWhetherToGoOn()
    {
        if (!goesOn_({result_.bytes, result_.entries}))
            end(ScanResult::End::Stopped);
        else if (result_.entries >= limits_.entries || linked_.size() >= limits_.hardLinks)
            end(ScanResult::End::AtLimit);
    }

    void end(ScanResult::End end)
    {
        isGoingOn_ = false;
        result_.end = end;
    }

    void noteUnreadable(int error)
    {
        if (result_.unreadable++ > 0)
            return;
        result_.firstError = error;
        for (const std::string& name : path_)
            result_.firstUnreadable += (result_.firstUnreadable.empty() ? "" : "/") + name;
    }

    // However many there are, few are kept at a time.
    void keep(TopEntry entry)
    {
        result_.largest.push_back(std::move(entry));
        if (result_.largest.size() >= 2 * limits_.told + 100)
            foldIntoOthers(limits_.told);
    }

    void foldIntoOthers(std::size_t kept)
    {
        auto& entries = result_.largest;
        std::ranges::sort(entries, [](const TopEntry& a, const TopEntry& b) {
            return std::tie(b.bytes, a.name) < std::tie(a.bytes, b.name);
        });
        for (; entries.size() > kept; entries.pop_back()) {
            ++result_.otherEntries;
            result_.otherBytes += entries.back().bytes;
        }
    }

    const ScanLimits& limits_;
    const std::function<bool(const ScanProgress&)>& goesOn_;
    ScanResult result_;
    struct statx root_ = {};
    std::vector<std::string> path_;  ///< of what is looked at, below the directory
    std::set<std::tuple<std::uint32_t, std::uint32_t, std::uint64_t>> linked_;
    bool isGoingOn_ = true;
};

}  // namespace

ScanResult scanDirectory(const std::filesystem::path& directory, const ScanLimits& limits,
                         const std::function<bool(const ScanProgress&)>& goesOn)
{
    return Scan(limits, goesOn).run(directory);
}

}  // namespace diskusage
