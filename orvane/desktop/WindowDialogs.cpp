// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/WindowDialogs.h"

#include "contract/toolkit/ControlNames.h"

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
}

void WindowDialogs::showPreferences()
{
    if (!preferences_)
        preferences_ = new PreferencesDialog(preferences(), &at_.window);
    preferences_->refresh();
    bringToFront(*preferences_);
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
            [this] { at_.host.sharedHelpManager().openHelpAnchor("preferences"); }};
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

}  // namespace orvane::desktop
