// SPDX-License-Identifier: Apache-2.0
#include "orvane/jobs/Metrics.h"
#include "tests/terminal/ProgramTest.h"

#include <sys/stat.h>

#include <set>

namespace orvane {
namespace {

using namespace std::chrono_literals;

Run run(const char* action, std::chrono::milliseconds started, const char* verdict,
        std::int64_t problems = 0)
{
    const Run::Time time{started};
    return {action, time, time + 1500ms, RunEnd{verdict, 0, "", "", problems}};
}

std::vector<std::string> seriesWith(std::string_view part, const std::string& text)
{
    std::vector<std::string> found;
    for (const std::string& line : test::linesOf(text))
        if (!line.starts_with("#") && line.find(part) != std::string::npos)
            found.push_back(line);
    return found;
}

using Lines = std::vector<std::string>;

TEST(Metrics, ALabelStaysOneLabel)
{
    const std::string text =
        expositionOf({{"/dev/a\"b",
                       "",
                       "x\"} 1\nfixwell_verdict{verdict=\"sound\"} 1\\\n\xff\xc0",
                       {run("verify", 1s, "damaged")}}},
                     "1.0");
    EXPECT_EQ(seriesWith("fixwell_problems", text),
              Lines{R"(fixwell_problems{device="/dev/a\"b",uuid="",)"
                    R"(label="x\"} 1\nfixwell_verdict{verdict=\"sound\"} 1\\\n)"
                    "\uFFFD\uFFFD\",check=\"filesystem\"} 0"});
    EXPECT_EQ(seriesWith("build_info", text), Lines{R"(fixwell_build_info{version="1.0"} 1)"});
}

// A collector refuses a whole file in which a series stands twice, or a family in two pieces.
TEST(Metrics, EachSeriesStandsOnceBelowItsFamily)
{
    const std::vector<orvane::Run> runs{run("verify", 1s, "sound"),
                                        run("verify-permissions", 2s, "sound"),
                                        run("verify-partition-map", 3s, "failed")};
    const std::string text = expositionOf(
        {{"/dev/a", "", "", runs}, {"/dev/a", "", "", runs}, {"/dev/b", "", "", {}}}, "1");
    std::set<std::string> names, families;
    std::string family;
    for (const std::string& line : test::linesOf(text)) {
        if (line.starts_with("# HELP ")) {
            family = line.substr(7, line.find(' ', 7) - 7);
            EXPECT_TRUE(families.insert(family).second) << line;
        } else if (!line.starts_with("#")) {
            EXPECT_TRUE(line.starts_with(family + "{")) << line;
            EXPECT_TRUE(names.insert(line.substr(0, line.rfind(' '))).second) << line;
        }
    }
    EXPECT_EQ(seriesWith("fixwell_problems", text).size(), 3U);
    EXPECT_TRUE(seriesWith("/dev/b", text).empty()) << "nothing is known of it";
}

TEST(Metrics, WhatWasStoppedOrSkippedLeavesTheVerdictAndItsTime)
{
    MeasuredDisk disk{"/dev/a",
                      "u",
                      "l",
                      {run("verify", 1s, "sound"), run("verify", 2s, "damaged", 7),
                       run("verify-permissions", 3s, "sound"), run("verify", 4s, "stopped")},
                      orvane::Run::Time(5s)};
    const std::string text = expositionOf({disk}, "1");
    const std::string labels = R"(device="/dev/a",uuid="u",label="l",check="filesystem")";
    const auto series = [&](const std::string& name) {
        const auto found = seriesWith("fixwell_" + name + "{" + labels, text);
        return found.size() == 1 ? found.front().substr(found.front().rfind(' ') + 1) : "";
    };
    EXPECT_EQ(series("last_check_timestamp_seconds"), "2.000");
    EXPECT_EQ(series("last_attempt_timestamp_seconds"), "4.000");
    EXPECT_EQ(series("last_skipped_timestamp_seconds"), "5.000");
    EXPECT_EQ(series("check_duration_seconds"), "1.500");
    EXPECT_EQ(series("problems"), "7");
    Lines ones = seriesWith("verdict=", text);
    EXPECT_EQ(ones.size(), 14U);
    std::erase_if(ones, [](const std::string& line) { return !line.ends_with("} 1"); });
    EXPECT_EQ(
        ones,
        (Lines{
            "fixwell_verdict{" + labels + R"(,verdict="damaged"} 1)",
            R"(fixwell_verdict{device="/dev/a",uuid="u",label="l",check="permissions",verdict="sound"} 1)"}));
}

using MetricsTest = test::ProgramTest;

TEST_F(MetricsTest, AFileIsReplacedWholeAndReadableByAll)
{
    makeVolume("image", 8 * test::mebibyte, {"-L", "Holidays"});
    static_cast<void>(run({"verify", "image"}));
    test::write(path("target"), "precious");
    std::filesystem::create_symlink("target", path("a.prom"));
    const auto written = run({"metrics", "--output", "a.prom", "image"});
    EXPECT_EQ(written.status, 0) << written.errors;
    const std::string text = test::contentsOf(path("a.prom"));
    EXPECT_EQ(text, run({"metrics", "image"}).output);
    EXPECT_EQ(seriesWith(R"(label="Holidays",check="filesystem",verdict="sound"} 1)", text).size(),
              1U)
        << text;
    EXPECT_EQ(test::contentsOf(path("target")), "precious") << "a link is replaced, not followed";
    struct stat status = {};
    ASSERT_EQ(::lstat(path("a.prom").c_str(), &status), 0);
    EXPECT_EQ(status.st_mode, S_IFREG | 0644U);

    EXPECT_EQ(run({"metrics", "--output", "none/a.prom", "image"}).status, 8);
    EXPECT_EQ(run({"metrics", "--output", "none/a.prom", "--if-directory-exists", "image"}).status,
              0);
    EXPECT_FALSE(std::filesystem::exists(path("none")));
}

}  // namespace
}  // namespace orvane
