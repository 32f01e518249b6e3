// SPDX-License-Identifier: Apache-2.0
#include "tests/desktop/WindowFixture.h"

#include "orvane/desktop/toolkit/Text.h"
#include "tests/support/ToolRun.h"

#include <signal.h>

#include <cstdlib>

namespace orvane::desktop::test {
namespace {

namespace fs = std::filesystem;

/// What happens to the disk or to the tool while a real job runs.
class JobFaultTest : public WindowFixture {
protected:
    /// The real e2fsck, which begins when `go` is called.
    void useWaitingTool()
    {
        const fs::path tool = directory_ / "tools/e2fsck";
        orvane::test::write(tool, "#!/bin/sh\necho $$ >'" + waits().native() + "'\n" +
                                      "while [ ! -e '" + mayGo().native() +
                                      "' ]; do sleep 0.02; done\nexec /usr/sbin/e2fsck \"$@\"\n");
        fs::permissions(tool, fs::perms::owner_all);
        ::setenv("FIXWELL_TOOL_PATH", tool.parent_path().c_str(), 1);
    }
    fs::path waits() const { return directory_ / "waits"; }
    fs::path mayGo() const { return directory_ / "go"; }

    void start(const char* action, const std::string& image)
    {
        open({image});
        select(image);
        button(action).press();
    }

    /// The alert that is open now, in one string; also closes it.
    std::string takeAlert()
    {
        QMessageBox* const box = sheet();
        if (box == nullptr)
            return {};
        const std::string text = fromQt(box->text() + QLatin1Char('\n') + box->informativeText());
        box->close();
        return text;
    }
};

TEST_F(JobFaultTest, AnImageThatIsLostDuringItsCheckIsNeverTakenForAnother)
{
    struct Case {
        std::string name;
        std::function<void(const std::string& image)> lose;
        std::string verdict;
        std::string alert;
        std::string log;
    };
    const auto cutTo = [](std::uintmax_t size) {
        return [size](const std::string& image) {
            fs::resize_file(image, size);
        };
    };
    for (const Case& c : {
             Case{"cut", cutTo(4 << 20), "failed", "changed while it was being checked",
                  "cannot verify “cut”: the disk became shorter"},
             Case{"emptied", cutTo(0), "failed", "changed while it was being checked",
                  "cannot verify “emptied”: the disk became shorter"},
             // Its contents are there as long as the job has them open, and nobody else has them.
             Case{"deleted", [](const std::string& image) { fs::remove(image); }, "failed",
                  "changed while it was being checked",
                  "cannot verify “deleted”: the disk was deleted, moved or replaced"},
             Case{"replaced",
                  [this](const std::string& image) { fs::rename(makeImage("other"), image); },
                  "failed", "changed while it was being checked",
                  "cannot verify “replaced”: the disk was deleted, moved or replaced"},
         }) {
        fs::remove(mayGo());
        fs::remove(waits());
        useWaitingTool();
        const std::string image = makeImage(c.name);
        start("verifyDiskButton", image);
        ASSERT_TRUE(waitUntil([&] { return fs::exists(waits()); }));
        c.lose(image);
        orvane::test::write(mayGo(), "");
        ASSERT_TRUE(waitForJob());
        EXPECT_EQ(cell(image, DiskColumn::Verdict), c.verdict) << c.name;
        EXPECT_TRUE(logHolds(c.log)) << testing::PrintToString(logRows());
        takePicture("fault-" + c.name);
        const std::string alert = takeAlert();
        EXPECT_EQ(alert.empty(), c.alert.empty()) << alert;
        EXPECT_NE(alert.find(c.alert), std::string::npos) << alert;
        close();
    }
}

TEST_F(JobFaultTest, AToolThatIsKilledHasFoundNothing)
{
    struct Case {
        const char* action;
        std::string verdict;
        std::string alert;
        std::string_view because;
    };
    for (const Case& c :
         {Case{"verifyDiskButton", "failed", "tool failed", "nothing is known"},
          Case{"repairDiskButton", "damaged", "still damaged", "it was read once more"},
          Case{"repairDiskButton", "sound", "", "and found to be sound"}}) {
        fs::remove(mayGo());
        fs::remove(waits());
        useWaitingTool();
        const std::string image =
            c.verdict == "sound" ? makeImage(c.verdict) : makeDamagedImage(c.verdict);
        start(c.action, image);
        std::string process;
        ASSERT_TRUE(waitUntil([&] {
            process = orvane::test::contentsOf(waits());
            return process.ends_with('\n');
        }));
        orvane::test::write(mayGo(), "");
        // It sleeps for a moment yet; should it have gone on, it is e2fsck itself that is killed.
        ASSERT_EQ(::kill(std::stoi(process), SIGKILL), 0);
        ASSERT_TRUE(waitForJob());
        EXPECT_EQ(cell(image, DiskColumn::Verdict), c.verdict) << c.because;
        EXPECT_TRUE(logHolds("e2fsck was killed (signal 9)")) << testing::PrintToString(logRows());
        takePicture(std::string("fault-killed-") + c.verdict);
        const std::string alert = takeAlert();
        EXPECT_EQ(alert.empty(), c.alert.empty()) << alert;
        EXPECT_NE(alert.find(c.alert), std::string::npos) << c.action;
        EXPECT_TRUE(button(c.action).isEnabled()) << "it can be tried again";
        close();
    }
}

}  // namespace
}  // namespace orvane::desktop::test
