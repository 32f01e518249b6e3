// SPDX-License-Identifier: Apache-2.0
#include "orvane/terminal/CommandLine.h"
#include "orvane/terminal/Completion.h"
#include "tests/terminal/ProgramTest.h"

#include <poll.h>
#include <pty.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <csignal>

namespace orvane {
namespace {

namespace fs = std::filesystem;

/// Labels that a shell would do something with, or a terminal.
const std::vector<std::string> hostileLabels{"My Photos",
                                             "it's \"odd\"",
                                             "$(touch pwned)",
                                             "`touch pwned`",
                                             "a;touch pwned&",
                                             "x|touch pwned",
                                             "line\nend",
                                             "tab\there",
                                             "!!",
                                             "!touch",
                                             "back\\slash\\",
                                             "~",
                                             "日本 ディスク",
                                             "\x1b[2J\x07",
                                             "*",
                                             "-x",
                                             "#c",
                                             "\xff\xfe 1",
                                             "${HOME}",
                                             "a=b:c",
                                             "{a,b}",
                                             ">pwned",
                                             "\xe2\x80\xaegnp",
                                             "'",
                                             "\"",
                                             "''\"\"$'\\n'",
                                             "end "};

DiskFacts volume(const std::string& path, const std::string& label, const std::string& uuid = {})
{
    DiskFacts facts;
    facts.path = path;
    facts.label = label;
    facts.uuid = uuid;
    facts.filesystem = "ext4";
    facts.length = 8 << 20;
    return facts;
}

CompletionSources sourcesWith(std::vector<DiskTree> disks)
{
    return {commandTree({}), [disks] { return disks; },
            [] {
                return std::vector<Candidate>{{"verdicts", "What the answers mean"}};
            }};
}

std::vector<std::string> valuesOf(const Offer& offer)
{
    std::vector<std::string> values;
    for (const Candidate& candidate : offer.candidates)
        values.push_back(candidate.value);
    return values;
}

TEST(Completion, WhatIsOfferedGoesByWhatIsThere)
{
    DiskFacts mounted = volume("/dev/sdb1", "Photos", "1-2");
    mounted.mountPoint = "/mnt/photos";
    const CompletionSources sources =
        sourcesWith({{volume("/dev/sdb", ""), {{mounted, {}}, {volume("/dev/sdb2", "two"), {}}}},
                     {volume("/dev/sdc", "two"), {}}});
    using Words = std::vector<std::string>;
    struct Case {
        Words words;
        Words has;
        Words hasNot;
        bool takesFiles;
        std::string_view because;
    };
    for (const Case& c :
         {Case{{""}, {"verify", "help", "list"}, {"--json", "/dev/sdb"}, false, "a command"},
          Case{{"--color", "never", ""}, {"verify"}, {"never"}, false, "an option came before"},
          Case{{"--color", ""}, {"auto", "always", "never"}, {"verify"}, false, "its value"},
          Case{{"--color=a"}, {"--color=auto"}, {"auto"}, false, "the same in one word"},
          Case{{"verify", "--"},
               {"--thorough", "--json"},
               {"--preview", "verify"},
               false,
               "options"},
          Case{{"verify", "--", "-"}, {"/dev/sdb1"}, {"--json"}, true, "no options any more"},
          Case{{"repair", "--preview", "--keep", ""}, {}, {"/dev/sdb1", "--keep"}, true, "a file"},
          Case{{"verify", "/dev/sdb1", ""},
               {"/dev/sdb", "/dev/sdb2", "/dev/sdc", "LABEL=Photos", "/mnt/photos"},
               {"LABEL=two", "UUID=1-2", "LABEL="},
               true,
               "disks; not what two of them are called"},
          Case{{"mount", "U"}, {"UUID=1-2"}, {}, true, "asked for"},
          Case{{"attach", ""}, {}, {"/dev/sdb"}, true, "images alone"},
          Case{{"help", ""}, {"verify", "verdicts"}, {"/dev/sdb"}, false, "topics"},
          Case{{"help", "verify", ""}, {}, {"verdicts"}, false, "one is enough"},
          Case{{"no-such-command", ""}, {"verify"}, {"/dev/sdb"}, false, "still none"}}) {
        const Offer offer = offerFor(c.words, sources);
        const Words values = valuesOf(offer);
        for (const std::string& value : c.has)
            EXPECT_EQ(std::count(values.begin(), values.end(), value), 1)
                << value << ": " << c.because;
        for (const std::string& value : c.hasNot)
            EXPECT_EQ(std::count(values.begin(), values.end(), value), 0)
                << value << ": " << c.because;
        EXPECT_EQ(offer.takesFiles, c.takesFiles) << c.because;
    }
}

// Every text in every quoting is read back as it was, and shows nothing that a terminal obeys.
TEST(Completion, WhatIsWrittenForBashIsReadBackTheSame)
{
    using Quote = ShellLine::Quote;
    for (const std::string& label : hostileLabels) {
        const std::string& text = label;
        for (const auto& [opening, quote, closing] : {std::tuple{"", Quote::None, ""},
                                                      {"'", Quote::Single, "'"},
                                                      {"\"", Quote::Double, "\""}}) {
            const std::string written = bashText(text, quote);
            EXPECT_FALSE(test::holdsControls(written)) << written;
            const auto echoed =
                test::runTool({"bash", "-c", "printf %s " + (opening + written + closing)});
            EXPECT_EQ(echoed.output, text) << written;
            const ShellLine line = readShellLine("fixwell verify " + (opening + written));
            const bool isPlain = written.find("$'") == std::string::npos;
            EXPECT_EQ(line.words.size(), 3U) << written;
            if (isPlain) {
                EXPECT_EQ(line.words.back(), text) << written;
            }
        }
    }
}

/// An interactive bash on a terminal, with the completions, and a command `fixwell` that keeps the
/// words that it is given.
class BashCompletionTest : public ::testing::Test {
protected:
    void SetUp() override
    {
        if (test::runTool({"bash", "--version"}).status != 0)
            GTEST_SKIP() << "bash is not installed";
        fs::create_directories(directory_ / "home");
        test::write(directory_ / "start",
                    "cd home; PS1='ready> '; HISTFILE=; bind 'set enable-bracketed-paste off'\n"
                    "source " COMPLETIONS
                    "/fixwell.bash\n"
                    "fixwell() { printf '%s\\0' \"$@\" >\"$OUT\"; }\n");
    }

    /// The disks are one, whose volume has this label.
    void setLabel(const std::string& label) const
    {
        const fs::path disk = directory_ / "sys/block/sda";
        for (const auto& [device, number] : {std::pair{disk, "8:0"}, {disk / "sda1", "8:1"}}) {
            test::write(device / "size", "16384\n");
            test::write(device / "dev", number + std::string("\n"));
        }
        test::write(disk / "sda1/partition", "1\n");
        std::string encoded;
        constexpr std::string_view digits = "0123456789abcdef";
        for (const unsigned char byte : label)
            encoded += {'\\', 'x', digits[byte / 16], digits[byte % 16]};
        test::write(directory_ / "udev/b8:1",
                    "E:ID_FS_USAGE=filesystem\nE:ID_FS_TYPE=ext4\n"
                    "E:ID_FS_UUID=12-34\nE:ID_FS_LABEL_ENC=" +
                        encoded + "\n");
    }

    /// The words that came of each line that was typed and sent off, without the program's name.
    std::vector<std::vector<std::string>> typed(const std::vector<std::string>& lines)
    {
        std::vector<std::vector<std::string>> all(lines.size());
        int terminal = -1;
        const pid_t id = ::forkpty(&terminal, nullptr, nullptr, nullptr);
        if (id == 0)
            becomeBash();
        screen_.clear();
        for (std::size_t i = 0; i < lines.size(); ++i) {
            fs::remove(out());
            const std::string keys = lines[i] + "\n";
            if (!waitForPrompt(terminal) || ::write(terminal, keys.data(), keys.size()) < 0 ||
                !waitForPrompt(terminal) || ::write(terminal, "\n", 1) < 0) {
                ADD_FAILURE() << "there is no prompt any more: " << lines[i] << "\n" << screen_;
                break;
            }
            all[i] = wordsIn(test::contentsOf(out()));
        }
        ::kill(id, SIGKILL);
        ::waitpid(id, nullptr, 0);
        ::close(terminal);
        return all;
    }

    fs::path out() const { return directory_ / "out"; }
    fs::path home() const { return directory_ / "home"; }

    std::string screen_;  ///< all that came, since the last prompt that was waited for

private:
    [[noreturn]] void becomeBash() const
    {
        const std::string path = "PATH=" COMPLETION_PROGRAM_DIRECTORY ":/usr/bin:/bin";
        const std::string disks = "COMPLETION_DISKS=" + directory_.path().native();
        const std::string kept = "OUT=" + out().native();
        const std::string directory = "HOME=" + directory_.path().native();
        const std::string start = directory_ / "start";
        static_cast<void>(::chdir(directory_.path().c_str()));
        const std::array<const char*, 8> environment{
            path.c_str(), disks.c_str(),  kept.c_str(), directory.c_str(),
            "TERM=dumb",  "LANG=C.UTF-8", "HISTFILE=",  nullptr};
        const std::array<const char*, 6> arguments{"bash",        "--noprofile", "--rcfile",
                                                   start.c_str(), "-i",          nullptr};
        ::execve("/bin/bash", const_cast<char* const*>(arguments.data()),
                 const_cast<char* const*>(environment.data()));
        ::_exit(127);
    }

    bool waitForPrompt(int terminal)
    {
        std::string seen;
        for (;;) {
            pollfd polled{terminal, POLLIN, 0};
            std::array<char, 4096> bytes{};
            const bool hasMore = ::poll(&polled, 1, 10'000) > 0;
            const ssize_t length = hasMore ? ::read(terminal, bytes.data(), bytes.size()) : 0;
            if (length <= 0)
                return false;
            seen.append(bytes.data(), static_cast<std::size_t>(length));
            screen_ = seen;
            if (seen.ends_with("ready> "))
                return true;
        }
    }

    static std::vector<std::string> wordsIn(std::string_view text)
    {
        std::vector<std::string> words;
        while (!text.empty()) {
            const std::size_t end = std::min(text.find('\0'), text.size());
            words.emplace_back(text.substr(0, end));
            text.remove_prefix(std::min(end + 1, text.size()));
        }
        return words;
    }

    test::TestDirectory directory_;
};

using Words = std::vector<std::string>;

TEST_F(BashCompletionTest, AHostileLabelBecomesOneLiteralWord)
{
    for (const std::string& label : hostileLabels) {
        setLabel(label);
        const std::vector<std::string> openings{
            "LABEL=", "L", "\"LABEL=", "'LABEL=", "LABEL=\"", "LABEL='"};
        std::vector<std::string> lines;
        for (const std::string& opening : openings)
            lines.push_back("fixwell verify " + opening + "\t");
        const auto words = typed(lines);
        for (std::size_t i = 0; i < lines.size(); ++i)
            EXPECT_EQ(words[i], (Words{"verify", "LABEL=" + label})) << lines[i] << "\n" << screen_;
        EXPECT_TRUE(fs::is_empty(home())) << "something was run for " << label;
    }
}

TEST_F(BashCompletionTest, WordsOptionsAndFilesAreCompleted)
{
    setLabel("My Photos");
    test::write(home() / "my image.img", "x");
    test::write(home() / "sub dir/$(touch pwned).img", "x");
    struct Case {
        std::string typed;
        Words words;
    };
    const std::vector<Case> cases{
        {"fixwell und\t", {"undo"}},
        {"fixwell verify --thor\tLABEL=My\t", {"verify", "--thorough", "LABEL=My Photos"}},
        {"fixwell verify LABEL=My\\ \t--json", {"verify", "LABEL=My Photos", "--json"}},
        {"fixwell verify \"LABEL=My P\t", {"verify", "LABEL=My Photos"}},
        {"fixwell --color=ne\tlist", {"--color=never", "list"}},
        {"fixwell --color al\tlist", {"--color", "always", "list"}},
        {"fixwell verify U\t", {"verify", "UUID=12-34"}},
        {"fixwell verify my\t", {"verify", "my image.img"}},
        {"fixwell verify 'my\t", {"verify", "my image.img"}},
        {"fixwell verify sub\t\t", {"verify", "sub dir/$(touch pwned).img"}},
        {"fixwell verify ~/home/my\t", {"verify", (home() / "my image.img").native()}},
        {"fixwell repair --preview --keep my\tx",
         {"repair", "--preview", "--keep", "my image.img", "x"}},
        {"fixwell help verd\t", {"help", "verdicts"}},
        {"fixwell help my\t", {"help", "my"}}};
    std::vector<std::string> lines;
    for (const Case& c : cases)
        lines.push_back(c.typed);
    const auto words = typed(lines);
    for (std::size_t i = 0; i < cases.size(); ++i)
        EXPECT_EQ(words[i], cases[i].words) << cases[i].typed;
    EXPECT_FALSE(fs::exists(home() / "pwned"));
}

}  // namespace
}  // namespace orvane
