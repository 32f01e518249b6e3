// SPDX-License-Identifier: Apache-2.0
#include "tests/terminal/ProgramTest.h"

namespace orvane::test {
namespace {

class HistoryCommandTest : public ProgramTest {
protected:
    std::vector<std::string> verdicts(const std::string& image) const
    {
        std::vector<std::string> found;
        for (const auto& one : Events(run({"history", "--json", image}).output).named("run"))
            found.push_back(one["verdict"]);
        return found;
    }
};

TEST_F(HistoryCommandTest, RunsOutliveTheProgramUntilTheyAreCleared)
{
    makeDamagedVolume("a");
    makeVolume("b");
    for (const char* const command : {"verify", "repair", "verify"})
        static_cast<void>(run({command, "a"}));
    EXPECT_EQ(verdicts("a"), (std::vector<std::string>{"damaged", "repaired", "sound"}));
    EXPECT_NE(run({"history", "b"}).output.find("never checked"), std::string::npos);

    static_cast<void>(run({"verify", "b"}));
    for (int times = 0; times < 2; ++times)
        EXPECT_EQ(run({"history", "--clear", "a"}).status, 0) << "there may be nothing to clear";
    EXPECT_TRUE(verdicts("a").empty());
    EXPECT_EQ(verdicts("b").size(), 1U) << "each image has its own";
}

}  // namespace
}  // namespace orvane::test
