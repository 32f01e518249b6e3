// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QString>
#include <QWidget>

namespace orvane::desktop {

/// Lies over the window while files are dragged across it: a frame, and what will happen to them.
/// Main thread.
class DropNote final : public QWidget {
public:
    /// As large as the parent is, each time that it is shown.
    explicit DropNote(QWidget* parent);

    /// Plain text.
    void tell(const QString& text);

protected:
    void paintEvent(QPaintEvent* event) override;

private:
    QString text_;
};

}  // namespace orvane::desktop
