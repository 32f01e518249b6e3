// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/overlay/Overlay.h"
#include "pellar/overlay/OverlayFile.h"
#include "pellar/texts/Sentence.h"

#include <memory>

namespace pellar {

/// A disk on which a repair is tried: what a tool writes to it stays with us. Any thread.
class TrialDisk {
public:
    /// Why repairs cannot be tried here. `disk` outlives it, open for reading.
    [[nodiscard]] static Result<TrialDisk, Sentence> of(int disk, ByteRange region,
                                                        const OverlayRoom& room);

    /// What a tool is given: the region alone, open for reading and writing.
    int descriptor() const { return file_->descriptor(); }
    std::uint64_t bytes() const { return overlay_->bytes(); }
    /// What was written, and how it differs from the disk.
    Overlay& overlay() const { return *overlay_; }

private:
    TrialDisk(std::unique_ptr<Overlay> overlay, std::unique_ptr<OverlayFile> file)
        : overlay_(std::move(overlay)), file_(std::move(file))
    {
    }

    std::unique_ptr<Overlay> overlay_;
    std::unique_ptr<OverlayFile> file_;
};

}  // namespace pellar
