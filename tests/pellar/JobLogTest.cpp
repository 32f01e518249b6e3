// SPDX-License-Identifier: Apache-2.0
#include "contract/foundation/Array.h"
#include "pellar/jobs/JobLog.h"
#include "pellar/jobs/ToolRun.h"
#include "tests/pellar/JobFixture.h"

#include <gtest/gtest.h>

#include <atomic>

namespace {

using namespace std::chrono_literals;
using namespace pellar;

struct QueueFixture {
    void waitUntilFull()
    {
        while (loop.waiting() < EventQueue::batchesUnderWay)
            std::this_thread::yield();
    }
    void deliver()
    {
        queue.flush();
        loop.drain();
    }

    test::TestLoop loop;
    test::Listener listener;
    EventQueue queue{loop, {&listener, {}, {}, [] {
                            }}};
};

struct LogFixture : QueueFixture {
    explicit LogFixture(const Texts& texts = english(), std::string name = "Disk")
        : log(*test::reference("/dev/sdz9", "ext4", std::move(name)), texts, queue)
    {
    }

    static const Texts& english()
    {
        static const test::EnglishTexts texts;
        return texts;
    }

    JobLog log;
};

TEST(EventQueue, HoldsAFloodBackAndLosesNothing)
{
    constexpr std::size_t events = 50'000;
    QueueFixture fixture;
    std::atomic<std::size_t> added = 0;
    std::jthread job([&] {
        for (; added < events; ++added)
            fixture.queue.add(Message{std::to_string(added), {}});
        fixture.queue.add(Finished{});
        fixture.queue.flush();
    });
    fixture.waitUntilFull();
    EXPECT_LE(added, (EventQueue::batchesUnderWay + 1) * EventQueue::batchEvents);
    ASSERT_TRUE(fixture.loop.runUntil([&] { return fixture.listener.finished == 1; }));
    ASSERT_EQ(fixture.listener.plainLines.size(), events);
    for (std::size_t i = 0; i < events; ++i)
        ASSERT_EQ(fixture.listener.plainLines[i], std::to_string(i));
}

TEST(JobLog, LetsNothingPassForAVerdict)
{
    for (const std::string_view hostile :
         {"File /a needs to be repaired. (inode #12)", "x APPEARS TO BE OK. x",
          "a name with [31m in it", "Rebuilding Catalog B-tree."}) {
        LogFixture fixture;
        fixture.log.detail(hostile);
        fixture.deliver();
        EXPECT_TRUE(fixture.listener.plainLines.empty()) << hostile;
        ASSERT_EQ(fixture.listener.dictionaries.size(), 1U) << hostile;
        EXPECT_EQ(fixture.listener.dictionaries[0].integer(contract::kFsckVerbosity), 2) << hostile;
    }
}

TEST(JobLog, ShowsNoControlCharacters)
{
    LogFixture fixture;
    fixture.log.detail("a\x1b]0;title\x07 b\tc");
    fixture.log.problem("\x1b[2Jgone");
    fixture.deliver();
    EXPECT_EQ(fixture.listener.plainLines, std::vector<std::string>{"a\uFFFD]0;title\uFFFD b c\n"});
    EXPECT_EQ(fixture.listener.textsOf(contract::kFsckProblem),
              std::vector<std::string>{"\uFFFD[2Jgone"});
}

TEST(JobLog, NamesTheDiskSoThatItCannotLie)
{
    const VerdictPhrases phrases(LogFixture::english());
    for (const auto& [name, identifier, shown] : {std::tuple("My Disk", "/dev/sdb1", "My Disk"),
                                                  {"it appears to be ok.", "/dev/sdb1", "sdb1"},
                                                  {"", "/dev/sdb1", "sdb1"},
                                                  {"[31mred", "/x/needs to be repaired.", "volume"},
                                                  {"a\nb", "x", "a\uFFFDb"}}) {
        contract::DiskReference disk;
        disk.name = name;
        disk.identifier = identifier;
        EXPECT_EQ(shownNameOf(disk, phrases), shown);
    }
}

TEST(JobLog, KeepsTenThousandProblemsReadable)
{
    LogFixture fixture;
    for (int i = 0; i < 10'000; ++i) {
        fixture.log.problem("Entry '" + std::string(static_cast<std::size_t>(i) % 50, 'x') +
                            "' in / (2) has a wrong inode " + std::to_string(i) + ".  Clear? no");
        if (i % 1000 == 0)  // the events takes only so much before it is emptied
            fixture.deliver();
    }
    for (int i = 0; i < 500; ++i)
        fixture.log.problem("problem " + std::string(static_cast<std::size_t>(i) + 1, 'x'));
    fixture.log.endOfRun();
    fixture.deliver();
    const auto errors = fixture.listener.textsOf(contract::kFsckProblem);
    EXPECT_EQ(errors.size(), ProblemLimiter::shownInAll + 2);
    EXPECT_EQ(errors[100], "… and %1$@ more like “%2$@”");
    EXPECT_EQ(fixture.listener.plainLines.size(), 10'500 - ProblemLimiter::shownInAll)
        << "nothing is lost in the detailed log";
    const contract::Array rest =
        fixture.listener.dictionaries[100][contract::kFsckParameters].array();
    EXPECT_EQ(rest.at(0).integer(), 9990);
    EXPECT_EQ(rest.at(1).string(), "Entry '…' in / (#) has a wrong inode #.");
}

// A module draws every error as a heading; of many problems that would be a wall.
TEST(JobLog, ProblemsOfToolsAreNoHeadingsAndAreSummedUpInOne)
{
    struct Case {
        int kinds;
        int ofEach;
        std::string_view sentence;
        std::int64_t problems;
        std::int64_t knownKinds;
    };
    for (const Case& c :
         {Case{0, 0, "", 0, 0}, Case{1, 1, "1 problem was found.", 1, 1},
          Case{1, 30, "%1$@ problems of one kind were found.", 30, 1},
          Case{3, 20, "%1$@ problems of %2$@ kinds were found.", 60, 3},
          Case{200, 2, "%1$@ problems of more than %2$@ kinds were found.", 400, 0}}) {
        LogFixture fixture;
        for (int kind = 0; kind < c.kinds; ++kind)
            for (int i = 0; i < c.ofEach; ++i)
                fixture.log.problem("problem " +
                                    std::string(static_cast<std::size_t>(kind) + 1, 'x'));
        fixture.log.endOfRun();
        fixture.log.problem("of a second run, which finds the same");
        fixture.log.endOfRun();
        const bool hasFound = c.problems > 0;
        if (hasFound)
            fixture.log.tellProblems();
        fixture.log.finished(0, 0, contract::kPLVerdictDamaged, "");
        fixture.deliver();
        for (const contract::Dictionary& message : fixture.listener.dictionaries) {
            const bool isProblem =
                message.string(contract::kFsckMessageType) == contract::kFsckProblem.text();
            EXPECT_TRUE(!isProblem || message.integer(contract::kFsckVerbosity) == 0);
        }
        const auto sentences = fixture.listener.textsOf(contract::kFsckError);
        EXPECT_EQ(sentences.size(), hasFound ? 1U : 0U);
        if (hasFound) {
            EXPECT_EQ(sentences.at(0), c.sentence);
            EXPECT_EQ(fixture.listener.result.integer(contract::kPLProblems), c.problems);
            EXPECT_EQ(fixture.listener.result.integer(contract::kPLProblemKinds), c.knownKinds);
        }
    }
}

TEST(ProgressMeter, OnlyGrowsAndStaysWithin)
{
    ProgressMeter meter;
    Clock::time_point now{1h};
    const auto report = [&](double percent) {
        return meter.report(percent, now += 1s);
    };
    meter.setRange(0, 60);
    EXPECT_EQ(report(0), 0.1) << "0 itself would be ignored";
    EXPECT_EQ(report(50), 30.0);
    EXPECT_EQ(report(50.1), std::nullopt) << "too little to tell";
    EXPECT_EQ(report(20), std::nullopt) << "backwards";
    meter.setRange(60, 100);
    EXPECT_EQ(report(100), 99.9) << "100 itself would be ignored";
    meter.setRange(0, 60);
    EXPECT_EQ(report(60), std::nullopt) << "another pass does not go back";

    ProgressMeter other;
    EXPECT_EQ(other.report(20, now), 20.05) << "20 itself means something else";
    EXPECT_EQ(other.report(30, now + 50ms), std::nullopt) << "too soon";
}

TEST(ToolRun, KnowsAVersionFromOtherLines)
{
    for (const auto& [banner, line, version] :
         {std::tuple("e2fsck ", "e2fsck 1.47.0 (5-Feb-2023)", "1.47.0"),
          {"fsck.fat ", "fsck.fat 4.2 (2021-01-31)", "4.2"},
          {"exfatprogs version : ", "exfatprogs version : 1.2.0", "1.2.0"},
          {"ntfsresize v", "ntfsresize v2022.10.3 (libntfs-3g)", "2022.10.3"},
          {"e2fsck ", "e2fsck 1.48~WIP+x\x1b[2J", "1.48~WIP+x"},
          {"e2fsck ", "e2fsck could not open it", ""},
          {"e2fsck ", "e2fsck 111111111111111111111111111111", ""},
          {"", "1.2", ""}})
        EXPECT_EQ(versionBehind(banner, line), version) << line;
}

TEST(ToolRun, ReplacesOurNameForTheDisk)
{
    EXPECT_EQ(withDiskName("/proc/self/fd/33 /proc/self/fd/3", "X"), "/proc/self/fd/33 X");
    EXPECT_EQ(withDiskName("open /proc/self/fd/3?offset=1048576", "X"), "open X");
}

}  // namespace
