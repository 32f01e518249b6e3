// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QAbstractItemView>
#include <QLabel>
#include <QPersistentModelIndex>
#include <QTableView>

#include <functional>

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

/// The widget of the log: one column, no header. Rows have one line until they come into sight;
/// then they are as high as the delegate wants them. A table rather than a tree, because a tree
/// lays all its rows out anew whenever one is added.
class LogTable final : public QTableView {
public:
    struct Handlers {
        std::function<void(QKeyEvent&)> keyDown;
        /// Selected rows are dragged.
        std::function<void()> drag;
        /// A row was clicked, without a key held.
        std::function<void(int row)> clicked;
    };

    explicit LogTable(QWidget* parent);

    void setHandlers(Handlers handlers) { handlers_ = std::move(handlers); }
    /// Selected rows can be dragged out of the log.
    void setDraggable(bool isDraggable) { isDraggable_ = isDraggable; }
    /// Where it occurs in a row, it is marked; in no row when it is empty.
    void setSearched(const QString& text);
    const QString& searched() const { return searched_; }
    /// What is hidden below the last visible row.
    int pixelsToEnd() const;
    void scrollToPixelsBeforeEnd(int pixels);
    /// Scrolls until the row's top is so many pixels below that of the viewport, or as near as the
    /// ends allow.
    void putRowAt(int row, int top);
    /// What a table does with a key of its own.
    void handleKey(QKeyEvent& event) { QTableView::keyPressEvent(&event); }

protected:
    void keyPressEvent(QKeyEvent* event) override;
    void mousePressEvent(QMouseEvent* event) override;
    void mouseReleaseEvent(QMouseEvent* event) override;
    void mouseDoubleClickEvent(QMouseEvent* event) override;
    void startDrag(Qt::DropActions supported) override;
    void changeEvent(QEvent* event) override;
    void resizeEvent(QResizeEvent* event) override;
    void paintEvent(QPaintEvent* event) override;

private:
    void adoptFont();
    bool fitRowsInSight();
    template <class Place>
    void settleAt(Place place);

    Handlers handlers_;
    bool isDraggable_ = true;
    QPersistentModelIndex pressed_;
    QString searched_;
};

}  // namespace orvane::desktop
