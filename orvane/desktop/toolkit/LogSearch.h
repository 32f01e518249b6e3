// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Bundle.h"
#include "orvane/desktop/toolkit/OutlinePeer.h"

#include <QCheckBox>
#include <QLabel>
#include <QLineEdit>
#include <QPointer>
#include <QTimer>
#include <QToolButton>
#include <QWidget>

#include <string>
#include <string_view>
#include <vector>

namespace orvane::desktop {

/// Finds a text in others, whatever the case of its letters.
class TextFinder {
public:
    explicit TextFinder(const QString& wanted);

    /// In UTF-8; an empty text is found nowhere.
    bool isIn(std::string_view text) const;

private:
    QString wanted_;
    std::string lowered_;  ///< empty where the text is not ASCII
};

/// The rows of a view that hold a text, folded ones as well. They are looked through from the first
/// to the last, bit by bit, and those that follow as the log grows. Main thread.
class LogMatches {
public:
    /// The model outlives this object.
    explicit LogMatches(const LogModel& model) : model_(model) {}

    void search(const QString& text);
    /// The log is another.
    void begin();
    /// Goes on for about so long.
    void lookOn(std::chrono::milliseconds budget);

    /// In the view's order.
    const std::vector<int>& rows() const { return rows_; }
    /// Every row was looked at, or none is to be.
    bool isComplete() const { return !isSearching_ || looked_ >= model_.rowsOfView(); }

private:
    const LogModel& model_;
    TextFinder finder_{QString()};
    bool isSearching_ = false;
    std::vector<int> rows_;
    int looked_ = 0;
};

/// The bar above a log in which a text is searched. Ctrl+F shows it, Escape closes it; Enter and F3
/// go to the next row that holds the text, with Shift to the one before. Belongs to its parent.
/// Main thread.
class LogSearch final : public QWidget {
public:
    /// The peer outlives this object, which is below `parent`; the shortcuts hold in its window.
    LogSearch(OutlinePeer& peer, const contract::Bundle& texts, QWidget* parent);

    void open();
    void close();
    QLineEdit& field() { return *field_; }
    const QLabel& count() const { return *count_; }
    void goOn(bool isForwards);

protected:
    void keyPressEvent(QKeyEvent* event) override;

private:
    QToolButton* addButton(std::string_view name, Qt::ArrowType arrow);
    void addShortcuts(QWidget& window);
    void searchFor(const QString& text);
    void rowsChanged(LogModel::Change change);
    void look();
    void showFirst();
    void findCurrentAgain();
    bool isLooking() const;
    void showCount();

    OutlinePeer& peer_;
    const contract::Bundle& texts_;
    LogMatches matches_;
    QTimer look_;
    QLineEdit* field_;
    QLabel* count_;
    int current_ = -1;                   ///< the row of the view that was gone to; -1 for none
    contract::OutlineItem currentItem_;  ///< its record, by which it is found in another log
    std::size_t tried_ = 0;              ///< matches that are not that record
    bool mustShow_ = false;  ///< the first match behind where the reader was, once it is found
};

/// Shows nothing but problems and verdicts, or everything again. Belongs to its parent.
[[nodiscard]] QCheckBox* makeProblemsToggle(OutlinePeer& peer, const contract::Bundle& texts,
                                            QWidget* parent);

}  // namespace orvane::desktop
