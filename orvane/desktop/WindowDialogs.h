// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/desktop/KeptRepairs.h"
#include "orvane/desktop/ModuleTabs.h"
#include "orvane/desktop/dialogs/PreferencesDialog.h"

#include <QPointer>

#include <functional>

namespace orvane::desktop {

/// The dialogs that the user chooses in the menus: each is there at most once, and comes to the
/// front when it is chosen again. Main thread.
class WindowDialogs {
public:
    /// All but `update`, which shows what has changed, outlive this object.
    WindowDialogs(const SessionParts& parts, KeptRepairs& kept, pellar::Trials trials,
                  std::function<void()> update)
        : at_(parts), kept_(kept), trials_(std::move(trials)), update_(std::move(update))
    {
    }
    WindowDialogs(const WindowDialogs&) = delete;
    WindowDialogs& operator=(const WindowDialogs&) = delete;
    ~WindowDialogs();

    void showPreferences();

    /// Something else is known or chosen in the window.
    void refresh();

private:
    PreferencesDialog::Subject preferences();
    void setShowsDetails(bool shows);

    const SessionParts at_;
    KeptRepairs& kept_;
    const pellar::Trials trials_;
    const std::function<void()> update_;
    QPointer<PreferencesDialog> preferences_;
};

}  // namespace orvane::desktop
