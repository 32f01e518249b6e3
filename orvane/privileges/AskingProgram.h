// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/privileges/HelperProtocol.h"
#include "pellar/disks/LoopDevice.h"
#include "pellar/outcome/Result.h"
#include "pellar/process/FileDescriptor.h"

#include <sys/types.h>

#include <filesystem>
#include <optional>

namespace orvane {

using pellar::FileDescriptor;

/// The program for which this one works with more rights: its parent, since pkexec(1) gives its
/// own place to what it starts. Files are taken from it as it has opened them, never by a path:
/// what the user may not do with a file, this program is not talked into doing for them.
class AskingProgram {
public:
    /// None unless the parent lives and is the user's through and through: a program with other
    /// rights than its user's, or one that had them, may have files open that are none of theirs.
    [[nodiscard]] static std::optional<AskingProgram> of(uid_t user);

    /// The same open file as that descriptor of the program (pidfd_getfd(2)); none when there is
    /// no such descriptor, or the program is not what it was.
    [[nodiscard]] FileDescriptor take(int descriptor) const;

private:
    AskingProgram(pid_t id, uid_t user, FileDescriptor process)
        : id_(id), user_(user), process_(std::move(process))
    {
    }
    bool isStillUsers() const;

    pid_t id_;
    uid_t user_;
    FileDescriptor process_;
};

/// The region of an image that the request names, as a device. `image` is the file as the asking
/// program has it open; invalid where it has none. That program's way of opening it is the limit:
/// what it may only read is attached to be read.
[[nodiscard]] pellar::Result<pellar::LoopDevice, JobFailure> attachRegion(
    const FileDescriptor& image, const HelperRequest& request);

/// Of this user, as the system's list of users tells it (getpwuid(3)); empty when it does not.
[[nodiscard]] std::filesystem::path homeDirectoryOf(uid_t user);

}  // namespace orvane
