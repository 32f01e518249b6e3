// SPDX-License-Identifier: Apache-2.0
// What the user sees of the actions: which are on, what they are called, what they say of
// themselves, and the question before the startup disk is verified.

#include "orvane/desktop/toolkit/Text.h"
#include "tests/desktop/toolkit/ToolkitFixture.h"

#include <QAbstractButton>
#include <QMessageBox>
#include <QTest>
#include <QTextDocument>

#include <functional>
#include <vector>

namespace orvane::desktop {
namespace {

using fixwell::testing::FakeDisk;

class Actions : public ToolkitTest {
protected:
    QAbstractButton& widget(const char* name) { return interface->button(name)->widget(); }

    void selectDisks(const std::vector<std::shared_ptr<FakeDisk>>& disks)
    {
        host.fake.disks = {disks.begin(), disks.end()};
        host.fake.selection = {disks.begin(), disks.end()};
        selectDisk();
    }

    /// The four buttons as the user finds them: "+" on, "-" off, in the interface's order.
    std::string states()
    {
        std::string text;
        for (const char* name : {"verifyDiskButton", "repairDiskButton", "verifyPermissionsButton",
                                 "repairPermissionsButton"})
            text += widget(name).isEnabled() ? '+' : '-';
        return text;
    }

    /// What the pointer shows over it, without the marks that keep it plain.
    std::string toolTip(const char* name)
    {
        QTextDocument text;
        text.setHtml(widget(name).toolTip());
        return fromQt(text.toPlainText());
    }

    QMessageBox* sheet()
    {
        for (QMessageBox* box : interface->widget().findChildren<QMessageBox*>())
            if (box->isVisible())
                return box;
        return nullptr;
    }

    static std::shared_ptr<FakeDisk> disk(const std::function<void(FakeDisk&)>& change = {})
    {
        static int number = 0;
        auto made = std::make_shared<FakeDisk>("sdb" + std::to_string(++number));
        made->mount = "/mnt";
        if (change)
            change(*made);
        return made;
    }
};

TEST_F(Actions, TheButtonsSayWhatCanBeDoneAndWhyNot)
{
    const auto notMounted = [](FakeDisk& d) {
        d.mount.reset();
        d.permissionsRepairable = false;
    };
    const auto readOnly = [](FakeDisk& d) {
        d.writable = false;
    };
    const auto root = [](FakeDisk& d) {
        d.boot = true;
        d.fileSystem.verifiesLive = true;
    };
    const auto home = [](FakeDisk& d) {
        d.home = true;
    };
    const auto lostImage = [](FakeDisk& d) {
        d.offlineImage = true;
    };
    const auto whole = [](FakeDisk& d) {
        d.type = 1;
        d.whole = true;
    };
    const auto noOwners = [](FakeDisk& d) {
        d.ownership = false;
    };
    struct Case {
        const char* what;
        std::vector<std::shared_ptr<FakeDisk>> disks;
        std::string states;
        const char* button;
        std::string reason;
    };
    for (const Case& c : {
             Case{"nothing", {}, "----", "verifyDiskButton", ""},
             Case{"a volume", {disk()}, "++++", "repairDiskButton", ""},
             Case{"not mounted",
                  {disk(notMounted)},
                  "++--",
                  "verifyPermissionsButton",
                  "Not available because the selected disk is not mounted."},
             Case{"one of two",
                  {disk(), disk(notMounted)},
                  "++--",
                  "repairPermissionsButton",
                  "Not available because one of the selected disks is not mounted."},
             Case{"no owners",
                  {disk(noOwners)},
                  "++--",
                  "verifyPermissionsButton",
                  "Not available because the selected disk is set to ignore ownership."},
             Case{"read-only",
                  {disk(readOnly)},
                  "+-+-",
                  "repairDiskButton",
                  "Not available because the selected disk can’t be written to."},
             Case{"startup disk",
                  {disk(root)},
                  "+-++",
                  "repairDiskButton",
                  "Not available because the startup disk is selected."},
             Case{"home",
                  {disk(home)},
                  "--++",
                  "repairDiskButton",
                  "Not available for the selected disk."},
             Case{"whole disk", {disk(whole)}, "++--", "verifyPermissionsButton", ""},
             Case{"image that has gone", {disk(lostImage), disk()}, "----", "verifyDiskButton", ""},
         }) {
        selectDisks(c.disks);
        EXPECT_EQ(states(), c.states) << c.what;
        const std::string tip = toolTip(c.button);
        EXPECT_FALSE(tip.empty()) << c.what;
        EXPECT_EQ(tip.find("Not available") != std::string::npos, !c.reason.empty()) << tip;
        EXPECT_NE(tip.find(c.reason), std::string::npos) << c.what << ": " << tip;
    }
}

TEST_F(Actions, ARunningActionIsItsOwnStopButton)
{
    struct Case {
        const char* button;
        std::string states;
        std::string title;
    };
    for (const Case& c : {Case{"verifyDiskButton", "+---", "Stop Verify"},
                          Case{"repairDiskButton", "-+--", "Stop Repair"},
                          Case{"verifyPermissionsButton", "--+-", "Stop Permission Verify"},
                          Case{"repairPermissionsButton", "---+", "Stop Permission Repair"}}) {
        selectDisks({disk()});
        const std::string before = fromQt(widget(c.button).text().remove(QLatin1Char('&')));
        QTest::mouseClick(&widget(c.button), Qt::LeftButton);
        EXPECT_EQ(states(), c.states);
        EXPECT_EQ(fromQt(widget(c.button).text().remove(QLatin1Char('&'))), c.title);
        EXPECT_EQ(toolTip(c.button), "This operation can be stopped");
        EXPECT_FALSE(widget("clearHistoryButton").isEnabled());
        EXPECT_TRUE(widget("showDetailsButton").isEnabled());
        QTest::mouseClick(&widget(c.button), Qt::LeftButton);
        EXPECT_EQ(states(), "----") << "it is being stopped";
        module->plAsyncFinishedForDisk(host.fake.disks.front()->theKRDisk(), 0, 0, {});
        EXPECT_EQ(states(), "++++");
        EXPECT_EQ(fromQt(widget(c.button).text().remove(QLatin1Char('&'))), before);
    }
}

TEST_F(Actions, TheStartupDiskIsAskedAboutAndReturnDoesNothing)
{
    const auto root = disk([](FakeDisk& d) {
        d.boot = true;
        d.fileSystem.verifiesLive = true;
    });
    host.qtAlerts.setWindow(&interface->widget());
    struct Case {
        Qt::KeyboardModifiers modifiers;
        std::function<void(QMessageBox& box)> answer;  ///< none: no question is expected
        bool verifies;
        const char* because;
    };
    const auto key = [](int pressed) {
        return [pressed](QMessageBox& box) {
            QTest::keyClick(&box, static_cast<Qt::Key>(pressed));
        };
    };
    const auto click = [](const char* title) {
        return [title](QMessageBox& box) {
            for (QAbstractButton* button : box.buttons())
                if (button->text().remove(QLatin1Char('&')) == QLatin1String(title))
                    QTest::mouseClick(button, Qt::LeftButton);
        };
    };
    for (const Case& c : {
             Case{{}, key(Qt::Key_Return), false, "Return means Cancel"},
             Case{{}, key(Qt::Key_Escape), false, "and so does Escape"},
             Case{{}, click("Cancel"), false, "as the button says"},
             Case{{}, click("Verify Disk"), true, "only the pointer says yes"},
             Case{Qt::AltModifier, {}, true, "Alt skips the question"},
         }) {
        selectDisks({root});
        QTest::mouseClick(&widget("verifyDiskButton"), Qt::LeftButton, c.modifiers);
        QMessageBox* const box = sheet();
        ASSERT_EQ(box != nullptr, static_cast<bool>(c.answer)) << c.because;
        if (box != nullptr) {
            EXPECT_EQ(states(), "----") << "while the question is open";
            EXPECT_NE(fromQt(box->text()).find("slow or unresponsive"), std::string::npos);
            c.answer(*box);
            ASSERT_TRUE(QTest::qWaitFor([this] { return sheet() == nullptr; }));
            settle();
        }
        EXPECT_EQ(host.fake.isLocked, c.verifies) << c.because;
        EXPECT_EQ(states(), c.verifies ? "+---" : "+-++") << c.because;
        if (c.verifies)
            module->plAsyncFinishedForDisk(root->theKRDisk(), 0, 0, {});
    }
}

}  // namespace
}  // namespace orvane::desktop
