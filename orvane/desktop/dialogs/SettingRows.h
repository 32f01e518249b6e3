// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QBoxLayout>
#include <QCheckBox>
#include <QComboBox>
#include <QGridLayout>
#include <QLabel>
#include <QPushButton>
#include <QString>
#include <QWidget>

#include <cstdint>
#include <utility>
#include <vector>

namespace orvane::desktop {

/// Everything in the dialogs lies on this grid, in pixels.
inline constexpr int gridUnit = 8;

/// A sentence of plain text, wrapped.
[[nodiscard]] QLabel* makeNote(const QString& text, QWidget* parent);

/// Gives the dialog this width, or the one that it needs, and the height that its wrapped texts
/// take then, as the least: pages and dialogs do not ask for that by themselves.
void fitToTexts(QWidget& dialog, int widthInCharacters);

/// One of the values that can be chosen, in words.
struct NumberChoice {
    std::uint64_t number = 0;
    QString words;
};

/// A column of settings: each is a control, and a sentence that says what it means. A screen reader
/// reads the sentence as the control's description.
class SettingRows final : public QWidget {
public:
    explicit SettingRows(QWidget* parent = nullptr);

    QCheckBox& addSwitch(const char* objectName, const QString& title, const QString& meaning);
    /// The title stands before the box, whose entries carry the numbers.
    QComboBox& addChoice(const char* objectName, const QString& title);
    /// For the choices before it.
    void addMeaning(const QString& meaning);
    /// A line of text that changes, and a button for it.
    std::pair<QLabel*, QPushButton*> addState(const char* objectName, const QString& buttonTitle);

private:
    QVBoxLayout* rows_;
    QGridLayout* choices_ = nullptr;  ///< the block of choices that goes on
};

/// Fills the box and selects `chosen`, which comes in its place among the others where it is none
/// of them. Nothing is told of it.
void fill(QComboBox& box, std::vector<NumberChoice> choices, const NumberChoice& chosen);

}  // namespace orvane::desktop
