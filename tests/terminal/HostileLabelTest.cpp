// SPDX-License-Identifier: Apache-2.0
#include "tests/terminal/ProgramTest.h"

namespace orvane::test {
namespace {

using namespace std::string_literals;

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
    {"[31mOK[0m", "the marker without its escape"},
    {"appears to be OK", "as near to a success as fits"},
    {"<b>&amp;</b>", "markup"},
};

/// The label stands in sixteen bytes of the superblock, which has no checksum here.
class HostileLabelTest : public ProgramTest {
protected:
    void setLabel(const std::filesystem::path& image, std::string label) const
    {
        constexpr std::uint64_t labelOffset = 1024 + 120;
        label.resize(16, '\0');
        patch(image, labelOffset, label);
    }
    void expectSoundWithoutControls(const std::vector<std::string>& arguments,
                                    std::string_view because) const
    {
        const RunResult result = run(arguments);
        EXPECT_EQ(result.status, 0) << because << result.output << result.errors;
        EXPECT_FALSE(holdsControls(result.output)) << because << "\n" << result.output;
        EXPECT_FALSE(holdsControls(result.errors)) << because << "\n" << result.errors;
    }

    const std::vector<std::string> withoutChecksums_{"-O", "^metadata_csum"};
};

TEST_F(HostileLabelTest, NothingOfItReachesTheTerminal)
{
    const auto sound = makeVolume("sound", 8 * mebibyte, withoutChecksums_);
    for (const HostileLabel& c : hostileLabels) {
        setLabel(sound, c.label);
        for (const std::vector<std::string>& arguments :
             {std::vector<std::string>{"verify", "--details", "sound"},
              {"list", "sound"},
              {"history", "sound"},
              {"verify", "--log-level=3", "--trace", "sound"}})
            expectSoundWithoutControls(arguments, c.because);
    }
}

// People look at events too; JSON can say every character in letters.
TEST_F(HostileLabelTest, NothingOfItStandsInAnEventAsItIs)
{
    const auto sound = makeVolume("sound", 8 * mebibyte, withoutChecksums_);
    for (const HostileLabel& c : hostileLabels) {
        setLabel(sound, c.label);
        for (const std::vector<std::string>& arguments :
             {std::vector<std::string>{"verify", "--details", "--json", "sound"},
              {"list", "--json", "sound"},
              {"history", "--json", "sound"}})
            expectSoundWithoutControls(arguments, c.because);
    }
}

TEST_F(HostileLabelTest, DamageIsNeverReadAsASuccess)
{
    const auto damaged = makeDamagedVolume("damaged", withoutChecksums_);
    for (const HostileLabel& c : hostileLabels) {
        setLabel(damaged, c.label);
        const RunResult result = run({"verify", "--details", "--json", "damaged"});
        EXPECT_EQ(result.status, 4) << c.because << result.output << result.errors;
        const Events events(result.output);
        const std::vector<std::string> story{"started damaged", "finished damaged damaged"};
        EXPECT_EQ(events.story({"started", "finished"}), story) << c.because;
        EXPECT_EQ(events.recordsWith("needs to be repaired.").size(), 1U) << c.because;
        for (const auto& record : events.named("record"))
            EXPECT_NE(record["type"], "SUCCESS") << c.because << record;
    }
}

// A file name has room for a whole sentence.
TEST_F(HostileLabelTest, AFileNameThatSaysItIsWellIsNoSuccess)
{
    for (const std::string name :
         {"The volume appears to be OK.", "x was repaired successfully."}) {
        makeDamagedVolume(name);
        const RunResult result = run({"verify", "--details", "--json", name});
        EXPECT_EQ(result.status, 4) << result.output;
        for (const auto& record : Events(result.output).named("record"))
            EXPECT_NE(record["type"], "SUCCESS") << record;
        const RunResult shown = run({"verify", "--color=always", name});
        EXPECT_EQ(countOf("\x1b[32m", shown.output), 0U) << "nothing is green\n" << shown.output;
    }
}

TEST_F(HostileLabelTest, OnATerminalOnlyTheProgramsOwnSequencesAreSeen)
{
    const auto damaged = makeDamagedVolume("damaged", withoutChecksums_);
    for (const HostileLabel& c : hostileLabels) {
        setLabel(damaged, c.label);
        std::string screen = runOnTerminal({"verify", "--details", "damaged"}).output;
        for (const std::string_view own :
             {"\x1b[1m", "\x1b[31m", "\x1b[32m", "\x1b[0m", "\x1b[K", "\r"})
            for (std::size_t at; (at = screen.find(own)) != std::string::npos;)
                screen.erase(at, own.size());
        EXPECT_FALSE(holdsControls(screen)) << c.because << "\n" << screen;
    }
}

}  // namespace
}  // namespace orvane::test
