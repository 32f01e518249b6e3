// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/desktop/DesktopSession.h"
#include "tests/support/TestDirectory.h"

#include <gtest/gtest.h>

#include <QMessageBox>

#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace orvane::desktop::test {

/// The real window with the real module, a history of its own, and real images; no disk of the
/// machine is in its list.
class WindowFixture : public testing::Test {
protected:
    /// An ext4 image of 8 MiB whose label is its name; its file name.
    std::string makeImage(const std::string& name);
    std::string makeDamagedImage(const std::string& name);
    /// Two partitions, the first with an ext4 volume.
    std::string makePartitionedImage(const std::string& name);
    /// A checking tool that runs until it is told to end takes the place of e2fsck.
    void useEndlessTool();

    SessionOptions options(const std::vector<std::string>& names);
    /// Opens the window without waiting for its disks.
    void openWith(SessionOptions options);
    void openWithSystemDisks();
    /// Opens the window, and waits until the images are in the list.
    void open(const std::vector<std::string>& images);
    /// Makes an image, opens the window with it and selects it; its file name.
    std::string openImage(const std::string& name);
    void close() { session_.reset(); }

    /// Lets the event loop run until `isDone`; NO when that takes too long.
    [[nodiscard]] static bool waitUntil(const std::function<bool()>& isDone);
    [[nodiscard]] bool waitForJob();
    void select(const std::string& image);
    /// Selects the image, and presses the button until the job is over.
    void run(const char* name, const std::string& image);
    void run(const char* name);
    QtButton& button(const char* name);
    LogTable& log() { return session_->activeTab()->interface()->outlinePeer()->table(); }
    std::vector<std::string> logRows();
    bool logHolds(const std::string& text);
    /// What the disk list says about the image.
    std::string cell(const std::string& image, DiskColumn column);
    QModelIndex row(const std::string& image);
    std::string verdict(const std::string& image) { return cell(image, DiskColumn::Verdict); }
    QAction& command(const char* name);
    /// What the banner says about the last job on what is selected.
    std::string result();
    /// Until the banner offers this.
    [[nodiscard]] bool waitForStep(NextStep step);
    void take(NextStep step);
    /// The sheet that is open; none when there is none.
    QMessageBox* sheet();
    /// What it says; also closes it.
    std::string takeSheet();
    static void press(QMessageBox& box, const QString& button);

    DesktopSession& session() { return *session_; }
    MainWindow& window() { return session_->window(); }

    orvane::test::TestDirectory directory_;
    bool wasClosed_ = false;
    bool asksFirst_ = false;  ///< before a repair
    std::unique_ptr<DesktopSession> session_;

private:
    void TearDown() override;
};

}  // namespace orvane::desktop::test
