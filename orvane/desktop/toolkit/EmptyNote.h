// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QAbstractItemView>
#include <QLabel>

namespace orvane::desktop {

/// What a view without rows says: a hint, in the middle of the view. Belongs to the view.
class EmptyNote final : public QLabel {
public:
    /// The view has its model already.
    EmptyNote(QAbstractItemView& view, const QString& text);

protected:
    bool eventFilter(QObject* watched, QEvent* event) override;

private:
    void follow();

    QAbstractItemView& view_;
};

}  // namespace orvane::desktop
