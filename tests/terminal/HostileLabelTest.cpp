// SPDX-License-Identifier: Apache-2.0
#include "tests/terminal/ProgramTest.h"

namespace orvane::test {
namespace {

/// Each of at most 16 bytes, and what it does.
const std::vector<std::pair<std::string, std::string_view>> hostileLabels{
    {"\x1b[2J\x1b]0;x\x07", "clears the screen and sets the title"},
    {"%@ %s %n %1$@ %d", "conversions"},
    {"a\nb\r\nc", "line ends"},
    {"\xff\xfe\xc0\x80 x", "no UTF-8"},
    {"\xc2\x9b"
     "31mred",
     "an eight-bit control sequence"},
    {"\xe2\x80\xaegnp.exe", "turns the direction"},
    {"\x1b[31mred\x1b[0m", "the marker of an error"},
    {"appears to be OK", "as near to a success as fits"},
};

using HostileLabelTest = ProgramTest;

// People look at events too; JSON can say every character in letters.
TEST_F(HostileLabelTest, NothingOfItReachesTheTerminalOrPassesForASuccess)
{
    const auto image = makeDamagedVolume("image", {"-O", "^metadata_csum"});
    for (const auto& [label, because] : hostileLabels) {
        // In sixteen bytes of the superblock, which has no checksum here.
        patch(image, 1024 + 120, label + std::string(16 - label.size(), '\0'));
        const RunResult result = run({"verify", "--details", "--json", "image"});
        EXPECT_EQ(result.status, 4) << because << result.output << result.errors;
        EXPECT_FALSE(holdsControls(result.output)) << because << result.output;
        const Events events(result.output);
        EXPECT_EQ(events.recordsWith("needs to be repaired.").size(), 1U) << because;
        for (const auto& record : events.named("record"))
            EXPECT_NE(record["type"], "SUCCESS") << because << record;
        for (const std::vector<std::string>& arguments :
             {std::vector<std::string>{"verify", "--details", "--log-level=3", "--trace", "image"},
              {"list", "image"},
              {"list", "--json", "image"},
              {"history", "image"},
              {"history", "--json", "image"}}) {
            const RunResult other = run(arguments);
            EXPECT_FALSE(holdsControls(other.output)) << because << "\n" << other.output;
            EXPECT_FALSE(holdsControls(other.errors)) << because << "\n" << other.errors;
        }
        std::string screen = runOnTerminal({"verify", "--details", "image"}).output;
        for (const std::string_view own :
             {"\x1b[1m", "\x1b[31m", "\x1b[32m", "\x1b[0m", "\x1b[K", "\r"})
            for (std::size_t at; (at = screen.find(own)) != std::string::npos;)
                screen.erase(at, own.size());
        EXPECT_FALSE(holdsControls(screen)) << because << "\n" << screen;
    }
}

}  // namespace
}  // namespace orvane::test
