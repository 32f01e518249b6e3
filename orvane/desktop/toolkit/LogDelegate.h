// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QStyledItemDelegate>

namespace orvane::desktop {

/// Paints a row of the log: the text of the module's cell, in the frame that the module's view
/// gives, in colours that are readable on the desktop's palette. What is shown without details
/// are sentences to be read, and take as many lines as they need; the lines that tools print
/// among the details are cut as the module says, and are whole in a tooltip.
class LogDelegate final : public QStyledItemDelegate {
public:
    /// For views of a LogModel.
    using QStyledItemDelegate::QStyledItemDelegate;

    void paint(QPainter* painter, const QStyleOptionViewItem& option,
               const QModelIndex& index) const override;
    /// The option's rectangle has the row's width, and the height of a row of one line.
    QSize sizeHint(const QStyleOptionViewItem& option, const QModelIndex& index) const override;
    bool helpEvent(QHelpEvent* event, QAbstractItemView* view, const QStyleOptionViewItem& option,
                   const QModelIndex& index) override;
};

}  // namespace orvane::desktop
