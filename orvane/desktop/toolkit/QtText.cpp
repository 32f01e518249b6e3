// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/QtText.h"

#include "orvane/desktop/toolkit/DesktopFont.h"
#include "orvane/desktop/toolkit/Text.h"

namespace orvane::desktop {

QtTextField::QtTextField(QLabel& label) : label_(label)
{
    label_.setTextFormat(Qt::RichText);
    label_.setTextInteractionFlags(Qt::TextSelectableByMouse | Qt::TextSelectableByKeyboard);
}

void QtTextField::setNeedsDisplay(bool needsDisplay)
{
    if (needsDisplay)
        label_.update();
}

void QtTextField::setToolTip(std::string_view text)
{
    label_.setToolTip(toQtToolTip(text));
}

void QtTextField::setAttributedStringValue(const contract::StyledText& text)
{
    label_.setText(toQt(html(text, desktopFontScale())));
    label_.setAccessibleDescription(toQt(text.characters()));
}

QtTextView::QtTextView(QPlainTextEdit& widget) : widget_(widget)
{
    widget_.setReadOnly(true);
    widget_.setVisible(!widget_.document()->isEmpty());
}

void QtTextView::setNeedsDisplay(bool needsDisplay)
{
    if (needsDisplay)
        widget_.viewport()->update();
}

void QtTextView::setString(std::string_view text)
{
    widget_.setPlainText(toQt(text));
    widget_.setVisible(!text.empty());
}

}  // namespace orvane::desktop
