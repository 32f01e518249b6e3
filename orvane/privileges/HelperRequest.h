// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/pellar/DiskReference.h"
#include "orvane/privileges/DiskIdentity.h"
#include "pellar/jobs/JobOptions.h"

#include <functional>
#include <string>
#include <variant>
#include <vector>

namespace orvane {

/// One job that a program without the right to it asks of the helper.
struct HelperRequest {
    pellar::Subject subject = pellar::Subject::Filesystem;
    pellar::Operation operation = pellar::Operation::Verify;
    /// A block device; or, without a path, a region of an image file.
    contract::DiskReference disk;
    DiskIdentity identity;  ///< of the block device
    int image = -1;         ///< the image's descriptor in the program that asks; -1 for a device
    std::string languages;  ///< for the texts; empty for English
    /// Archives of packages may be fetched over the network; for permissions alone.
    bool fetchesArchives = false;

    bool isOnImage() const { return image >= 0; }

    friend bool operator==(const HelperRequest& a, const HelperRequest& b)
    {
        return a.subject == b.subject && a.operation == b.operation && a.image == b.image &&
               a.disk.path == b.disk.path && a.disk.offset == b.disk.offset &&
               a.disk.length == b.disk.length && a.disk.identifier == b.disk.identifier &&
               a.disk.name == b.disk.name && a.disk.filesystem == b.disk.filesystem &&
               a.disk.isWhole == b.disk.isWhole && a.identity == b.identity &&
               a.languages == b.languages && a.fetchesArchives == b.fetchesArchives;
    }
};

/// What has to be asked for a job, on the disk that has its name now.
[[nodiscard]] HelperRequest requestFor(const pellar::PrivilegedJob& job,
                                       const std::string& languages);

/// The command line of the helper: what is done comes first, because the system's policy tells the
/// actions apart by it (pkexec(1), org.freedesktop.policykit.exec.argv1); then the disk, which an
/// administrator is shown.
[[nodiscard]] std::vector<std::string> argumentsOf(const HelperRequest& request);

/// What the arguments ask for, or why they are refused. They come from a program that may be
/// anybody's: nothing is taken but a block device below /dev by its own name, or the number of a
/// descriptor and a region, and names that cannot do harm. `isBlockDevice` answers for a path that
/// leads through no link.
[[nodiscard]] std::variant<HelperRequest, std::string> readHelperArguments(
    const std::vector<std::string>& arguments,
    const std::function<bool(const std::filesystem::path&)>& isBlockDevice);

}  // namespace orvane
