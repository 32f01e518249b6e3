// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/dialogs/PreferencesDialog.h"

#include "contract/foundation/Format.h"
#include "orvane/desktop/toolkit/Text.h"
#include "orvane/desktop/window/Question.h"

#include <QDialogButtonBox>
#include <QEvent>
#include <QLocale>
#include <QSignalBlocker>
#include <QTabWidget>

#include <utility>

namespace orvane::desktop {
namespace {

constexpr int widthInCharacters = 84;

QString sizeInWords(std::uint64_t bytes)
{
    const bool isRound = bytes % (1U << 30U) == 0 || bytes < 1024;
    return QLocale().formattedDataSize(static_cast<qint64>(bytes), isRound ? 0 : 1,
                                       QLocale::DataSizeIecFormat);
}

}  // namespace

PreferencesDialog::PreferencesDialog(Subject subject, QWidget* parent)
    : QDialog(parent), subject_(std::move(subject))
{
    setObjectName(QStringLiteral("preferencesDialog"));
    setWindowTitle(text("Preferences"));
    setAttribute(Qt::WA_DeleteOnClose);
    auto* const layout = new QVBoxLayout(this);
    layout->setContentsMargins(2 * gridUnit, 2 * gridUnit, 2 * gridUnit, 2 * gridUnit);
    layout->setSpacing(2 * gridUnit);
    auto* const pages = new QTabWidget(this);
    pages->setAccessibleName(windowTitle());
    pages->addTab(checkingPage(), text("Checking"));
    pages->addTab(repairsPage(), text("Repairs"));
    pages->addTab(programPage(), text("Program"));
    layout->addWidget(pages, 1);
    addButtons(*layout);
    refresh();
    fitToTexts(*this, widthInCharacters);
}

QString PreferencesDialog::text(std::string_view key) const
{
    return toQt(subject_.texts.text(key));
}

void PreferencesDialog::addButtons(QBoxLayout& layout)
{
    auto* const buttons = new QDialogButtonBox(this);
    buttons->addButton(text("Close"), QDialogButtonBox::RejectRole)->setDefault(true);
    QPushButton* const help = buttons->addButton(text("Help"), QDialogButtonBox::HelpRole);
    help->setAutoDefault(false);
    connect(buttons, &QDialogButtonBox::rejected, this, &QDialog::reject);
    connect(buttons, &QDialogButtonBox::helpRequested, this, [this] { subject_.showHelp(); });
    layout.addWidget(buttons);
}

void PreferencesDialog::addSwitch(SettingRows& rows, const Switch& kept, std::string_view title,
                                  std::string_view meaning)
{
    contract::UserDefaults& settings = subject_.settings;
    QCheckBox& box = rows.addSwitch(kept.key.data(), text(title), text(meaning));
    connect(&box, &QCheckBox::toggled, this,
            [kept, &settings](bool isOn) { kept.set(settings, isOn); });
    switches_.push_back({&box, [kept, &settings] {
                             return kept.isOn(settings);
                         }});
}

QWidget* PreferencesDialog::checkingPage()
{
    auto* const rows = new SettingRows(this);
    QCheckBox& details = rows->addSwitch(
        "showsDetails", text("&Show details"),
        text("The log shows every line that the checking tools say, not the results alone."));
    connect(&details, &QCheckBox::toggled, this,
            [this](bool shows) { subject_.setShowsDetails(shows); });
    switches_.push_back({&details, subject_.showsDetails});
    addSwitch(*rows, thoroughVerification, "Verify &thoroughly",
              "A verification that finds nothing also tries a repair, without writing to the disk, "
              "and tells what it would change. This takes longer.");
    addSwitch(*rows, fetchesPackageArchives, "&Download package archives",
              "To verify permissions, the archives of packages that say nothing of them on this "
              "system are fetched from the distribution’s servers.");
    return rows;
}

QWidget* PreferencesDialog::repairsPage()
{
    auto* const rows = new SettingRows(this);
    addSwitch(*rows, asksBeforeRepair, "&Ask before every repair",
              "Before anything is written to a disk, you hear what will be done, and can still "
              "choose otherwise.");
    addLimit(*rows, days_, "keptRepairDays", "Keep what repairs have &overwritten for");
    addLimit(*rows, repairs_, "keptRepairs", "At &most this many repairs");
    addLimit(*rows, megabytes_, "keptRepairMegabytes", "&Together no larger than");
    rows->addMeaning(
        text("As long as what it has overwritten is kept, a repair can be undone. The oldest ones "
             "beyond these limits are deleted after the next repair, an interrupted one never."));
    std::tie(kept_, delete_) = rows->addState("keptRepairsState", text("Delete &Now…"));
    delete_->setObjectName(QStringLiteral("deleteKeptRepairs"));
    connect(delete_, &QPushButton::clicked, this, [this] { askToDelete(); });
    return rows;
}

QWidget* PreferencesDialog::programPage()
{
    auto* const rows = new SettingRows(this);
    addSwitch(
        *rows, showsNotices, "&Notices when a job ends",
        "When a job took longer than a moment and you were not looking, the desktop tells you "
        "how it went.");
    addSwitch(*rows, reopensImages, "&Open the images of the last time",
              "The disk images that are in the list when the program ends are there again at the "
              "next start.");
    return rows;
}

void PreferencesDialog::addLimit(SettingRows& rows, QComboBox*& box, const char* key,
                                 std::string_view title)
{
    box = &rows.addChoice(key, text(title));
    connect(box, &QComboBox::currentIndexChanged, this, [this, box = box, key] {
        subject_.settings.setObjectForKey(
            static_cast<std::int64_t>(box->currentData().toULongLong()), key);
    });
}

NumberChoice PreferencesDialog::days(std::uint64_t number) const
{
    const auto count = static_cast<long>(number);
    if (number == 0)
        return {number, text("do not keep")};
    if (number >= mostRepairDays)
        return {number, text("unlimited time")};
    if (number % 365 == 0)
        return {number,
                toQt(contract::format(subject_.texts.plural("%ld year", "%ld years", count / 365),
                                      {count / 365}))};
    return {number,
            toQt(contract::format(subject_.texts.plural("%ld day", "%ld days", count), {count}))};
}

NumberChoice PreferencesDialog::repairs(std::uint64_t number) const
{
    if (number == 0)
        return {number, text("none")};
    return {number, number >= unlimitedRepairs ? text("unlimited number")
                                               : QLocale().toString(qulonglong{number})};
}

NumberChoice PreferencesDialog::megabytes(std::uint64_t number) const
{
    if (number == 0)
        return {number, text("nothing")};
    return {number,
            number >= unlimitedRepairs ? text("unlimited size") : sizeInWords(number << 20U)};
}

void PreferencesDialog::fillLimits(const RepairSettings& kept)
{
    fill(*days_, {days(0), days(7), days(30), days(90), days(365), days(mostRepairDays)},
         days(kept.keptRepairDays));
    fill(
        *repairs_,
        {repairs(0), repairs(5), repairs(20), repairs(50), repairs(200), repairs(unlimitedRepairs)},
        repairs(kept.keptRepairs));
    fill(*megabytes_,
         {megabytes(0), megabytes(512), megabytes(1024), megabytes(4096), megabytes(16384),
          megabytes(65536), megabytes(unlimitedRepairs)},
         megabytes(kept.keptRepairMegabytes));
}

void PreferencesDialog::refresh()
{
    for (const Bound& bound : switches_) {
        const QSignalBlocker quiet(bound.box);
        bound.box->setChecked(bound.isOn());
    }
    fillLimits(subject_.repairSettings());
    showKept(subject_.keptAmount());
}

void PreferencesDialog::changeEvent(QEvent* event)
{
    QDialog::changeEvent(event);
    if (event->type() == QEvent::FontChange && layout() != nullptr)
        fitToTexts(*this, widthInCharacters);
    if (event->type() == QEvent::ActivationChange && isActiveWindow())
        refresh();
}

std::string PreferencesDialog::amountText(const KeptAmount& kept) const
{
    const auto count = static_cast<long>(kept.repairs);
    return contract::format(subject_.texts.plural("%ld repair, %@", "%ld repairs, %@", count),
                            {count, fromQt(sizeInWords(kept.bytes))});
}

void PreferencesDialog::showKept(const KeptAmount& kept)
{
    kept_->setText(kept.repairs == 0
                       ? text("Nothing is kept now.")
                       : toQt(subject_.texts.sentence("Kept now: %@", {amountText(kept)})));
    delete_->setEnabled(kept.repairs > kept.lastingRepairs);
    delete_->setToolTip(kept.repairs > 0 && !delete_->isEnabled()
                            ? text("An interrupted repair is kept until it is finished or undone.")
                            : QString());
}

void PreferencesDialog::askToDelete()
{
    const KeptAmount kept = subject_.keptAmount();
    ask(*this, {"deleteKeptQuestion",
                subject_.texts.sentence("Delete what is kept of repairs (%@)?", {amountText(kept)}),
                subject_.texts.text("These repairs can then not be undone any more. The disks stay "
                                    "as they are. A repair that was interrupted stays, too."),
                {{subject_.texts.text("Delete"),
                  [this] {
                      showKept(subject_.deleteKept());
                  }}},
                subject_.texts.text("Cancel")});
}

}  // namespace orvane::desktop
