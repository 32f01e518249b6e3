// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/dialogs/SettingRows.h"

#include <QSignalBlocker>
#include <QStyle>

#include <algorithm>

namespace orvane::desktop {

QLabel* makeNote(const QString& text, QWidget* parent)
{
    auto* const note = new QLabel(text, parent);
    note->setTextFormat(Qt::PlainText);
    note->setWordWrap(true);
    note->setAlignment(Qt::AlignLeading | Qt::AlignTop);
    return note;
}

void fitToTexts(QWidget& dialog, int widthInCharacters)
{
    QLayout& layout = *dialog.layout();
    const int width = std::max(layout.totalMinimumSize().width(),
                               dialog.fontMetrics().averageCharWidth() * widthInCharacters);
    dialog.setMinimumSize(
        width, std::max(layout.totalMinimumSize().height(), layout.totalHeightForWidth(width)));
    dialog.resize(dialog.minimumSize());
}

SettingRows::SettingRows(QWidget* parent) : QWidget(parent), rows_(new QVBoxLayout(this))
{
    rows_->setContentsMargins(2 * gridUnit, 2 * gridUnit, 2 * gridUnit, 2 * gridUnit);
    rows_->setSpacing(gridUnit);
    rows_->addStretch(1);
}

QCheckBox& SettingRows::addSwitch(const char* objectName, const QString& title,
                                  const QString& meaning)
{
    choices_ = nullptr;
    auto* const box = new QCheckBox(title, this);
    box->setObjectName(QLatin1String(objectName));
    box->setAccessibleDescription(meaning);
    auto* const note = new QHBoxLayout;
    note->setSpacing(0);
    // Below the title, in either direction of writing.
    note->addSpacing(style()->pixelMetric(QStyle::PM_IndicatorWidth, nullptr, box) +
                     style()->pixelMetric(QStyle::PM_CheckBoxLabelSpacing, nullptr, box));
    note->addWidget(makeNote(meaning, this), 1);
    rows_->insertWidget(rows_->count() - 1, box);
    rows_->insertLayout(rows_->count() - 1, note);
    rows_->insertSpacing(rows_->count() - 1, gridUnit);
    return *box;
}

QComboBox& SettingRows::addChoice(const char* objectName, const QString& title)
{
    if (choices_ == nullptr) {
        choices_ = new QGridLayout;
        choices_->setHorizontalSpacing(2 * gridUnit);
        choices_->setVerticalSpacing(gridUnit);
        choices_->setColumnStretch(2, 1);
        rows_->insertLayout(rows_->count() - 1, choices_);
    }
    auto* const box = new QComboBox(this);
    box->setObjectName(QLatin1String(objectName));
    box->setSizeAdjustPolicy(QComboBox::AdjustToContents);
    auto* const label = new QLabel(title, this);
    label->setBuddy(box);
    const int row = choices_->rowCount();
    choices_->addWidget(label, row, 0);
    choices_->addWidget(box, row, 1);
    return *box;
}

void SettingRows::addMeaning(const QString& meaning)
{
    if (choices_ != nullptr)
        for (int i = 0; i < choices_->count(); ++i)
            if (auto* const box = qobject_cast<QComboBox*>(choices_->itemAt(i)->widget()))
                box->setAccessibleDescription(meaning);
    choices_ = nullptr;
    rows_->insertWidget(rows_->count() - 1, makeNote(meaning, this));
    rows_->insertSpacing(rows_->count() - 1, gridUnit);
}

std::pair<QLabel*, QPushButton*> SettingRows::addState(const char* objectName,
                                                       const QString& buttonTitle)
{
    choices_ = nullptr;
    auto* const state = new QLabel(this);
    state->setTextFormat(Qt::PlainText);
    state->setObjectName(QLatin1String(objectName));
    auto* const button = new QPushButton(buttonTitle, this);
    button->setAutoDefault(false);
    auto* const row = new QHBoxLayout;
    row->setSpacing(2 * gridUnit);
    row->addWidget(state, 1);
    row->addWidget(button);
    rows_->insertLayout(rows_->count() - 1, row);
    return {state, button};
}

void fill(QComboBox& box, std::vector<NumberChoice> choices, const NumberChoice& chosen)
{
    const QSignalBlocker quiet(box);
    const auto place = std::ranges::lower_bound(choices, chosen.number, {}, &NumberChoice::number);
    const int index = static_cast<int>(place - choices.begin());
    if (place == choices.end() || place->number != chosen.number)
        choices.insert(place, chosen);
    box.clear();
    for (const NumberChoice& choice : choices)
        box.addItem(choice.words, static_cast<qulonglong>(choice.number));
    box.setCurrentIndex(index);
}

}  // namespace orvane::desktop
