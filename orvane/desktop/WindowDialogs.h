// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/desktop/DiskPane.h"
#include "orvane/desktop/KeptRepairs.h"
#include "orvane/desktop/ModuleTabs.h"
#include "orvane/desktop/dialogs/AboutDialog.h"
#include "orvane/desktop/dialogs/PreferencesDialog.h"
#include "orvane/desktop/dialogs/ReportDialog.h"
#include "orvane/desktop/dialogs/ReportSaver.h"

#include <QPointer>

#include <functional>

namespace orvane::desktop {

/// The dialogs that the user chooses in the menus: each is there at most once, and comes to the
/// front when it is chosen again. Main thread.
class WindowDialogs {
public:
    /// All but `update`, which shows what has changed, outlive this object.
    WindowDialogs(const SessionParts& parts, DiskPane& disks, KeptRepairs& kept,
                  const pellar::JobOptions& library, std::function<void()> update)
        : at_(parts),
          disks_(disks),
          kept_(kept),
          trials_(library.trials),
          toolPath_(library.toolPath),
          update_(std::move(update))
    {
    }
    WindowDialogs(const WindowDialogs&) = delete;
    WindowDialogs& operator=(const WindowDialogs&) = delete;
    ~WindowDialogs();

    void showPreferences();

    void showAbout();

    /// Of the selected disks.
    void saveReport();
    [[nodiscard]] bool canSaveReport() const { return !saver_ && !disks_.selected().empty(); }

    /// Something else is known or chosen in the window.
    void refresh();

private:
    PreferencesDialog::Subject preferences();
    void setShowsDetails(bool shows);
    void save(const std::vector<std::shared_ptr<Disk>>& disks, ReportScope scope,
              const QString& file);

    const SessionParts at_;
    DiskPane& disks_;
    KeptRepairs& kept_;
    const pellar::Trials trials_;
    const std::string toolPath_;
    const std::function<void()> update_;
    QPointer<PreferencesDialog> preferences_;
    QPointer<AboutDialog> about_;
    QPointer<ReportDialog> report_;
    std::unique_ptr<ReportSaver> saver_;  ///< while a report is saved
};

}  // namespace orvane::desktop
