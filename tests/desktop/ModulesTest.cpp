// SPDX-License-Identifier: Apache-2.0
// Two modules in one window: the checking one, and the example that tells what takes the room.
#include "tests/desktop/WindowFixture.h"

#include "orvane/desktop/toolkit/Text.h"
#include "orvane/support/modules/ModuleSearch.h"

#include <QMessageBox>
#include <QPlainTextEdit>

namespace orvane::desktop::test {
namespace {

namespace fs = std::filesystem;

constexpr int checkingTab = 0;
constexpr int usageTab = 1;

class ModulesTest : public WindowFixture {
protected:
    /// The window with both modules, and with a selected image that is said to be mounted.
    void openBoth()
    {
        image_ = makeImage("Holidays");
        SessionOptions wanted = options({image_});
        wanted.moduleDirectories.insert(wanted.moduleDirectories.begin(),
                                        runningExecutable().parent_path().parent_path() /
                                            "examples");
        openWith(std::move(wanted));
        ASSERT_TRUE(waitUntil([&] { return disk() != nullptr && row(image_).isValid(); }));
        ASSERT_EQ(window().tabs().count(), 2);
        orvane::test::write(directory_ / "mounted/Pictures/one", std::string(200 << 10, 'x'));
        DiskFacts facts = disk()->facts();
        facts.mountPoint = directory_ / "mounted";
        disk()->setFacts(facts);
        select(image_);
        show(usageTab);
    }
    std::shared_ptr<Disk> disk()
    {
        return session().host().sharedDiskController().diskNamed(image_);
    }
    void show(int tab) { window().tabs().setCurrentIndex(tab); }
    std::string usage()
    {
        return fromQt(window().tabs().widget(usageTab)->findChild<QPlainTextEdit*>()->toPlainText());
    }
    QtButton& measureButton() { return button("measureButton"); }
    bool waitUntilFree()
    {
        return waitUntil([this] { return measureButton().title() == "Measure"; });
    }

    std::string image_;
};

TEST_F(ModulesTest, EachTabWorksOnWhatIsSelected)
{
    openBoth();
    EXPECT_NE(usage().find("mounted at"), std::string::npos) << usage();
    measureButton().press();
    ASSERT_TRUE(waitUntilFree());
    EXPECT_NE(usage().find("Pictures/"), std::string::npos) << usage();
    // What another module has done is no check that did not come about.
    static_cast<void>(waitUntil([this] { return command("verifyDiskButton").isEnabled(); }));
    EXPECT_EQ(sheet(), nullptr) << takeSheet();
    EXPECT_EQ(verdict(image_), "");

    window().disks().clearSelection();
    EXPECT_FALSE(measureButton().isEnabled());
    EXPECT_EQ(measureButton().reason(), "Select a disk first.");
    EXPECT_EQ(usage(), "");
    show(checkingTab);
    run("verifyDiskButton", image_);
    EXPECT_EQ(verdict(image_), "sound");
}

// What the window's thread does while the other's work is not yet at its end: the event loop is
// not run in between.
TEST_F(ModulesTest, AMeasurementHasTheWindowToItselfAndIsStoppedFromEitherTab)
{
    openBoth();
    for (const int tab : {usageTab, checkingTab}) {
        show(usageTab);
        measureButton().press();
        EXPECT_EQ(measureButton().title(), "Stop Measuring");
        show(checkingTab);
        EXPECT_FALSE(button("verifyDiskButton").isEnabled()) << "it would find the disk busy";
        EXPECT_EQ(button("verifyDiskButton").title(), "Verify Disk");
        show(tab);
        command("stopJob").trigger();
        show(usageTab);
        EXPECT_EQ(measureButton().reason(), "It is being stopped.");
        ASSERT_TRUE(waitUntilFree());
        show(checkingTab);
        EXPECT_TRUE(waitUntil([this] { return button("verifyDiskButton").isEnabled(); }));
    }
    show(usageTab);
    measureButton().press();
    window().close();
    ASSERT_NE(sheet(), nullptr);
    EXPECT_EQ(sheet()->text(), "A job is still running.") << "it is no check";
    press(*sheet(), "Stop and Quit");
    EXPECT_TRUE(waitUntil([this] { return wasClosed_; }));
}

TEST_F(ModulesTest, ACheckGoesOnWhileTheOtherTabIsShown)
{
    useEndlessTool();
    openBoth();
    show(checkingTab);
    button("verifyDiskButton").press();
    ASSERT_TRUE(waitUntil([this] { return logHolds("Checking inodes"); }));
    show(usageTab);
    EXPECT_EQ(measureButton().reason(), "Not available while a job runs.");
    EXPECT_FALSE(measureButton().isEnabled());
    show(checkingTab);
    EXPECT_EQ(button("verifyDiskButton").action(), "stopAction:");
    show(usageTab);
    command("stopJob").trigger();
    ASSERT_TRUE(waitUntil([this] { return measureButton().isEnabled(); }));
    show(checkingTab);
    ASSERT_TRUE(waitForJob());
    EXPECT_TRUE(waitUntil([this] { return verdict(image_) == "stopped"; })) << verdict(image_);
}

}  // namespace
}  // namespace orvane::desktop::test
