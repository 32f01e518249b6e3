// SPDX-License-Identifier: Apache-2.0
#include "orvane/terminal/CommandLine.h"
#include "orvane/terminal/Reporter.h"

#include <gtest/gtest.h>

namespace orvane {
namespace {

pellar::Result<Request, Ending> readWords(std::vector<const char*> words)
{
    words.insert(words.begin(), "fixwell");
    return readCommandLine(static_cast<int>(words.size()), words.data());
}

TEST(CommandLine, WordsBecomeARequest)
{
    const auto read = readWords({"--color", "never", "repair", "a", "--details", "LABEL=x y",
                                 "--yes", "--log-level=2", "--no-progress", "--trace"});
    ASSERT_TRUE(read);
    const Request& request = *read;
    EXPECT_EQ(request.command, Command::Repair);
    EXPECT_EQ(request.disks, (std::vector<std::string>{"a", "LABEL=x y"}));
    EXPECT_EQ(request.coloring, Coloring::Never);
    EXPECT_EQ(request.showsDetails, true);
    EXPECT_TRUE(request.confirms);
    EXPECT_TRUE(request.tracesCommands);
    EXPECT_FALSE(request.showsProgress);
    EXPECT_FALSE(request.isJSON);
    EXPECT_EQ(request.logLevel, 2);
}

TEST(CommandLine, EachCommandIsItself)
{
    struct Case {
        std::vector<const char*> words;
        Command command;
        std::size_t disks;
    };
    for (const Case& c :
         {Case{{"verify", "a"}, Command::Verify, 1},
          Case{{"verify", "a", "b", "c"}, Command::Verify, 3},
          Case{{"verify", "--", "--json"}, Command::Verify, 1},
          Case{{"repair", "a"}, Command::Repair, 1},
          Case{{"verify-permissions", "/"}, Command::VerifyPermissions, 1},
          Case{{"repair-permissions", "/"}, Command::RepairPermissions, 1},
          Case{{"list"}, Command::List, 0}, Case{{"list", "a"}, Command::List, 1},
          Case{{"history", "a"}, Command::History, 1}, Case{{"mount", "a", "b"}, Command::Mount, 2},
          Case{{"unmount", "a"}, Command::Unmount, 1}, Case{{"eject", "a"}, Command::Eject, 1},
          Case{{"attach", "--read-only", "a"}, Command::Attach, 1},
          Case{{"detach", "a"}, Command::Detach, 1}}) {
        const auto read = readWords(c.words);
        ASSERT_TRUE(read) << c.words.front();
        EXPECT_EQ(read->command, c.command) << c.words.front();
        EXPECT_EQ(read->disks.size(), c.disks) << c.words.front();
        EXPECT_FALSE(read->confirms) << "only on demand";
    }
}

TEST(CommandLine, WhatIsNotUnderstoodIsWrongUsage)
{
    struct Case {
        std::vector<const char*> words;
        std::string_view because;
    };
    for (const Case& c :
         {Case{{}, "no command"}, Case{{"check", "a"}, "no such command"},
          Case{{"verify"}, "what?"}, Case{{"history", "--clear"}, "whose?"},
          Case{{"verify", "--clear", "a"}, "only a history is cleared"}, Case{{"attach"}, "what?"},
          Case{{"mount", "--read-only", "a"}, "only an image is attached so"},
          Case{{"verify", "--colour=never", "a"}, "no such option"},
          Case{{"verify", "--log-level=loud", "a"}, "no number"},
          Case{{"verify", "--log-level=-1", "a"}, "out of range"}}) {
        const auto read = readWords(c.words);
        ASSERT_FALSE(read) << c.because;
        EXPECT_EQ(read.error().status, 16) << c.because;
        EXPECT_FALSE(read.error().text.empty()) << c.because;
    }
    const auto help = readWords({"verify", "--help"});
    ASSERT_FALSE(help);
    EXPECT_EQ(help.error().status, 0);
}

TEST(GivenNames, APartGoesByTheNameOfItsImage)
{
    GivenNames names;
    names.add("/tmp/a.img", "a.img");
    names.add("/tmp/a.img#odd", "odd");
    names.add("/dev/sdb", "LABEL=x");
    struct Case {
        std::string_view identifier;
        std::string_view name;
        std::string_view because;
    };
    for (const Case& c :
         {Case{"/tmp/a.img", "a.img", "as named"}, Case{"/tmp/a.img#0", "a.img", "fills the image"},
          Case{"/tmp/a.img#2", "a.img#2", "a volume"},
          Case{"/tmp/a.img#12", "a.img#12", "two digits"},
          Case{"/tmp/a.img#odd", "odd", "a file of its own"},
          Case{"/tmp/a.img#odd#1", "odd#1", "inside that file"},
          Case{"/tmp/a.img2", "/tmp/a.img2", "another file"},
          Case{"/dev/sdb", "LABEL=x", "a device"},
          Case{"/dev/sdb1", "/dev/sdb1", "nobody named it"}, Case{"/tmp/b", "/tmp/b", "unknown"}})
        EXPECT_EQ(names.nameOf(c.identifier), c.name) << c.because;
}

TEST(GivenNames, OnlyANumberLiesInside)
{
    struct Case {
        std::string_view identifier;
        std::string_view named;
        bool isWithin;
    };
    for (const Case& c :
         {Case{"/a", "/a", true}, Case{"/a#0", "/a", true}, Case{"/a#17", "/a", true},
          Case{"/a#", "/a", false}, Case{"/a#1x", "/a", false}, Case{"/a#1#2", "/a", false},
          Case{"/ab", "/a", false}, Case{"/a", "/a#1", false}})
        EXPECT_EQ(GivenNames::isWithin(c.identifier, c.named), c.isWithin)
            << c.identifier << " in " << c.named;
}

}  // namespace
}  // namespace orvane
