// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/support/OVPreferences.h"
#include "orvane/desktop/window/CommandBar.h"
#include "orvane/desktop/window/DiskHeader.h"
#include "orvane/desktop/window/DiskPanel.h"
#include "orvane/desktop/window/DropNote.h"
#include "orvane/desktop/window/ElidedLabel.h"
#include "orvane/desktop/window/ResultBanner.h"

#include <QMainWindow>
#include <QProgressBar>
#include <QPushButton>
#include <QSplitter>
#include <QTabWidget>
#include <QWidget>

#include <filesystem>
#include <functional>
#include <string_view>
#include <vector>

namespace orvane::desktop {

/// The status line, and beside it the progress bar, while there is something going on: it stands
/// where the result will. For a job that no module has a button for, there is one to stop it.
class ProgressArea final : public QWidget {
public:
    ProgressArea(const Translator& texts, QWidget* parent);

    void setBarActive(bool isActive);
    void setTextActive(bool isActive);
    void setIndeterminate(bool isIndeterminate);
    /// From 0 to 100.
    void setPercent(double percent);
    /// Any bytes; shown as one line of plain text.
    void setText(std::string_view text);
    QString text() const { return label_->fullText(); }
    /// Shows the Stop button, which calls this with every press; hides it when empty.
    void setStop(std::function<void()> stop);

private:
    void showRange();
    void adoptUse();

    QProgressBar* bar_;
    ElidedLabel* label_;
    QPushButton* stopButton_;
    std::function<void()> stop_;
    bool isBarActive_ = false;
    bool isTextActive_ = false;
    bool isIndeterminate_ = true;
    int tenths_ = 0;
};

/// The host's window: commands at the top, the disks on the left, on the right what is selected,
/// what came out of the last job on it or how far this one is, and the modules' tabs.
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
        /// There is little room now, or there is more again.
        std::function<void(bool isCompact)> roomChanged;
    };

    /// `texts` must outlive the window.
    explicit MainWindow(const Translator& texts);
    void setEvents(Events events) { events_ = std::move(events); }

    DiskPanel& diskPanel() { return *disks_; }
    DiskList& disks() { return disks_->list(); }
    const DiskList& disks() const { return disks_->list(); }
    QTabWidget& tabs() { return *tabs_; }
    CommandBar& commands() { return *commands_; }
    DiskHeader& header() { return *header_; }
    ResultBanner& banner() { return *banner_; }
    QSplitter& splitter() { return *splitter_; }
    ProgressArea& progress() { return *progress_; }

    /// The user's attention is here: the window is open, and no dialog that is not its own waits
    /// for an answer. A window behind another program's keeps it, so that a button is ready when
    /// the click that brings the window to the front falls on it; so does one beside its help.
    bool hasAttention() const;

    /// Where the window stood, and how it was divided, is kept in the settings from one start to
    /// the next. What cannot be read is left as it is.
    void restoreLayout(const contract::UserDefaults& settings);
    void saveLayout(contract::UserDefaults& settings) const;

protected:
    void changeEvent(QEvent* event) override;
    void closeEvent(QCloseEvent* event) override;
    void dragEnterEvent(QDragEnterEvent* event) override;
    void dragLeaveEvent(QDragLeaveEvent* event) override;
    void dropEvent(QDropEvent* event) override;
    void keyPressEvent(QKeyEvent* event) override;
    void paintEvent(QPaintEvent* event) override;
    void resizeEvent(QResizeEvent* event) override;

private:
    void tellOfChange();
    void adoptRoom();

    const Translator& texts_;
    Events events_;
    CommandBar* commands_;
    DiskPanel* disks_;
    DiskHeader* header_;
    ResultBanner* banner_;
    QTabWidget* tabs_;
    QSplitter* splitter_;
    ProgressArea* progress_;
    DropNote* dropNote_;
    bool isCompact_ = false;
    bool hadAttention_ = true;
    bool hasAppeared_ = false;
};

}  // namespace orvane::desktop
