// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/WindowDialogs.h"

#include "contract/toolkit/ControlNames.h"
#include "orvane/desktop/toolkit/Text.h"

namespace orvane::desktop {
namespace {

void bringToFront(QWidget& dialog)
{
    dialog.show();
    dialog.raise();
    dialog.activateWindow();
}

}  // namespace

WindowDialogs::~WindowDialogs()
{
    delete preferences_;
    delete about_;
    delete report_;
}

void WindowDialogs::showPreferences()
{
    if (!preferences_)
        preferences_ = new PreferencesDialog(preferences(), &at_.window);
    preferences_->refresh();
    bringToFront(*preferences_);
}

void WindowDialogs::showAbout()
{
    if (!about_)
        about_ =
            new AboutDialog(toolPath_, at_.host.mainRunLoop(), at_.host.translator(), &at_.window);
    bringToFront(*about_);
}

void WindowDialogs::refresh()
{
    if (preferences_)
        preferences_->refresh();
}

PreferencesDialog::Subject WindowDialogs::preferences()
{
    return {at_.host.standardUserDefaults(),
            at_.host.translator(),
            [this] { return at_.host.sharedPreferences().showDetailsInFixwell(); },
            [this](bool shows) { setShowsDetails(shows); },
            [this] { return repairSettingsIn(at_.host.standardUserDefaults()); },
            [this] { return keptAmount(trials_); },
            [this] {
                const KeptAmount left = deleteKept(trials_);
                kept_.read();
                update_();
                return left;
            },
            [this] {
                at_.host.sharedHelpManager().openHelpAnchor("preferences");
            }};
}

// The module keeps the preference itself when its button is pressed, and the log follows.
void WindowDialogs::setShowsDetails(bool shows)
{
    QtButton* const button = at_.tabs.button(contract::outlet::showDetails);
    if (button != nullptr && button->isEnabled() && button->isChecked() != shows)
        button->press();
    // Where no module is loaded.
    at_.host.sharedPreferences().setShowDetailsInFixwell(shows);
}

void WindowDialogs::saveReport()
{
    if (!canSaveReport())
        return;
    const auto disks = disks_.selected();
    QStringList names;
    for (const auto& disk : disks)
        names += toQtLine(disk->displayName());
    delete report_;
    report_ = new ReportDialog(
        names.join(QStringLiteral(", ")), at_.host.sharedPreferences().showDetailsInFixwell(),
        at_.host.translator(),
        [this, disks](ReportScope scope, const QString& file) { save(disks, scope, file); },
        &at_.window);
    report_->open();
}

void WindowDialogs::save(const std::vector<std::shared_ptr<Disk>>& disks, ReportScope scope,
                         const QString& file)
{
    // The oldest records belong to it, too.
    if (at_.host.histories().loadAll())
        at_.tabs.reloadLog();
    saver_ = std::make_unique<ReportSaver>(
        std::make_unique<Report>(disks, at_.host, scope), file, at_.host.translator(), at_.window,
        [this](const std::string& failure) {
            saver_.reset();
            if (!failure.empty())
                at_.host.showSheet(at_.host.translator().text("The report was not saved."),
                                   {failure});
        });
}

}  // namespace orvane::desktop
