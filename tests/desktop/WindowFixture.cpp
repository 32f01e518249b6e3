// SPDX-License-Identifier: Apache-2.0
#include "tests/desktop/WindowFixture.h"

#include "orvane/desktop/toolkit/Text.h"
#include "orvane/support/settings/Switch.h"
#include "tests/support/TestDirectory.h"

#include <QAbstractButton>
#include <QPushButton>
#include <QTest>

#include <fcntl.h>

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <utility>

namespace orvane::desktop::test {

using orvane::test::prepareWith;

std::string WindowFixture::makeImage(const std::string& name)
{
    return directory_.makeExt(name + ".img", 8 << 20, {"-L", name});
}

std::string WindowFixture::makeDamagedImage(const std::string& name)
{
    const std::string image = makeImage(name);
    directory_.damage(image, "set_super_value free_blocks_count 7");
    directory_.damage(image, "clri /lost+found");
    return image;
}

std::string WindowFixture::makePartitionedImage(const std::string& name)
{
    const std::string image = directory_.makeFile(name + ".img", 24 << 20);
    prepareWith({"sfdisk", "-q", image}, "label: gpt\nstart=2048,size=16384\nsize=16384\n");
    prepareWith({"mke2fs", "-q", "-F", "-t", "ext4", "-L", "inner", "-E", "offset=1048576", image,
                 "8192k"});
    return image;
}

void WindowFixture::useEndlessTool()
{
    const std::string tools =
        directory_.fakeTools("say Pass 1: Checking inodes, blocks, and sizes\nwait");
    ::setenv("FIXWELL_TOOL_PATH", tools.c_str(), 1);
}

void WindowFixture::TearDown()
{
    session_.reset();
    ::unsetenv("FIXWELL_TOOL_PATH");
}

SessionOptions WindowFixture::options(const std::vector<std::string>& names)
{
    SessionOptions options;
    options.paths = {directory_ / "config", directory_ / "state", directory_ / "cache",
                     directory_ / "data"};
    options.disksToOpen = names;
    options.scansSystemDisks = false;
    options.closed = [this] {
        wasClosed_ = true;
    };
    return options;
}

void WindowFixture::openWith(SessionOptions options)
{
    wasClosed_ = false;
    session_ = std::make_unique<DesktopSession>(std::move(options));
    asksBeforeRepair.set(session_->host().standardUserDefaults(), asksFirst_);
    session_->show();
}

void WindowFixture::openWithSystemDisks()
{
    SessionOptions wanted = options({});
    wanted.scansSystemDisks = true;
    openWith(std::move(wanted));
}

void WindowFixture::open(const std::vector<std::string>& images)
{
    openWith(options(images));
    // An image is known with what is in it.
    ASSERT_TRUE(waitUntil([&] {
        return session_->host().sharedDiskController().roots().size() == 2 * images.size();
    }));
}

bool WindowFixture::waitUntil(const std::function<bool()>& isDone)
{
    constexpr int longestWait = 30'000;  // milliseconds
    return QTest::qWaitFor(isDone, longestWait);
}

bool WindowFixture::waitForJob()
{
    return waitUntil([this] {
        return button("verifyDiskButton").action() == "verifyDisk:" &&
               button("repairDiskButton").action() == "repairDisk:";
    });
}

void WindowFixture::run(const char* name, const std::string& image)
{
    select(image);
    run(name);
}

void WindowFixture::run(const char* name)
{
    button(name).press();
    ASSERT_TRUE(waitForJob());
}

QModelIndex WindowFixture::row(const std::string& image)
{
    const QAbstractItemModel& model = *window().disks().model();
    const QModelIndexList found = model.match(model.index(0, 0), Qt::UserRole, toQt(image), 1,
                                              Qt::MatchExactly | Qt::MatchRecursive);
    return found.isEmpty() ? QModelIndex() : found.front();
}

std::string WindowFixture::openImage(const std::string& name)
{
    const std::string image = makeImage(name);
    open({image});
    select(image);
    return image;
}

void WindowFixture::select(const std::string& image)
{
    const QModelIndex index = row(image);
    ASSERT_TRUE(index.isValid()) << image;
    window().disks().scrollTo(index);
    QTest::mouseClick(window().disks().viewport(), Qt::LeftButton, {},
                      window().disks().visualRect(index).center());
}

std::string WindowFixture::cell(const std::string& image, DiskColumn column)
{
    return fromQt(row(image).siblingAtColumn(static_cast<int>(column)).data().toString());
}

QtButton& WindowFixture::button(const char* name)
{
    return *session_->activeTab()->interface()->button(name);
}

std::vector<std::string> WindowFixture::logRows()
{
    session_->activeTab()->interface()->outlinePeer()->flush();
    const QAbstractItemModel& model = *log().model();
    std::vector<std::string> rows;
    for (int row = 0; row < model.rowCount(); ++row)
        rows.push_back(fromQt(model.index(row, 0).data(Qt::DisplayRole).toString()));
    return rows;
}

bool WindowFixture::logHolds(const std::string& text)
{
    for (const std::string& row : logRows())
        if (row.find(text) != std::string::npos)
            return true;
    return false;
}

QAction& WindowFixture::command(const char* name)
{
    return *window().findChild<QAction*>(QLatin1String(name));
}

std::string WindowFixture::result()
{
    return window().banner().summary().title;
}

bool WindowFixture::waitForStep(NextStep step)
{
    return waitUntil(
        [&] { return std::ranges::count(window().banner().summary().steps, step) != 0; });
}

void WindowFixture::take(NextStep step)
{
    ASSERT_TRUE(waitForStep(step)) << result();
    auto* const button = window().banner().findChild<QPushButton*>(
        QStringLiteral("step%1").arg(static_cast<int>(step)));
    QTest::mouseClick(button, Qt::LeftButton);
}

QMessageBox* WindowFixture::sheet()
{
    for (QMessageBox* box : window().findChildren<QMessageBox*>())
        if (box->isVisible())
            return box;
    return nullptr;
}

std::string WindowFixture::takeSheet()
{
    QMessageBox* const box = sheet();
    if (box == nullptr)
        return {};
    box->close();
    return fromQt(box->text() + QLatin1Char('\n') + box->informativeText());
}

void WindowFixture::press(QMessageBox& box, const QString& title)
{
    for (QAbstractButton* button : box.buttons())
        if (button->text().remove(QLatin1Char('&')) == title) {
            QTest::mouseClick(button, Qt::LeftButton);
            return;
        }
    FAIL() << "the sheet has no button " << fromQt(title);
}

}  // namespace orvane::desktop::test
