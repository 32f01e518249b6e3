// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/loop/EventLoop.h"
#include "orvane/support/texts/Catalogue.h"
#include "pellar/tools/ToolVersions.h"

#include <QDialog>
#include <QTableWidget>

#include <memory>
#include <string>
#include <thread>

namespace orvane::desktop {

/// What the program is, its version and licence, and the checking tools of this system, whose
/// versions are asked in a thread. Main thread.
class AboutDialog final : public QDialog {
public:
    /// The loop and the texts outlive the dialog.
    AboutDialog(std::string toolPath, EventLoop& loop, const Translator& texts, QWidget* parent);
    /// Stops a tool that is being asked.
    ~AboutDialog() override;

private:
    QString text(std::string_view key) const;
    void show(const std::vector<pellar::InstalledTool>& tools);
    void copy() const;

    const Translator& texts_;
    QTableWidget* tools_;
    /// Handed to the thread, which reports to the dialog only while it is there.
    std::shared_ptr<AboutDialog*> liveness_ = std::make_shared<AboutDialog*>(this);
    std::shared_ptr<pellar::StopSwitch> stop_ = std::make_shared<pellar::StopSwitch>();
    std::jthread thread_;
};

}  // namespace orvane::desktop
