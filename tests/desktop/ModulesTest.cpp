// SPDX-License-Identifier: Apache-2.0
// Two modules in one window: the checking one, and the example that tells what takes the room.
#include "tests/desktop/WindowFixture.h"

#include "orvane/desktop/toolkit/Text.h"
#include "orvane/support/modules/ModuleSearch.h"

#include <QMessageBox>
#include <QPlainTextEdit>
#include <QTest>

namespace orvane::desktop::test {
namespace {

namespace fs = std::filesystem;

constexpr int checkingTab = 0;
constexpr int usageTab = 1;
constexpr const char* volume = "/dev/no-such-volume";

class ModulesTest : public WindowFixture {
protected:
    /// The window with both modules, an image, and a volume that is selected and said to be
    /// mounted.
    void openBoth()
    {
        image_ = makeImage("Holidays");
        SessionOptions wanted = options({image_});
        wanted.moduleDirectories.insert(
            wanted.moduleDirectories.begin(),
            runningExecutable().parent_path().parent_path() / "examples");
        openWith(std::move(wanted));
        ASSERT_TRUE(waitUntil([&] {
            return session().host().sharedDiskController().roots().size() == 2;
        })) << "an image is known with what is in it";
        ASSERT_EQ(window().tabs().count(), 2);
        orvane::test::write(directory_ / "mounted/Pictures/one", std::string(200 << 10, 'x'));
        addVolume(volume, directory_ / "mounted");
        select(volume);
        show(usageTab);
    }
    void addVolume(const char* node, const fs::path& mountPoint)
    {
        DiskTree tree;
        tree.facts.identifier = tree.facts.path = tree.facts.name = node;
        tree.facts.type = diskType::volume;
        tree.facts.filesystem = "ext4";
        tree.facts.length = 1 << 30;
        tree.facts.mountPoint = mountPoint;
        volumes_.push_back(tree);
        session().host().sharedDiskController().synchronize(volumes_);
    }
    void show(int tab) { window().tabs().setCurrentIndex(tab); }
    std::string usage()
    {
        return fromQt(
            window().tabs().widget(usageTab)->findChild<QPlainTextEdit*>()->toPlainText());
    }
    QtButton& measureButton() { return button("measureButton"); }
    bool waitUntilFree()
    {
        return waitUntil([this] { return measureButton().title() == "Measure"; });
    }

    std::string image_;
    std::vector<DiskTree> volumes_;
};

TEST_F(ModulesTest, EachTabWorksOnWhatIsSelected)
{
    openBoth();
    EXPECT_NE(usage().find("mounted at"), std::string::npos) << usage();
    window().disks().setFocus();
    command("selectAll").trigger();
    EXPECT_NE(usage().find("not attached"), std::string::npos) << usage();
    measureButton().press();
    ASSERT_TRUE(waitUntilFree());
    EXPECT_NE(usage().find("Pictures/"), std::string::npos) << usage();
    // What another module has done is no check that did not come about.
    QTest::qWait(50);
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
    }
    // So much lies there that it cannot have been counted when the question is answered.
    addVolume("/dev/no-such-root", "/");
    select("/dev/no-such-root");
    show(usageTab);
    measureButton().press();
    window().close();
    ASSERT_NE(sheet(), nullptr);
    EXPECT_EQ(sheet()->text(), "A job is still running.") << "it is no check";
    press(*sheet(), "Stop and Quit");
    EXPECT_TRUE(waitUntil([this] { return wasClosed_; }));
    EXPECT_NE(usage().find("Stopped after"), std::string::npos) << usage();
}

TEST_F(ModulesTest, ACheckGoesOnWhileTheOtherTabIsShown)
{
    useEndlessTool();
    openBoth();
    show(checkingTab);
    select(image_);
    button("verifyDiskButton").press();
    ASSERT_TRUE(waitUntil([this] { return logHolds("Verifying"); }));
    show(usageTab);
    EXPECT_EQ(measureButton().reason(), "Not available while a job runs.");
    EXPECT_FALSE(measureButton().isEnabled());
    show(checkingTab);
    EXPECT_EQ(button("verifyDiskButton").action(), "stopAction:");
    show(usageTab);
    command("stopJob").trigger();
    show(checkingTab);
    ASSERT_TRUE(waitForJob());
    EXPECT_TRUE(waitUntil([this] { return verdict(image_) == "stopped"; })) << verdict(image_);
}

}  // namespace
}  // namespace orvane::desktop::test
