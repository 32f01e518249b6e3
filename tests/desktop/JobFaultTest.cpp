// SPDX-License-Identifier: Apache-2.0
#include "tests/desktop/WindowFixture.h"

#include <QTest>

#include <cstdlib>
#include <future>
#include <memory>

namespace orvane::desktop::test {
namespace {

namespace fs = std::filesystem;

/// What happens to the disk or to the tool while a real job runs.
using JobFaultTest = WindowFixture;

TEST_F(JobFaultTest, AnImageThatIsLostDuringItsCheckIsNeverTakenForAnother)
{
    for (const std::string name : {"deleted", "replaced"}) {
        const fs::path tools = directory_.fakeTools("say Pass 1: Checking inodes\nawait go\n");
        fs::remove(tools / "go");
        ::setenv("FIXWELL_TOOL_PATH", tools.c_str(), 1);
        const std::string image = openImage(name);
        button("verifyDiskButton").press();
        ASSERT_TRUE(waitUntil([&] { return logHolds("Verifying"); }));
        const bool isReplaced = name == "replaced";
        if (isReplaced)
            fs::rename(makeImage("other"), image);
        else
            fs::remove(image);
        orvane::test::write(tools / "go", "");
        ASSERT_TRUE(waitForJob());
        EXPECT_TRUE(waitUntil([&] { return verdict(image) == (isReplaced ? "" : "failed"); }))
            << name << ": " << verdict(image) << "; the other was never checked";
        EXPECT_TRUE(waitUntil([&] {
            return isReplaced ? logRows().empty() : logHolds("replaced");
        })) << testing::PrintToString(logRows());
        const std::string alert = takeSheet();
        EXPECT_NE(alert.find("changed while it was being checked"), std::string::npos) << alert;
        close();
    }
}

// A check that did not take place must not look like one that had nothing to say.
TEST_F(JobFaultTest, AnImageThatNoToolGotToSeeIsSaid)
{
    const std::string why = "No such file or directory";
    const std::string image = makeImage("gone");
    const std::string other = makeImage("other");
    open({image, other});
    window().disks().setFocus();
    command("selectAll").trigger();
    fs::remove(image);
    run("verifyDiskButton");
    ASSERT_TRUE(waitUntil([&] { return sheet() != nullptr; }));
    const std::string alert = takeSheet();
    EXPECT_NE(alert.find(why), std::string::npos) << alert;
    EXPECT_EQ(verdict(image), "failed");
    EXPECT_EQ(verdict(other), "sound");
    select(image);
    EXPECT_TRUE(logHolds(why)) << testing::PrintToString(logRows());
}

TEST_F(JobFaultTest, AnImageThatChangedSinceItWasOpenedIsReadAgain)
{
    const std::string image = openImage("first");
    run("verifyDiskButton", image);
    fs::rename(makeDamagedImage("second"), image);
    run("verifyDiskButton");
    EXPECT_EQ(verdict(image), "damaged");
    EXPECT_TRUE(waitUntil([this] {
        return window().banner().summary().details.find("“second”") != std::string::npos;
    }));
    EXPECT_EQ(cell(image, DiskColumn::Name), "second (first.img)");
    EXPECT_TRUE(logHolds("needs to be repaired")) << testing::PrintToString(logRows());
    EXPECT_FALSE(logHolds("appears to be OK")) << "that was another volume";

    fs::rename(makePartitionedImage("parts"), image);
    command("rescan").trigger();
    EXPECT_TRUE(waitUntil([&] { return cell(image + "#1", DiskColumn::Format) == "ext4"; }));
}

// As on a network that has gone: the file may never answer.
TEST_F(JobFaultTest, ASlowImageHoldsNoOtherJobUpAndItsOwnCanBeStopped)
{
    const std::string quick = makeImage("quick");
    const std::string slow = makeImage("slow");
    open({quick, slow});
    const auto answers = std::make_shared<std::promise<void>>();
    session().host().imageAttachment().setReader(
        [slow, answered = answers->get_future().share()](const fs::path& image) {
            if (image == slow)
                answered.wait();
            return ImageReading::readNow(image);
        });
    select(slow);  // has it read again
    run("verifyDiskButton", quick);
    EXPECT_EQ(verdict(quick), "sound");

    window().disks().selectAll();
    button("verifyDiskButton").press();
    EXPECT_EQ(button("verifyDiskButton").title(), "Stop Verify");
    run("verifyDiskButton");
    QTest::qWait(100);
    EXPECT_EQ(sheet(), nullptr) << takeSheet();
    EXPECT_EQ(verdict(slow), "");
    EXPECT_TRUE(button("verifyDiskButton").isEnabled());
    answers->set_value();
}

}  // namespace
}  // namespace orvane::desktop::test
