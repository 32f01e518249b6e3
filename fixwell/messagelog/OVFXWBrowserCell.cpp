// SPDX-License-Identifier: Apache-2.0
#include "fixwell/messagelog/OVFXWBrowserCell.h"

#include "fixwell/messagelog/MessageStyle.h"

namespace fixwell {

OVFXWBrowserCell::OVFXWBrowserCell()
{
    setFont(Font::system(messageFontPoints));
}

void OVFXWBrowserCell::setAttributedStringValue(const StyledText& text)
{
    if (text)
        text.addAttributes(attr());
    BrowserCell::setAttributedStringValue(text);
}

const TextStyle& OVFXWBrowserCell::attr()
{
    static const TextStyle style = [] {
        ParagraphStyle paragraph;
        paragraph.lineBreak = LineBreak::TruncateMiddle;
        return TextStyle{{}, {}, paragraph};
    }();
    return style;
}

}  // namespace fixwell
