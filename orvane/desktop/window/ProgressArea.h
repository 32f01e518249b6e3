// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QLabel>
#include <QProgressBar>
#include <QWidget>

#include <string_view>

namespace orvane::desktop {

/// The window's status line, and beside it the progress bar. Both keep their room when they are
/// not in use, so that nothing in the window jumps.
class ProgressArea final : public QWidget {
public:
    ProgressArea(const QString& accessibleName, QWidget* parent);

    void setBarActive(bool isActive);
    void setTextActive(bool isActive);
    void setIndeterminate(bool isIndeterminate);
    /// From 0 to 100.
    void setPercent(double percent);
    /// Any bytes; shown as one line of plain text.
    void setText(std::string_view text);
    QString text() const { return text_; }

protected:
    void resizeEvent(QResizeEvent* event) override;

private:
    void showText();
    void showRange();

    QProgressBar* bar_;
    QLabel* label_;
    QString text_;
    bool isBarActive_ = false;
    bool isIndeterminate_ = true;
    int tenths_ = 0;
};

}  // namespace orvane::desktop
