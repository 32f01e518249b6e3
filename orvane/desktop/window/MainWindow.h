// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/desktop/window/DiskList.h"
#include "orvane/desktop/window/ProgressArea.h"

#include <QMainWindow>
#include <QSplitter>
#include <QTabWidget>

#include <filesystem>
#include <functional>
#include <vector>

namespace orvane::desktop {

/// The host's window: the disks on the left, the modules' tabs on the right, progress below.
/// Knows how they lie, not what they do. Main thread.
class MainWindow final : public QMainWindow {
public:
    struct Events {
        /// NO keeps the window open.
        std::function<bool()> mayClose;
        /// Files were dropped on the window; asked before, with `canOpenFiles`.
        std::function<void(const std::vector<std::filesystem::path>&)> filesDropped;
        std::function<bool()> canOpenFiles;
        /// Another tab is shown, or `hasAttention` answers otherwise than before.
        std::function<void()> changed;
        /// The window was painted for the first time.
        std::function<void()> appeared;
    };

    /// `texts` must outlive the window.
    explicit MainWindow(const Translator& texts);
    void setEvents(Events events) { events_ = std::move(events); }

    DiskList& disks() { return *disks_; }
    const DiskList& disks() const { return *disks_; }
    QTabWidget& tabs() { return *tabs_; }
    QSplitter& splitter() { return *splitter_; }
    ProgressArea& progress() { return *progress_; }

    /// The user's attention is here: the window is open, and no dialog that is not its own waits
    /// for an answer. A window behind another program's keeps it, so that a button is ready when
    /// the click that brings the window to the front falls on it; so does one beside its help.
    bool hasAttention() const;

protected:
    void changeEvent(QEvent* event) override;
    void closeEvent(QCloseEvent* event) override;
    void dragEnterEvent(QDragEnterEvent* event) override;
    void dropEvent(QDropEvent* event) override;
    void paintEvent(QPaintEvent* event) override;

private:
    void tellOfChange();

    Events events_;
    DiskList* disks_;
    QTabWidget* tabs_;
    QSplitter* splitter_;
    ProgressArea* progress_;
    bool hadAttention_ = true;
    bool hasAppeared_ = false;
};

}  // namespace orvane::desktop
