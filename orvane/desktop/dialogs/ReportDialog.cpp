// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/dialogs/ReportDialog.h"

#include "orvane/desktop/dialogs/SettingRows.h"
#include "orvane/desktop/toolkit/Text.h"

#include <QDate>
#include <QDialogButtonBox>
#include <QFileDialog>

#include <array>
#include <utility>

namespace orvane::desktop {
namespace {

constexpr int widthInCharacters = 64;

struct FileType {
    std::string_view name;
    const char* ending;
};
constexpr std::array fileTypes{FileType{"PDF document", "pdf"}, FileType{"Page of HTML", "html"},
                               FileType{"Text", "txt"}};

/// "Letters 2026-11-22", without what cannot stand in a file name.
QString nameFor(QString subject)
{
    constexpr qsizetype longest = 60;
    for (QChar& c : subject)
        if (c == QLatin1Char('/') || c.unicode() < 32)
            c = QLatin1Char('-');
    while (subject.startsWith(QLatin1Char('.')))
        subject.remove(0, 1);
    return subject.left(longest) + QLatin1Char(' ') + QDate::currentDate().toString(Qt::ISODate);
}

}  // namespace

ReportDialog::ReportDialog(const QString& subject, bool showsDetails, const Translator& texts,
                           Chosen chosen, QWidget* parent)
    : QDialog(parent),
      texts_(texts),
      subject_(subject),
      chosen_(std::move(chosen)),
      lastAlone_(new QRadioButton(text("The &last check alone"), this)),
      details_(new QCheckBox(text("With &details"), this))
{
    setObjectName(QStringLiteral("reportDialog"));
    setWindowTitle(text("Save Report"));
    setAttribute(Qt::WA_DeleteOnClose);
    setWindowModality(Qt::WindowModal);
    auto* const rows = new QVBoxLayout(this);
    rows->setContentsMargins(2 * gridUnit, 2 * gridUnit, 2 * gridUnit, 2 * gridUnit);
    rows->setSpacing(gridUnit);
    rows->addWidget(
        makeNote(toQt(texts.sentence(
                     "A report on %@ tells what is known of it, of this computer, and of its "
                     "checks and repairs, to be kept or passed on.",
                     {fromQt(subject)})),
                 this));
    rows->addSpacing(gridUnit);
    auto* const all = new QRadioButton(text("&All checks and repairs"), this);
    all->setObjectName(QStringLiteral("allRuns"));
    all->setChecked(true);
    rows->addWidget(all);
    lastAlone_->setObjectName(QStringLiteral("lastRunAlone"));
    rows->addWidget(lastAlone_);
    rows->addSpacing(gridUnit);
    details_->setObjectName(QStringLiteral("withDetails"));
    details_->setChecked(showsDetails);
    details_->setAccessibleDescription(text("All lines that the checking tools said."));
    rows->addWidget(details_);
    rows->addStretch(1);
    rows->addSpacing(gridUnit);
    auto* const buttons = new QDialogButtonBox(this);
    QPushButton* const save = buttons->addButton(text("Save…"), QDialogButtonBox::AcceptRole);
    save->setDefault(true);
    buttons->addButton(text("Cancel"), QDialogButtonBox::RejectRole)->setAutoDefault(false);
    connect(buttons, &QDialogButtonBox::accepted, this, [this] { chooseFile(); });
    connect(buttons, &QDialogButtonBox::rejected, this, &QDialog::reject);
    rows->addWidget(buttons);
    fitToTexts(*this, widthInCharacters);
}

QString ReportDialog::text(std::string_view key) const
{
    return toQt(texts_.text(key));
}

// The file's ending says how the report is written; the type chosen in the dialog adds one.
void ReportDialog::chooseFile()
{
    auto* const dialog = new QFileDialog(this, windowTitle());
    dialog->setAttribute(Qt::WA_DeleteOnClose);
    dialog->setAcceptMode(QFileDialog::AcceptSave);
    QStringList filters;
    for (const FileType& type : fileTypes)
        filters += QStringLiteral("%1 (*.%2)").arg(text(type.name), QLatin1String(type.ending));
    dialog->setNameFilters(filters);
    dialog->setDefaultSuffix(QLatin1String(fileTypes.front().ending));
    connect(dialog, &QFileDialog::filterSelected, dialog, [dialog, filters](const QString& filter) {
        if (const qsizetype i = filters.indexOf(filter); i >= 0)
            dialog->setDefaultSuffix(QLatin1String(fileTypes[static_cast<std::size_t>(i)].ending));
    });
    dialog->selectFile(nameFor(subject_));
    connect(dialog, &QFileDialog::fileSelected, this, [this](const QString& file) {
        chosen_({lastAlone_->isChecked(), details_->isChecked()}, file);
        accept();
    });
    dialog->open();
}

}  // namespace orvane::desktop
