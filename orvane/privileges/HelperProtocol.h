// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/pellar/DiskReference.h"
#include "contract/pellar/ErrorCodes.h"
#include "contract/pellar/MessageKeys.h"
#include "orvane/privileges/DiskIdentity.h"
#include "pellar/jobs/EventQueue.h"
#include "pellar/jobs/JobLog.h"
#include "pellar/jobs/JobOptions.h"
#include "pellar/outcome/Result.h"

#include <filesystem>
#include <functional>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace orvane {

/// One job that a program without the right to it asks of the helper.
struct HelperRequest {
    pellar::Task task;
    /// A block device; or, without a path, a region of an image file.
    contract::DiskReference disk = {};
    DiskIdentity identity = {};  ///< of the block device
    int image = -1;  ///< the image's descriptor in the program that asks; -1 for a device
    std::string languages = {};  ///< for the texts; empty for English
    /// Archives of packages may be fetched over the network; for permissions alone.
    bool fetchesArchives = false;
    /// Of volumes and maps; no image is kept.
    pellar::RepairPolicy policy = {};

    bool isOnImage() const { return image >= 0; }
};

/// What has to be asked for a job, on the disk that has its name now.
[[nodiscard]] HelperRequest requestFor(const pellar::PrivilegedJob& job,
                                       const std::string& languages);

/// The command line of the helper: what is done comes first, because the system's policy tells the
/// actions apart by it (pkexec(1), org.freedesktop.policykit.exec.argv1); then the disk, which an
/// administrator is shown.
[[nodiscard]] std::vector<std::string> argumentsOf(const HelperRequest& request);

/// What the arguments ask for, or why they are refused. They come from a program of any
/// user's: nothing is taken but a block device below /dev by its own name, or the number of a
/// descriptor and a region, and names that cannot do harm. `isBlockDevice` answers for a path that
/// leads through no link.
[[nodiscard]] pellar::Result<HelperRequest, const char*> readHelperArguments(
    const std::vector<std::string>& arguments,
    const std::function<bool(const std::filesystem::path&)>& isBlockDevice);

/// A job's event as one line of JSON without its end, and back. What a line of another program
/// holds is no event.
[[nodiscard]] std::string lineFromEvent(const pellar::Event& event);
[[nodiscard]] std::optional<pellar::Event> eventFromLine(std::string_view line);

/// What the helper leaves to the program that asked to say: it knows what its user can do next.
enum class Advice { Undo, Apply, RepairDirectly };

/// A message that stands for such a sentence, and what one stands for; none for any other event.
/// No job of the library tells such messages.
[[nodiscard]] pellar::Message messageOf(Advice advice);
[[nodiscard]] std::optional<Advice> adviceIn(const pellar::Event& event);

/// How a job ends that was not done.
struct JobFailure {
    contract::ErrorCode error;
    pellar::Sentence reason;
    contract::Name verdict = contract::kPLVerdictFailed;
};

/// "cannot repair “NAME”: REASON", in the log and as the job's end, which has begun.
void reportFailure(const JobFailure& failure, const HelperRequest& request,
                   const pellar::Texts& texts, pellar::JobLog& log);

}  // namespace orvane
