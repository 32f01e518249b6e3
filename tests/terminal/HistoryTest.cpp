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

TEST_F(HistoryCommandTest, RunsAndRecordsOutliveTheProgram)
{
    makeDamagedVolume("a");
    makeVolume("b");
    for (const char* const command : {"verify", "repair", "verify"})
        static_cast<void>(run({command, "a"}));
    const std::vector<std::string> expected{"verify damaged", "repair repaired", "verify sound"};
    EXPECT_EQ(verdicts("a"), expected);
    EXPECT_EQ(verdicts("b"), std::vector<std::string>()) << "each image has its own";

    const std::string shown = run({"history", "a"}).output;
    const std::size_t damage = shown.find("needs to be repaired.");
    const std::size_t repair = shown.find("was repaired successfully.");
    const std::size_t good = shown.find("appears to be OK.");
    EXPECT_LT(damage, repair) << shown;
    EXPECT_LT(repair, good) << shown;
    EXPECT_NE(good, std::string::npos) << shown;
    EXPECT_NE(run({"history", "b"}).output.find("never checked"), std::string::npos);
}

TEST_F(HistoryCommandTest, ClearForgetsTheImageAndNoOther)
{
    makeVolume("a");
    makeVolume("b");
    static_cast<void>(run({"verify", "a", "b"}));
    EXPECT_EQ(run({"history", "--clear", "a"}).status, 0);
    const RunResult cleared = run({"history", "--json", "a"});
    EXPECT_EQ(cleared.output, "");
    EXPECT_NE(run({"history", "a"}).output.find("never checked"), std::string::npos);
    EXPECT_EQ(verdicts("b").size(), 1U);
    EXPECT_EQ(run({"history", "--clear", "a"}).status, 0) << "there is nothing to clear";
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

TEST_F(HistoryCommandTest, ADamagedDatabaseIsSaidAndTheCheckGoesOn)
{
    makeVolume("image");
    static_cast<void>(run({"verify", "image"}));
    write(path("state/orvane/history.sqlite3"), std::string(20'000, 'x'));
    const RunResult result = run({"verify", "image"});
    EXPECT_EQ(result.status, 0) << result.errors;
    EXPECT_NE(result.errors.find("history"), std::string::npos) << result.errors;
    EXPECT_EQ(verdicts("image"), std::vector<std::string>{"verify sound"}) << "a new one is begun";
}

}  // namespace
}  // namespace orvane::test
