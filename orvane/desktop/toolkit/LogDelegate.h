// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/desktop/toolkit/LogModel.h"

#include <QStyledItemDelegate>

namespace orvane::desktop {

/// Paints a row of the log: the text of the module's cell, in the frame that the module's view
/// gives, in colours that are readable on the desktop's palette.
class LogDelegate final : public QStyledItemDelegate {
public:
    /// The model is the one of the view, and outlives this object.
    LogDelegate(const LogModel& model, QObject* parent)
        : QStyledItemDelegate(parent), model_(model)
    {
    }

    void paint(QPainter* painter, const QStyleOptionViewItem& option,
               const QModelIndex& index) const override;

private:
    const LogModel& model_;
};

}  // namespace orvane::desktop
