// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/StyledText.h"

namespace contract {

/// Draws one row of an outline view: the view sets the cell's value and then paints what the
/// cell holds. A plain value object; the virtual operations decide what the user sees.
class BrowserCell {
public:
    virtual ~BrowserCell() = default;

    virtual void setAttributedStringValue(const StyledText& text) { value_ = text; }
    const StyledText& attributedStringValue() const { return value_; }

    /// The arrow of a row with children.
    virtual bool hasBranchImage() const { return true; }
    virtual bool isEditable() const { return true; }

    void setFont(const Font& font) { font_ = font; }
    const Font& font() const { return font_; }
    void setWraps(bool wraps) { wraps_ = wraps; }
    bool wraps() const { return wraps_; }
    void setLeaf(bool isLeaf) { isLeaf_ = isLeaf; }
    bool isLeaf() const { return isLeaf_; }
    void removeImage() { hasImage_ = false; }
    bool hasImage() const { return hasImage_; }

private:
    StyledText value_;
    Font font_ = Font::system(12);
    bool wraps_ = true;
    bool isLeaf_ = false;
    bool hasImage_ = true;
};

}  // namespace contract
