// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QScrollArea>
#include <QSplitter>

namespace orvane::desktop {

/// Keeps the first pane of a split view as high as the text that scrolls in it, within the pane's
/// limits, until the user moves the divider. Belongs to the split view, which outlives it.
class FittingPane final : public QObject {
public:
    /// `text` lies in the first pane.
    FittingPane(QSplitter& splitter, QScrollArea& text);

protected:
    bool eventFilter(QObject* watched, QEvent* event) override;

private:
    void fit();

    QSplitter& splitter_;
    QScrollArea& text_;
    bool wasMoved_ = false;
    bool isFitting_ = false;
};

}  // namespace orvane::desktop
