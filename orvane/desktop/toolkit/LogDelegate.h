// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QStyledItemDelegate>

namespace orvane::desktop {

/// For a LogModel in a LogTable. Paints a row of the log: the text of the module's cell, in the
/// frame that the module's view gives, in colours that are readable on the desktop's palette, on as
/// many lines as it takes. The heading of a run lies on a band of its own, with the sign that folds
/// it, what is known of the run, and its verdict at the end side. What is longer than anybody
/// reads there is whole in a tooltip.
class LogDelegate final : public QStyledItemDelegate {
public:
    using QStyledItemDelegate::QStyledItemDelegate;

    void paint(QPainter* painter, const QStyleOptionViewItem& option,
               const QModelIndex& index) const override;
    /// The option's rectangle has the row's width, and the height of a row of one line.
    QSize sizeHint(const QStyleOptionViewItem& option, const QModelIndex& index) const override;
    bool helpEvent(QHelpEvent* event, QAbstractItemView* view, const QStyleOptionViewItem& option,
                   const QModelIndex& index) override;
};

}  // namespace orvane::desktop
