// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/jobs/JobObserver.h"
#include "orvane/support/SupportHost.h"

namespace orvane {

/// Keeps the runs of one module with their disks' histories: when each began, and how it ended.
/// One run at a time. Main thread.
class RunKeeper {
public:
    /// The host outlives this object.
    explicit RunKeeper(SupportHost& host) : host_(host) {}

    void begin(const contract::DiskReferencePointer& disk, Operation operation);
    /// The run did not begin after all; answers its end.
    RunEnd refuse(contract::ErrorCode error);
    /// `result` has the result keys. Where it names no verdict, the error decides.
    RunEnd finish(contract::ErrorCode error, const contract::Dictionary& result);

    /// The text of an error of the job at hand; where the disk is in use because its image is a
    /// device as well, that device is named.
    std::string withDevice(contract::ErrorCode error, std::string text) const;

private:
    void keep(const RunEnd& end);

    SupportHost& host_;
    std::filesystem::path image_;  ///< that the last run was about; empty for a device
    std::int64_t run_ = 0;         ///< the one that is under way; 0 when it could not be written
};

}  // namespace orvane
