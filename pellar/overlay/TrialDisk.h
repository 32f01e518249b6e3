// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/overlay/FullCopy.h"
#include "pellar/overlay/Overlay.h"
#include "pellar/overlay/OverlayFile.h"
#include "pellar/texts/Sentence.h"

#include <functional>
#include <memory>

namespace pellar {

/// A disk on which a repair is tried: what a tool writes to it stays with us. Any thread.
class TrialDisk {
public:
    /// An overlay; where the system cannot show one, a copy of an image file. Why repairs cannot be
    /// tried here. `disk` outlives it, open for reading. Takes long only where it copies.
    [[nodiscard]] static Result<TrialDisk, Sentence> of(
        int disk, ByteRange region, const OverlayRoom& room,
        const std::function<bool()>& isStopped = [] { return false; });

    /// What a tool is given: the region alone, open for reading and writing.
    int descriptor() const { return file_ ? file_->descriptor() : copy_->descriptor(); }
    std::uint64_t bytes() const { return contents().bytes(); }
    /// What it holds by now, and how that differs from the disk.
    WorkingCopy& contents() const { return file_ ? static_cast<WorkingCopy&>(*overlay_) : *copy_; }

private:
    TrialDisk(std::unique_ptr<Overlay> overlay, std::unique_ptr<OverlayFile> file)
        : overlay_(std::move(overlay)), file_(std::move(file))
    {
    }
    explicit TrialDisk(std::unique_ptr<FullCopy> copy) : copy_(std::move(copy)) {}

    std::unique_ptr<Overlay> overlay_;
    std::unique_ptr<OverlayFile> file_;
    std::unique_ptr<FullCopy> copy_;  ///< in place of the two
};

}  // namespace pellar
