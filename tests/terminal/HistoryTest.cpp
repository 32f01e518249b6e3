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
            found.push_back(one["action"].get<std::string>() + " " +
                            one["verdict"].get<std::string>());
        return found;
    }
};

TEST_F(HistoryCommandTest, RunsOutliveTheProgramUntilTheyAreCleared)
{
    makeDamagedVolume("a");
    makeVolume("b");
    for (const char* const command : {"verify", "repair", "verify"})
        static_cast<void>(run({command, "a"}));
    const std::vector<std::string> expected{"verify damaged", "repair repaired", "verify sound"};
    EXPECT_EQ(verdicts("a"), expected);
    EXPECT_NE(run({"history", "b"}).output.find("never checked"), std::string::npos);

    const std::string shown = run({"history", "a"}).output;
    const std::size_t damage = shown.find("needs to be repaired.");
    const std::size_t repair = shown.find("was repaired successfully.");
    const std::size_t good = shown.find("appears to be OK.");
    EXPECT_LT(damage, repair) << shown;
    EXPECT_LT(repair, good) << shown;
    EXPECT_NE(good, std::string::npos) << shown;

    static_cast<void>(run({"verify", "b"}));
    for (int times = 0; times < 2; ++times)
        EXPECT_EQ(run({"history", "--clear", "a"}).status, 0) << "there may be nothing to clear";
    EXPECT_EQ(run({"history", "--json", "a"}).output, "");
    EXPECT_NE(run({"history", "a"}).output.find("never checked"), std::string::npos);
    EXPECT_EQ(verdicts("b").size(), 1U) << "each image has its own";
}

TEST_F(HistoryCommandTest, HistoryTellsTheRecordsAsTheyWereSeen)
{
    makeDamagedVolume("image");
    const Events seen(run({"verify", "--details", "--json", "image"}).output);
    const Events kept(run({"history", "--details", "--json", "image"}).output);
    EXPECT_EQ(kept.named("record"), seen.named("record"));
    ASSERT_EQ(kept.count("run"), 1U);
    const nlohmann::json one = kept.named("run").front();
    EXPECT_EQ(one["disk"], "image");
    EXPECT_EQ(one["message"], seen.named("finished").front()["message"]);
}

TEST_F(HistoryCommandTest, AStateDirectoryThatCannotBeUsedIsSaidAndTheCheckGoesOn)
{
    makeVolume("image");
    write(path("state"), "a file, where a directory should be");
    const RunResult result = run({"verify", "image"});
    EXPECT_EQ(result.status, 0) << result.errors;
    EXPECT_NE(result.output.find("appears to be OK."), std::string::npos) << result.output;
    EXPECT_NE(result.errors.find("history"), std::string::npos) << result.errors;
}

}  // namespace
}  // namespace orvane::test
