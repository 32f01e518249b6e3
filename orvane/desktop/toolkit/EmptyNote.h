// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QAbstractItemView>
#include <QLabel>

namespace orvane::desktop {

/// What a view without rows says: a hint, in the middle of the view. Belongs to the view.
class EmptyNote final : public QLabel {
public:
    /// `hint` is what it says where there is nothing else to be said. The view has its model
    /// already.
    EmptyNote(QAbstractItemView& view, const QString& hint);

    /// Says this instead of the hint; an empty text for the hint again.
    void tell(const QString& text) { setText(text.isEmpty() ? hint_ : text); }

protected:
    bool eventFilter(QObject* watched, QEvent* event) override;

private:
    void follow();

    QAbstractItemView& view_;
    const QString hint_;
};

}  // namespace orvane::desktop
