// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/toolkit/OutlineView.h"
#include "orvane/desktop/toolkit/LogRuns.h"

#include <QAbstractListModel>
#include <QIcon>

#include <chrono>
#include <functional>
#include <optional>
#include <utility>
#include <vector>

namespace orvane::desktop {

/// The text of a record as the module's cell shows it; none for no record, or while the view has no
/// data source or no cell.
contract::StyledText textOfItem(contract::OutlineView& view, const contract::OutlineItem& item);
/// The text of the record in a row of the view; none for a row that does not exist (any more).
contract::StyledText textOfRow(contract::OutlineView& view, std::size_t row);

/// A row that comes and goes with the details.
bool isDetail(const contract::OutlineItem& item);

/// What is known of a run, beside the title that its first record has. What is empty is not known.
struct RunNote {
    QString details;  ///< when it was, how long it took, with which tool
    QString verdict;  ///< in a word
    QIcon sign;       ///< that goes with the verdict
};

/// The note in one line; empty where nothing is known.
QString textOf(const RunNote& note);
/// A heading's text with what is known of its run behind it, for paper and for other programs.
contract::StyledText withNote(const contract::StyledText& heading, const RunNote& note);

/// Who knows of runs by the records with which they begin. Quick; main thread.
struct RunKnowledge {
    std::function<RunNote(const contract::OutlineItem& start)> noteOf;
    /// No later run of the same disk.
    std::function<bool(const contract::OutlineItem& start)> isNewest;
};

/// The rows of an outline view without levels, with those of each run folded under its heading, or
/// not. The view's rows are what its data source numbers; the model's are those that are shown.
/// Rows are asked for when they are shown: the model keeps their number and the headings alone, so
/// that a million rows cost as much as one. Which rows are headings is found out from the end, bit
/// by bit. Main thread.
class LogModel final : public QAbstractListModel {
public:
    /// The view whose data source is asked; it must live until it is taken away with none.
    void setView(contract::OutlineView* view);
    contract::OutlineView* view() const { return view_; }

    /// What is said before or behind a row's text where its looks alone would tell.
    struct SpokenTypes {
        QString problem;
        QString success;
        QString open;
        QString closed;
    };
    void setSpokenTypes(SpokenTypes types) { spoken_ = std::move(types); }
    void setRunKnowledge(RunKnowledge knowledge) { knowledge_ = std::move(knowledge); }

    /// How the view's rows differ from those before.
    enum class Change { None, MoreAtEnd, Other };
    /// Takes up the rows there are now. When there are only more of them at the end, the selection
    /// stays.
    Change reload();
    /// Looks at rows that were not looked at yet, for about so long; NO when there are none left.
    /// What is shown stays, with more in front of it, but for the first run that is found folded.
    bool lookOn(std::chrono::milliseconds budget);
    /// Shows nothing but headings and what is a problem or a verdict, or everything again.
    void setFilter(LogRuns::Filter filter);
    LogRuns::Filter filter() const { return filter_; }

    // Of the view's rows.

    int rowsOfView() const { return rows_; }
    /// Every row was looked at.
    bool isComplete() const { return runs_.unknown() == 0; }
    int viewRow(int shown) const { return runs_.rowAt(shown); }
    /// Where it is shown; none where it is not.
    std::optional<int> shownRow(int viewRow) const { return runs_.shownAt(viewRow); }
    /// Unfolds what hides the row; where it is shown then, if it is.
    std::optional<int> reveal(int viewRow);

    // Of rows that are shown.

    /// The record in a row, as the view answers it now; none for a row that it does not have.
    contract::OutlineItem itemAt(int shown) const;
    bool isHeading(int shown) const;
    /// Of a heading.
    bool isOpen(int shown) const { return runs_.isOpen(runs_.rowAt(shown)); }
    void setOpen(int shown, bool isOpen);
    /// The row of the heading above; none where there is none.
    std::optional<int> headingOf(int shown) const;
    RunNote noteAt(int shown) const;
    /// The text of a row of the view; of a heading, with its note.
    contract::StyledText notedText(int viewRow) const;

    int rowCount(const QModelIndex& parent = {}) const override;
    /// The row's plain text for Qt::DisplayRole, and with its type for Qt::AccessibleTextRole; the
    /// rest is the delegate's.
    QVariant data(const QModelIndex& index, int role) const override;
    Qt::ItemFlags flags(const QModelIndex& index) const override;

private:
    using Choice = std::pair<contract::OutlineItem, bool>;

    QString spokenText(int shown) const;
    std::size_t countRows() const;
    Change changeTo(int rows) const;
    bool holdsOldRows() const;
    void remember(int rows);
    void growTo(int rows);
    void beginAgain(int rows);
    void look(std::chrono::milliseconds budget);
    contract::OutlineItem viewItem(int row) const;
    LogRuns::Row kindOf(const contract::OutlineItem& item) const;
    bool isOpenAtFirst(const contract::OutlineItem& start) const;
    void choose(const contract::OutlineItem& start, bool isOpen);

    contract::OutlineView* view_ = nullptr;
    SpokenTypes spoken_;
    RunKnowledge knowledge_;
    LogRuns runs_;
    LogRuns::Filter filter_ = LogRuns::Filter::None;
    std::vector<Choice> choices_;  ///< runs that the user opened or closed, or saw beginning
    int rows_ = 0;                 ///< of the view
    int shown_ = 0;                ///< as the table knows
    contract::OutlineItem first_;  ///< as last loaded, to tell growth from another log
    contract::OutlineItem last_;
};

}  // namespace orvane::desktop
