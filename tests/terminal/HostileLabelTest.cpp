// SPDX-License-Identifier: Apache-2.0
#include "tests/terminal/ProgramTest.h"

namespace orvane::test {
namespace {

struct HostileLabel {
    std::string label;  ///< at most 16 bytes
    std::string_view because;
};

const std::vector<HostileLabel> hostileLabels{
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

class HostileLabelTest : public ProgramTest {
protected:
    /// The label stands in sixteen bytes of the superblock, which has no checksum here.
    void setLabel(const std::filesystem::path& image, std::string label) const
    {
        constexpr std::uint64_t labelOffset = 1024 + 120;
        label.resize(16, '\0');
        patch(image, labelOffset, label);
    }

    /// No record calls it a success.
    static void expectDamage(const RunResult& result, std::string_view because)
    {
        EXPECT_EQ(result.status, 4) << because << result.output << result.errors;
        const Events events(result.output);
        EXPECT_EQ(events.recordsWith("needs to be repaired.").size(), 1U) << because;
        for (const auto& record : events.named("record"))
            EXPECT_NE(record["type"], "SUCCESS") << because << record;
    }
};

// People look at events too; JSON can say every character in letters.
TEST_F(HostileLabelTest, NothingOfItReachesTheTerminalOrPassesForASuccess)
{
    const auto image = makeDamagedVolume("image", {"-O", "^metadata_csum"});
    for (const HostileLabel& c : hostileLabels) {
        setLabel(image, c.label);
        expectDamage(run({"verify", "--details", "--json", "image"}), c.because);
        for (const std::vector<std::string>& arguments :
             {std::vector<std::string>{"verify", "--details", "--log-level=3", "--trace", "image"},
              {"verify", "--details", "--json", "image"},
              {"list", "image"},
              {"list", "--json", "image"},
              {"history", "image"},
              {"history", "--json", "image"}}) {
            const RunResult result = run(arguments);
            EXPECT_FALSE(holdsControls(result.output)) << c.because << "\n" << result.output;
            EXPECT_FALSE(holdsControls(result.errors)) << c.because << "\n" << result.errors;
        }
        std::string screen = runOnTerminal({"verify", "--details", "image"}).output;
        for (const std::string_view own :
             {"\x1b[1m", "\x1b[31m", "\x1b[32m", "\x1b[0m", "\x1b[K", "\r"})
            for (std::size_t at; (at = screen.find(own)) != std::string::npos;)
                screen.erase(at, own.size());
        EXPECT_FALSE(holdsControls(screen)) << c.because << "\n" << screen;
    }
}

// A file name has room for a whole sentence.
TEST_F(HostileLabelTest, AFileNameThatSaysItIsWellIsNoSuccess)
{
    for (const std::string name :
         {"The volume appears to be OK.", "x was repaired successfully."}) {
        makeDamagedVolume(name);
        expectDamage(run({"verify", "--details", "--json", name}), name);
        const RunResult shown = run({"verify", "--color=always", name});
        EXPECT_EQ(countOf("\x1b[32m", shown.output), 0U) << "nothing is green\n" << shown.output;
    }
}

}  // namespace
}  // namespace orvane::test
