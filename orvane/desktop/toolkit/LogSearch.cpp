// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/LogSearch.h"

#include "contract/foundation/Format.h"
#include "orvane/desktop/toolkit/Text.h"

#include <QHBoxLayout>
#include <QKeyEvent>
#include <QShortcut>

#include <algorithm>
#include <utility>

namespace orvane::desktop {
namespace {

using Clock = std::chrono::steady_clock;

constexpr std::chrono::milliseconds slice{10};
constexpr int rowsBetweenTimes = 256;

char lowered(char c)
{
    return c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c;
}

bool isASCII(const std::string& text)
{
    return std::all_of(text.begin(), text.end(),
                       [](char c) { return static_cast<unsigned char>(c) < 0x80; });
}

}  // namespace

TextFinder::TextFinder(const QString& wanted) : wanted_(wanted)
{
    const std::string text = fromQt(wanted);
    if (isASCII(text))
        std::transform(text.begin(), text.end(), std::back_inserter(lowered_), lowered);
}

bool TextFinder::isIn(std::string_view text) const
{
    if (wanted_.isEmpty())
        return false;
    if (lowered_.empty())
        return toQt(text).contains(wanted_, Qt::CaseInsensitive);
    return std::search(text.begin(), text.end(), lowered_.begin(), lowered_.end(),
                       [](char c, char other) { return lowered(c) == other; }) != text.end();
}

void LogMatches::search(const QString& text)
{
    finder_ = TextFinder(text);
    isSearching_ = !text.isEmpty();
    begin();
}

void LogMatches::begin()
{
    rows_.clear();
    looked_ = 0;
}

void LogMatches::lookOn(std::chrono::milliseconds budget)
{
    contract::OutlineView* const view = model_.view();
    if (view == nullptr)
        return;
    const Clock::time_point end = Clock::now() + budget;
    while (!isComplete() && Clock::now() < end)
        for (int i = 0; i < rowsBetweenTimes && !isComplete(); ++i, ++looked_)
            if (finder_.isIn(textOfRow(*view, static_cast<std::size_t>(looked_)).characters()))
                rows_.push_back(looked_);
}

LogSearch::LogSearch(OutlinePeer& peer, const contract::Bundle& texts, QWidget* parent)
    : QWidget(parent),
      peer_(peer),
      texts_(texts),
      matches_(peer.model()),
      field_(new QLineEdit(this)),
      count_(new QLabel(this))
{
    const QString name = toQt(texts.localizedString("Find in the log"));
    setObjectName(QStringLiteral("logSearch"));
    field_->setObjectName(QStringLiteral("logSearchField"));
    field_->setPlaceholderText(name);
    field_->setAccessibleName(name);
    field_->setClearButtonEnabled(true);
    count_->setTextFormat(Qt::PlainText);
    auto* const row = new QHBoxLayout(this);
    row->setContentsMargins(0, 0, 0, 0);
    row->addWidget(field_, 1);
    row->addWidget(count_);
    QToolButton* const back = addButton("Previous match", Qt::UpArrow);
    QToolButton* const next = addButton("Next match", Qt::DownArrow);
    QToolButton* const end = addButton("Close the search", Qt::NoArrow);
    end->setText(QStringLiteral("✕"));
    connect(back, &QToolButton::clicked, this, [this] { goOn(false); });
    connect(next, &QToolButton::clicked, this, [this] { goOn(true); });
    connect(end, &QToolButton::clicked, this, [this] { close(); });
    connect(field_, &QLineEdit::textChanged, this,
            [this](const QString& text) { searchFor(text); });
    look_.setInterval(0);
    connect(&look_, &QTimer::timeout, this, [this] { look(); });
    peer_.setRowsChanged([this](LogModel::Change change) { rowsChanged(change); });
    peer_.setEscaped([this] { close(); });
    addShortcuts(*parent);
    hide();
}

QToolButton* LogSearch::addButton(std::string_view name, Qt::ArrowType arrow)
{
    auto* const button = new QToolButton(this);
    const QString text = toQt(texts_.localizedString(name));
    button->setArrowType(arrow);
    button->setAutoRaise(true);
    button->setToolTip(toQtToolTip(fromQt(text)));
    button->setAccessibleName(text);
    // Without one it would be the tool tip, which is HTML.
    button->setAccessibleDescription(text);
    layout()->addWidget(button);
    return button;
}

void LogSearch::addShortcuts(QWidget& window)
{
    const auto add = [this, &window](const QKeySequence& keys, const std::function<void()>& act) {
        connect(new QShortcut(keys, &window), &QShortcut::activated, this, act);
    };
    add(QKeySequence(Qt::CTRL | Qt::Key_F), [this] { open(); });
    add(QKeySequence(Qt::Key_F3), [this] { goOn(true); });
    add(QKeySequence(Qt::SHIFT | Qt::Key_F3), [this] { goOn(false); });
}

void LogSearch::open()
{
    show();
    field_->setFocus(Qt::ShortcutFocusReason);
    field_->selectAll();
    if (peer_.table().searched() != field_->text())
        searchFor(field_->text());
}

void LogSearch::close()
{
    if (!isVisible())
        return;
    hide();
    look_.stop();
    matches_.search({});
    peer_.table().setSearched({});
    peer_.table().setFocus(Qt::OtherFocusReason);
}

void LogSearch::keyPressEvent(QKeyEvent* event)
{
    if (event->key() == Qt::Key_Escape)
        close();
    else if (event->key() == Qt::Key_Return || event->key() == Qt::Key_Enter)
        goOn(!event->modifiers().testFlag(Qt::ShiftModifier));
    else
        QWidget::keyPressEvent(event);
}

void LogSearch::searchFor(const QString& text)
{
    peer_.flush();
    matches_.search(text);
    peer_.table().setSearched(text);
    current_ = -1;
    currentItem_ = {};
    mustShow_ = !text.isEmpty();
    look_.start();
    look();
}

void LogSearch::rowsChanged(LogModel::Change change)
{
    if (isHidden())
        return;
    if (change == LogModel::Change::Other) {
        matches_.begin();
        current_ = -1;
        tried_ = 0;
    }
    look_.start();
}

void LogSearch::look()
{
    matches_.lookOn(slice);
    findCurrentAgain();
    showFirst();
    showCount();
    if (!isLooking())
        look_.stop();
}

/// Details came or went: the reader stays where he was.
void LogSearch::findCurrentAgain()
{
    contract::OutlineView* const view = peer_.model().view();
    const std::vector<int>& rows = matches_.rows();
    for (; view != nullptr && current_ < 0 && currentItem_ && tried_ < rows.size(); ++tried_)
        if (view->itemAtRow(static_cast<std::size_t>(rows[tried_])).isSameAs(currentItem_))
            current_ = rows[tried_];
}

/// For rows, or for where they are shown.
bool LogSearch::isLooking() const
{
    const bool isToBeShown = mustShow_ && !matches_.rows().empty();
    return !matches_.isComplete() || (isToBeShown && !peer_.model().isComplete());
}

/// As soon as it can be shown: a long log is taken in from its end.
void LogSearch::showFirst()
{
    const std::vector<int>& rows = matches_.rows();
    if (!mustShow_ || rows.empty())
        return;
    if (!peer_.model().isComplete() && !peer_.goTo(static_cast<std::size_t>(rows.front())))
        return;
    goOn(true);
    mustShow_ = current_ < 0;
}

// Rows that a filter leaves out are not gone to.
void LogSearch::goOn(bool isForwards)
{
    if (isHidden()) {
        open();
        return;
    }
    // Rows that wait would move the reader on again.
    peer_.flush();
    const std::vector<int>& rows = matches_.rows();
    const auto count = static_cast<std::ptrdiff_t>(rows.size());
    const auto from = isForwards ? std::upper_bound(rows.begin(), rows.end(), current_)
                                 : std::lower_bound(rows.begin(), rows.end(), current_);
    std::ptrdiff_t place = from - rows.begin() - (isForwards ? 0 : 1);
    for (std::ptrdiff_t tried = 0; tried < count; ++tried, place += isForwards ? 1 : -1) {
        const int row = rows[static_cast<std::size_t>((place + count) % count)];
        if (!peer_.goTo(static_cast<std::size_t>(row)))
            continue;
        current_ = row;
        currentItem_ = peer_.model().view()->itemAtRow(static_cast<std::size_t>(row));
        break;
    }
    showCount();
}

void LogSearch::showCount()
{
    const std::vector<int>& rows = matches_.rows();
    const auto place = std::lower_bound(rows.begin(), rows.end(), current_) - rows.begin() + 1;
    const bool isAtOne = current_ >= 0 && place <= static_cast<std::ptrdiff_t>(rows.size());
    QString text;
    if (!rows.empty())
        text = toQt(contract::format(
            texts_.localizedString("%ld of %ld"),
            {isAtOne ? static_cast<long>(place) : 0L, static_cast<long>(rows.size())}));
    else if (!field_->text().isEmpty() && matches_.isComplete())
        text = toQt(texts_.localizedString("Not found"));
    if (!text.isEmpty() && isLooking())
        text += QStringLiteral("…");
    count_->setText(text);
}

QCheckBox* makeProblemsToggle(OutlinePeer& peer, const contract::Bundle& texts, QWidget* parent)
{
    auto* const toggle = new QCheckBox(toQt(texts.localizedString("&Problems only")), parent);
    toggle->setObjectName(QStringLiteral("problemsOnly"));
    const std::string meaning =
        texts.localizedString("Show only what was found to be wrong, and the results");
    toggle->setToolTip(toQtToolTip(meaning));
    toggle->setAccessibleDescription(toQt(meaning));
    QObject::connect(toggle, &QCheckBox::toggled, toggle, [&peer](bool isOn) {
        peer.setFilter(isOn ? LogRuns::Filter::KeptRows : LogRuns::Filter::None);
    });
    return toggle;
}

}  // namespace orvane::desktop
