// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/toolkit/BrowserCell.h"
#include "contract/toolkit/OutlineView.h"
#include "fixwell/Contract.h"

namespace fixwell {

/// The message log's view. What it shows is a flat list, so it draws no arrows and moves the
/// text into their place; what it deletes is the whole history or nothing.
class OVFXWMessageOutlineView final : public OutlineView {
public:
    /// Both outlive the view.
    OVFXWMessageOutlineView(OutlineViewPeer& peer, Pasteboard& generalPasteboard)
        : OutlineView(peer), generalPasteboard_(generalPasteboard)
    {
    }

    void delete_(const void* sender) override;
    void copy(const void* sender) override;
    /// Writes the selected rows, also when there are none: the pasteboard then holds empty text.
    void setPasteboard(Pasteboard& pasteboard);
    bool validateMenuItem(const MenuItem& item) override;
    void keyDown(const KeyEvent& event) override;
    void reloadRow(std::size_t row);
    void updateRect(const Rect& rect);
    Rect frameOfOutlineCellAtRow(std::size_t row) const override;
    Rect frameOfCellAtColumnRow(std::size_t column, std::size_t row) const override;

private:
    bool hasAllRowsSelected() const;

    Pasteboard& generalPasteboard_;
};

/// Announces and writes a log's text in all four types: plain, tabular, RTF and RTFD.
void writeToPasteboard(Pasteboard& pasteboard, const StyledText& text, const void* owner);

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
