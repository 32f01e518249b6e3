// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Dictionary.h"
#include "contract/pellar/DiskReference.h"
#include "contract/pellar/ErrorCodes.h"

#include <memory>
#include <string_view>

namespace contract {

/// Receives what a job reports. Every call arrives on the main thread, in the order in which
/// things happened; for each started job exactly one *finished* arrives, and nothing after it.
class PLAsyncDelegate {
public:
    virtual void plAsyncStartedForDisk(const DiskReferencePointer& disk) = 0;

    /// One line of the log. Either a plain line of text, which the receiver classifies by the
    /// result phrases, or a dictionary with the message keys (then `string`, when not empty, is
    /// the text to show instead of the dictionary's own).
    virtual void plAsyncMessageForDisk(const DiskReferencePointer& disk, std::string_view string,
                                       const Dictionary& dictionary) = 0;

    /// `percent` runs from 0 to 100; `barberPole` says that work goes on with no known end.
    virtual void plAsyncProgressForDisk(const DiskReferencePointer& disk, bool barberPole,
                                        float percent) = 0;

    /// `dictionary` carries the verdict and its sentence (the result keys).
    virtual void plAsyncFinishedForDisk(const DiskReferencePointer& disk, ErrorCode mainError,
                                        ErrorCode detailError, const Dictionary& dictionary) = 0;

protected:
    ~PLAsyncDelegate() = default;
};

/// Runs one verify or repair job at a time. Main thread only; every call returns at once.
///
/// A begin operation answers 0 when the job was started, and the delegate is then called from
/// the main run loop, never from inside the begin. Any other answer is an error code, and no
/// callback follows. Destroying the object cancels a running job and waits until nothing of it
/// is left; no callback arrives after that.
class PLRepairDisk {
public:
    virtual ~PLRepairDisk() = default;

    [[nodiscard]] virtual ErrorCode beginStoragesystemFilesystemVerifyForDisk(
        const DiskReferencePointer& disk) = 0;
    [[nodiscard]] virtual ErrorCode beginStoragesystemFilesystemRepairForDisk(
        const DiskReferencePointer& disk) = 0;
    [[nodiscard]] virtual ErrorCode beginPermissionsVerifyForDisk(
        const DiskReferencePointer& disk) = 0;
    [[nodiscard]] virtual ErrorCode beginPermissionsRepairForDisk(
        const DiskReferencePointer& disk) = 0;
    [[nodiscard]] virtual ErrorCode beginPartitionMapVerifyForDisk(
        const DiskReferencePointer& disk) = 0;
    [[nodiscard]] virtual ErrorCode beginPartitionMapRepairForDisk(
        const DiskReferencePointer& disk) = 0;

    // Capability tests. `error`, where not null, is always written: 0 when the question could be
    // answered.

    /// Whether the partition map of this whole disk can be verified and repaired.
    virtual bool canRepairPartitionMapForDisk(const DiskReferencePointer& disk,
                                              ErrorCode* error) = 0;
    /// Whether the disk is a volume whose file system the library would have to treat itself: YES
    /// for every volume with a device or file region behind it. It says nothing about the
    /// outcome; whether there is a way to treat the file system is OVFilesystem's to say.
    virtual bool canRepairStoragesystemFilesystemForDisk(const DiskReferencePointer& disk,
                                                         ErrorCode* error) = 0;
    virtual bool canVerifyStoragesystemFilesystemForDisk(const DiskReferencePointer& disk,
                                                         ErrorCode* error) = 0;

    /// Asks the running job to end; its *finished* arrives with kPLErrorCancelled. A repairing
    /// tool is given time to leave the disk sound; each further call presses harder. Nothing
    /// happens when no job runs.
    virtual void cancelCurrentOperation() = 0;
};

/// The library as one module sees it: the callbacks of every tool made here go to that module.
class PLManager {
public:
    virtual ~PLManager() = default;

    /// The receiver, who must outlive the tools; set by the host before the first tool is made.
    virtual void setDelegate(PLAsyncDelegate* delegate) = 0;
    virtual std::unique_ptr<PLRepairDisk> makeRepairDisk() = 0;
};

}  // namespace contract
