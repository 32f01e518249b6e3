// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QStyledItemDelegate>

namespace orvane::desktop {

/// Paints a row of the log: the text of the module's cell, in the frame that the module's view
/// gives, in colours that are readable on the desktop's palette.
class LogDelegate final : public QStyledItemDelegate {
public:
    /// For views of a LogModel.
    using QStyledItemDelegate::QStyledItemDelegate;

    void paint(QPainter* painter, const QStyleOptionViewItem& option,
               const QModelIndex& index) const override;
};

}  // namespace orvane::desktop
