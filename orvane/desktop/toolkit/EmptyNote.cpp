// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/EmptyNote.h"

#include <QEvent>

namespace orvane::desktop {
namespace {

constexpr int noteMargin = 24;  // pixels

}  // namespace

EmptyNote::EmptyNote(QAbstractItemView& view, const QString& hint)
    : QLabel(hint, view.viewport()), view_(view), hint_(hint)
{
    setTextFormat(Qt::PlainText);
    setWordWrap(true);
    setAlignment(Qt::AlignCenter);
    setMargin(noteMargin);
    setForegroundRole(QPalette::PlaceholderText);
    setAttribute(Qt::WA_TransparentForMouseEvents);
    view.viewport()->installEventFilter(this);
    const QAbstractItemModel* const model = view.model();
    connect(model, &QAbstractItemModel::rowsInserted, this, [this] { follow(); });
    connect(model, &QAbstractItemModel::rowsRemoved, this, [this] { follow(); });
    connect(model, &QAbstractItemModel::modelReset, this, [this] { follow(); });
    follow();
}

bool EmptyNote::eventFilter(QObject* /*watched*/, QEvent* event)
{
    if (event->type() == QEvent::Resize)
        follow();
    return false;
}

void EmptyNote::follow()
{
    setGeometry(view_.viewport()->rect());
    setVisible(view_.model()->rowCount() == 0);
}

}  // namespace orvane::desktop
