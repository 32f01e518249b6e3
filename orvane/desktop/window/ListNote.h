// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QAbstractItemView>
#include <QLabel>
#include <QPushButton>

#include <functional>

namespace orvane::desktop {

/// Stands in a view that has no rows: why that is so, and a button for what can be done about it.
/// Main thread.
class ListNote final : public QWidget {
public:
    explicit ListNote(QAbstractItemView& view);

    /// Plain text. Without a title, there is no button.
    void tell(const QString& text, const QString& buttonTitle = {},
              std::function<void()> pressed = {});

private:
    QLabel* label_;
    QPushButton* button_;
    std::function<void()> pressed_;
};

}  // namespace orvane::desktop
