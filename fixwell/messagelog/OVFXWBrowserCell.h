// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/toolkit/BrowserCell.h"
#include "fixwell/Contract.h"

namespace fixwell {

/// A row of the message log: one line, cut in the middle where it is too long, no arrow.
class OVFXWBrowserCell final : public BrowserCell {
public:
    OVFXWBrowserCell();

    /// Puts the paragraph style into the text itself, which belongs to the record, so copies and
    /// drags carry it as well.
    void setAttributedStringValue(const StyledText& text) override;
    bool hasBranchImage() const override { return false; }
    bool isEditable() const override { return false; }

    /// Only the paragraph style: truncation in the middle.
    static const TextStyle& attr();
};

}  // namespace fixwell
