// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QGridLayout>
#include <QObject>
#include <QScrollArea>
#include <QSplitter>

#include <vector>

namespace orvane::desktop {

/// Lays something out anew whenever one of the widgets that it watches has another size, or wants
/// one.
class Fitting : public QObject {
public:
    using QObject::QObject;

protected:
    void watch(QWidget& widget) { widget.installEventFilter(this); }
    /// Must come to rest: what it lays out may be watched.
    virtual void fit() = 0;

    bool eventFilter(QObject* watched, QEvent* event) final;
};

/// Keeps the first pane of a split view as high as the text that scrolls in it, and no higher than
/// it may be, until the user moves the divider: how small the pane may become is for that. Belongs
/// to the split view, which outlives it.
class FittingPane final : public Fitting {
public:
    /// `text` lies in the first pane.
    FittingPane(QSplitter& splitter, QScrollArea& text);

private:
    void fit() override;

    QSplitter& splitter_;
    QScrollArea& text_;
    int least_;
    bool wasMoved_ = false;
    bool isFitting_ = false;
};

/// Keeps the buttons of a grid in one row where they have room for it, and in two where not.
/// Belongs to the page, which outlives it.
class FittingButtons final : public Fitting {
public:
    /// `actions` lie in the grid by columns of two; `beside`, which may be none, stands at the end.
    FittingButtons(QWidget& page, QGridLayout& grid, std::vector<QWidget*> actions,
                   QWidget* beside);

private:
    void fit() override;
    void place(int rows);

    QWidget& page_;
    QGridLayout& grid_;
    std::vector<QWidget*> actions_;
    QWidget* beside_;
    int rows_ = 2;
    int least_ = 0;
};

}  // namespace orvane::desktop
