// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/process/FileDescriptor.h"
#include "pellar/process/Stopping.h"

#include <sys/types.h>

#include <cstdint>
#include <filesystem>
#include <optional>
#include <string>

namespace pellar {

/// A directory for another program's files, which goes with this object. Should this process be
/// killed before, the next one made for the same purpose takes it away.
class TemporaryDirectory {
public:
    /// `purpose` is a word for its name. None when that fails; errno says why.
    [[nodiscard]] static std::optional<TemporaryDirectory> make(const std::string& purpose);

    TemporaryDirectory(TemporaryDirectory&& other) noexcept;
    TemporaryDirectory& operator=(TemporaryDirectory&&) = delete;
    ~TemporaryDirectory();

    std::filesystem::path path() const { return outer_ / "files"; }
    /// Gives it to another user, with what is in it. Only root can.
    bool giveTo(uid_t user, gid_t group) const;

private:
    TemporaryDirectory(std::filesystem::path outer, FileDescriptor lock)
        : outer_(std::move(outer)), lock_(std::move(lock))
    {
    }

    std::filesystem::path outer_;  ///< empty when it was moved from
    FileDescriptor lock_;
};

/// How much a file may be for it to be copied.
struct CopyBounds {
    std::uint64_t mostBytes = 0;          ///< written
    std::uint64_t mostApparentBytes = 0;  ///< holes included
};

enum class Copying { Done, Failed, BeyondBounds, Stopped };

/// Copies an open file to another, which is empty, and leaves its holes as they are. What is
/// copied is taken off the bounds.
[[nodiscard]] Copying copyFile(int from, int to, CopyBounds& bounds, const StopSwitch& stop);

}  // namespace pellar
