// SPDX-License-Identifier: Apache-2.0
#include "tests/desktop/OtherWindow.h"
#include "tests/desktop/WindowFixture.h"

#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

namespace orvane::desktop::test {
namespace {

class TwoWindowsTest : public WindowFixture {
protected:
    /// Verifies the image in a process of its own.
    pid_t startOtherWindow(const std::string& image, int times)
    {
        std::string program = "/proc/self/exe";
        std::string option(otherWindow);
        std::string directory = directory_.path;
        std::string name = image;
        std::string count = std::to_string(times);
        char* words[] = {program.data(), option.data(), directory.data(),
                         name.data(),    count.data(),  nullptr};
        pid_t child = 0;
        EXPECT_EQ(::posix_spawn(&child, program.c_str(), nullptr, nullptr, words, environ), 0);
        return child;
    }

    void verify(const std::string& image)
    {
        select(image);
        button("verifyDiskButton").press();
        ASSERT_TRUE(waitForJob());
    }

    HistoryStore& store() { return session().host().historyStore(); }
    std::string keyOf(const std::string& image)
    {
        const auto contents = session().host().sharedDiskController().find([&](const Disk& disk) {
            return disk.facts().path == image && !disk.isOfflineDiskImage();
        });
        return session().host().histories().keyOf(contents->facts());
    }
};

TEST_F(TwoWindowsTest, NeitherLosesARecordOfTheOther)
{
    constexpr int times = 5;
    const std::string ours = makeImage("ours");
    const std::string theirs = makeImage("theirs");
    const std::string shared = makeImage("shared");
    open({ours, theirs, shared});
    verify(ours);
    session().host().histories().saveNew();
    const std::int64_t rowsOfOne = store().recordsOf(keyOf(ours)).size();
    ASSERT_GT(rowsOfOne, 0);

    const pid_t children[] = {startOtherWindow(theirs, times), startOtherWindow(shared, times)};
    for (int i = 0; i < times; ++i) {
        verify(ours);
        verify(shared);
    }
    for (const pid_t child : children) {
        int status = 0;
        ASSERT_EQ(::waitpid(child, &status, 0), child);
        EXPECT_TRUE(WIFEXITED(status) && WEXITSTATUS(status) == 0) << status;
    }

    session().host().histories().saveNew();

    struct Case {
        std::string image;
        std::size_t runs;
        std::string_view because;
    };
    for (const Case& c : {Case{ours, times + 1, "checked here"}, Case{theirs, times, "there"},
                          Case{shared, 2 * times, "in both at once"}}) {
        const auto runs = store().runs(keyOf(c.image));
        EXPECT_EQ(runs.size(), c.runs) << c.because;
        for (const orvane::Run& run : runs)
            EXPECT_EQ(run.end ? run.end->verdict : "cut off", "sound") << c.because;
        EXPECT_EQ(store().recordsOf(keyOf(c.image)).size(),
                  static_cast<std::int64_t>(c.runs) * rowsOfOne)
            << c.because;
    }
    EXPECT_EQ(sheet(), nullptr) << "nobody was warned";
}

}  // namespace
}  // namespace orvane::desktop::test
