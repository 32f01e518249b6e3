// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/support/OVPreferences.h"
#include "orvane/desktop/dialogs/SettingRows.h"
#include "orvane/jobs/KeptAmount.h"
#include "orvane/support/settings/RepairSettings.h"
#include "orvane/support/settings/Switch.h"
#include "orvane/support/texts/Catalogue.h"

#include <QDialog>

#include <functional>
#include <string>
#include <string_view>
#include <vector>

namespace orvane::desktop {

/// The user's preferences. What is changed holds and is kept at once; a job that runs is done as it
/// was begun. Whenever the dialog becomes active it shows what is kept by then. Main thread.
class PreferencesDialog final : public QDialog {
public:
    /// What the dialog is about. The references outlive it.
    struct Subject {
        contract::UserDefaults& settings;
        const Translator& texts;
        std::function<bool()> showsDetails;
        std::function<void(bool shows)> setShowsDetails;
        std::function<RepairSettings()> repairSettings;
        std::function<KeptAmount()> keptAmount;
        /// Answers what is left.
        std::function<KeptAmount()> deleteKept;
        std::function<void()> showHelp;
    };

    PreferencesDialog(Subject subject, QWidget* parent);

    /// Shows what is kept now.
    void refresh();

protected:
    void changeEvent(QEvent* event) override;

private:
    /// A check box and what it stands for.
    struct Bound {
        QCheckBox* box;
        std::function<bool()> isOn;
    };

    QWidget* checkingPage();
    QWidget* repairsPage();
    QWidget* programPage();
    void addSwitch(SettingRows& rows, const Switch& kept, std::string_view title,
                   std::string_view meaning);
    void addLimit(SettingRows& rows, QComboBox*& box, const char* key, std::string_view title);
    void addButtons(QBoxLayout& layout);
    void fillLimits(const RepairSettings& kept);
    void showKept(const KeptAmount& kept);
    void askToDelete();

    QString text(std::string_view key) const;
    NumberChoice days(std::uint64_t number) const;
    NumberChoice repairs(std::uint64_t number) const;
    NumberChoice megabytes(std::uint64_t number) const;
    std::string amountText(const KeptAmount& kept) const;

    const Subject subject_;
    std::vector<Bound> switches_;
    QComboBox* days_ = nullptr;
    QComboBox* repairs_ = nullptr;
    QComboBox* megabytes_ = nullptr;
    QLabel* kept_ = nullptr;
    QPushButton* delete_ = nullptr;
};

}  // namespace orvane::desktop
