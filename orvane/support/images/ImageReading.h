// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/Failure.h"
#include "orvane/support/disks/DiskFacts.h"

#include <chrono>
#include <condition_variable>
#include <filesystem>
#include <functional>
#include <memory>
#include <mutex>
#include <optional>
#include <string>

namespace orvane {

struct ReadImage {
    DiskTree disks;          ///< as `disksOfImage` answers them
    std::string loopDevice;  ///< the node of the device that the file is as well; mostly empty
};

/// One reading of an image file, on a thread of its own: a file on a network or on a sleeping
/// drive may keep its reader waiting for as long as it likes, and nobody has to wait with it. Any
/// thread.
class ImageReading {
public:
    /// A failure is the bare reason, in English where it is one of the host's own.
    using Result = Outcome<ReadImage>;

    using Reader = std::function<Result(const std::filesystem::path& image)>;

    /// Reads it on the calling thread.
    static Result readNow(const std::filesystem::path& image);
    /// `done` is called on the reader's thread, also after it was given up; none when empty. Where
    /// the system gives no thread, the image is read before this returns.
    static std::shared_ptr<ImageReading> start(const std::filesystem::path& image,
                                               std::function<void()> done = {},
                                               const Reader& reader = readNow);

    enum class State { Reading, Done, GivenUp };
    /// Returns when it is done or given up, or that time is over.
    State waitFor(std::chrono::milliseconds longest);
    /// Nobody is interested any more: who waits returns at once.
    void giveUp();
    /// What was read; none while it is being read.
    std::optional<Result> result() const;

private:
    void finish(Result result);

    mutable std::mutex lock_;
    std::condition_variable changed_;
    std::optional<Result> result_;  ///< guarded
    bool isGivenUp_ = false;        ///< guarded
};

}  // namespace orvane
