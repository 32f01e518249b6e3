// SPDX-License-Identifier: Apache-2.0
// What the header and the banner say, and what they offer.

#include "contract/pellar/ErrorCodes.h"
#include "orvane/desktop/toolkit/Text.h"
#include "orvane/desktop/window/ResultSummary.h"
#include "orvane/desktop/window/SelectionSummary.h"

#include <gtest/gtest.h>

namespace orvane::desktop::test {
namespace {

const QDateTime now(QDate(2026, 11, 22), QTime(12, 0));

DiskRow row(const std::string& name)
{
    DiskRow disk;
    disk.facts.name = disk.facts.label = name;
    disk.facts.identifier = disk.facts.path = "/dev/" + name;
    disk.facts.filesystem = "ext4";
    disk.facts.length = 1U << 30U;
    return disk;
}

DiskRow checked(const std::string& name, const std::string& verdict,
                const std::string& action = "verify", contract::ErrorCode error = 0)
{
    DiskRow disk = row(name);
    disk.lastCheck = LastCheck{{verdict, "", now.addSecs(-180), action, error}, std::nullopt};
    return disk;
}

using Steps = std::vector<NextStep>;

TEST(ResultSummaryOfOne, OffersWhatHelpsAndNothingThatCostsData)
{
    struct Case {
        const char* verdict;
        const char* action;
        contract::ErrorCode error;
        ResultSituation situation;
        Tone tone;
        const char* title;
        Steps steps;
    };
    const ResultSituation repairable{true, false, false, false};
    const ResultSituation undoable{true, true, false, false};
    for (const Case& c : {
             Case{"sound", "verify", 0, repairable, Tone::Good, "No damage was found.", {}},
             {"damaged",
              "verify",
              contract::kPLErrorDamaged,
              repairable,
              Tone::Bad,
              "Damage was found. Nothing was changed.",
              {NextStep::Repair, NextStep::Preview, NextStep::ShowProblems}},
             {"damaged",
              "verify",
              contract::kPLErrorDamaged,
              {},
              Tone::Bad,
              "Damage was found. Nothing was changed.",
              {NextStep::ShowProblems}},
             {"damaged",
              "verify-partition-map",
              contract::kPLErrorMapDamaged,
              repairable,
              Tone::Bad,
              "Damage was found. Nothing was changed.",
              {NextStep::Repair, NextStep::ShowProblems}},
             {"failed",
              "verify",
              contract::kPLErrorUnreadable,
              repairable,
              Tone::Caution,
              "The disk cannot be read in places. Nothing was changed.",
              {NextStep::CopyDisk}},
             {"damaged",
              "verify",
              contract::kPLErrorCutShort,
              repairable,
              Tone::Bad,
              "Damage was found. Nothing was changed.",
              {NextStep::CopyDisk, NextStep::ShowProblems}},
             {"damaged",
              "repair",
              contract::kPLErrorDamaged,
              repairable,
              Tone::Bad,
              "A repair was tried, and would leave no damage. Nothing was changed.",
              {NextStep::Repair, NextStep::ShowProblems}},
             {"damaged",
              "repair",
              contract::kPLErrorNotProven,
              repairable,
              Tone::Bad,
              "A repair was tried, and would leave damage. Nothing was changed.",
              {NextStep::ApplyUnproven, NextStep::CopyDisk, NextStep::ShowProblems}},
             {"failed",
              "repair",
              contract::kPLErrorNotTried,
              repairable,
              Tone::Caution,
              "The repair could not be tried first. Nothing was changed.",
              {NextStep::RepairDirectly, NextStep::CopyDisk}},
             {"repaired",
              "repair",
              0,
              undoable,
              Tone::Good,
              "Repaired. No damage is left.",
              {NextStep::Undo, NextStep::ShowProblems}},
             {"repaired",
              "repair-permissions",
              0,
              undoable,
              Tone::Good,
              "The permissions were set to what they should be.",
              {NextStep::ShowProblems}},
             {"repaired",
              "repair-permissions",
              0,
              {true, true, true, false},
              Tone::Good,
              "The permissions were set to what they should be.",
              {NextStep::UndoPermissions, NextStep::ShowProblems}},
             {"undone",
              "undo",
              0,
              repairable,
              Tone::Neutral,
              "The repair was taken back. The disk is as it was before it.",
              {}},
             {"stopped",
              "repair",
              contract::kPLErrorCancelled,
              repairable,
              Tone::Neutral,
              "The repair was stopped.",
              {}},
             {"", "verify", 0, repairable, Tone::Neutral, "The last job was cut off.", {}},
             {"damaged",
              "verify",
              contract::kPLErrorDamaged,
              {true, true, false, true},
              Tone::Bad,
              "A repair was interrupted, and only a part of it is written.",
              {NextStep::Finish, NextStep::Undo}},
         }) {
        const ResultSummary summary =
            resultOf(checked("x", c.verdict, c.action, c.error), c.situation, Translator());
        EXPECT_EQ(summary.title, c.title);
        EXPECT_EQ(summary.tone, c.tone) << c.title;
        EXPECT_EQ(summary.steps, c.steps) << c.title;
    }
    DiskRow lossy = checked("x", "repaired", "repair");
    lossy.lastCheck->told.hasLosses = true;
    EXPECT_EQ(resultOf(lossy, undoable, Translator()).tone, Tone::Caution);
    EXPECT_EQ(resultOf(lossy, undoable, Translator()).title,
              "Repaired, but files were lost or moved.");
    DiskRow failing = checked("x", "damaged", "verify", contract::kPLErrorDamaged);
    failing.facts.hasSMARTError = true;
    EXPECT_EQ(resultOf(failing, repairable, Translator()).steps,
              (Steps{NextStep::CopyDisk, NextStep::ShowProblems}))
        << "every attempt may cost more of it";
    failing.lastCheck.reset();
    EXPECT_EQ(resultOf(failing, repairable, Translator()).steps, Steps{NextStep::CopyDisk});
    EXPECT_EQ(resultOf(row("x"), repairable, Translator()).title, "") << "it was never checked";
}

TEST(ResultSummaryOfOne, TheLastRunIsTold)
{
    DiskRow disk = checked("x", "sound");
    disk.lastCheck->later = Check{"stopped", "stopped while verifying “x”", now, "verify", 0};
    const ResultSummary summary = resultOf(disk, {}, Translator());
    EXPECT_EQ(summary.title, "The check was stopped.");
    EXPECT_EQ(summary.details, "Stopped while verifying “x”");
}

TEST(ResultSummaryOfSeveral, CountsThemAndNamesThoseThatAreNotSound)
{
    const ResultSummary summary =
        resultOfSeveral({checked("a", "sound"), checked("b", "damaged"), row("c"),
                         checked("d", "failed"), checked("e", "sound")},
                        Translator());
    EXPECT_EQ(summary.title, "4 disks were checked: 1 damaged, 1 failed, 2 sound.");
    EXPECT_EQ(summary.tone, Tone::Bad);
    ASSERT_EQ(summary.disks.size(), 2U);
    EXPECT_EQ(summary.disks[0].identifier, "/dev/b");
    EXPECT_EQ(summary.disks[1].identifier, "/dev/d");
    EXPECT_EQ(resultOfSeveral({row("c")}, Translator()).title, "");
    DiskRow twin = checked("b", "damaged");
    twin.label = "b";
    twin.facts.path = "/images/other.img";
    EXPECT_EQ(resultOfSeveral({checked("b", "damaged"), twin}, Translator()).disks[1].name,
              "b (other.img)")
        << "one name for two disks";
}

TEST(SelectionSummaryText, SaysHowItIsAndHowFull)
{
    DiskRow disk = checked("Archive", "sound");
    disk.facts.space = pellar::SpaceUse{4096, 1024};
    SelectionSummary summary = summaryOf({disk}, {}, now, Translator());
    EXPECT_EQ(summary.state, QStringLiteral("Sound · 3 minutes ago"));
    EXPECT_EQ(summary.spaceText, QStringLiteral("1.0 KiB of 4.0 KiB used"));
    disk.lastCheck->told.verdict = "damaged";
    EXPECT_FALSE(summaryOf({disk}, {}, now, Translator()).space) << "that may be part of it";
    disk.facts.mountPoint = "/mnt";
    EXPECT_TRUE(summaryOf({disk}, {}, now, Translator()).space) << "the kernel says it";
    disk.activity = "verifying…";
    disk.percent = 64;
    EXPECT_EQ(summaryOf({disk}, {}, now, Translator()).state, QStringLiteral("Verifying… 64 %"));

    summary = summaryOf({row("disk")}, {row("one"), checked("two", "damaged")}, now, Translator());
    ASSERT_EQ(summary.partitions.size(), 2U);
    EXPECT_EQ(summary.partitions[1].verdict, "damaged");
    summary = summaryOf({checked("a", "damaged"), row("b")}, {}, now, Translator());
    EXPECT_EQ(summary.title, QStringLiteral("2 disks"));
    EXPECT_EQ(summary.state, QStringLiteral("1 damaged, 1 never checked"));
    EXPECT_TRUE(summary.facts.startsWith(QStringLiteral("2.0 GiB in all")));
}

TEST(SelectionSummaryText, SaysWhenItIsCheckedNext)
{
    // 22 November 2026 is a Sunday.
    const QDateTime sunday = now.addDays(7), tuesday(QDate(2026, 11, 24), QTime(0, 30));
    const auto stateWith = [](DiskRow disk, const QDateTime& next) {
        disk.nextCheck = next;
        return summaryOf({disk}, {}, now, Translator()).state;
    };
    EXPECT_EQ(stateWith(checked("a", "sound"), tuesday),
              QStringLiteral("Sound · 3 minutes ago · next check on Tuesday"));
    EXPECT_EQ(stateWith(row("a"), now.addSecs(3600)),
              QStringLiteral("Never checked · next check today"));
    EXPECT_EQ(stateWith(row("a"), now.addSecs(86400)),
              QStringLiteral("Never checked · next check tomorrow"));
    EXPECT_FALSE(nextCheckText(sunday, now, Translator()).contains(QStringLiteral("Sunday")))
        << "not this one";
    EXPECT_EQ(stateWith(row("a"), now.addSecs(-1)), QStringLiteral("Never checked"));
    DiskRow busy = row("a");
    busy.activity = "verifying…";
    EXPECT_EQ(stateWith(busy, tuesday), QStringLiteral("Verifying…"));
}

TEST(SelectionSummaryText, AgesAreTrue)
{
    for (const auto& [seconds, text] : {std::pair(20, "just now"),
                                        {59, "just now"},
                                        {60, "1 minute ago"},
                                        {7199, "1 hour ago"},
                                        {86400 * 2, "2 days ago"}})
        EXPECT_EQ(ageText(now.addSecs(-seconds), now, Translator()), QString::fromUtf8(text));
    EXPECT_TRUE(ageText(now.addDays(-400), now, Translator()).contains(QStringLiteral("25")));
    EXPECT_FALSE(ageText(now.addDays(2), now, Translator()).contains(QStringLiteral("ago")))
        << "a clock that was wrong";
}

}  // namespace
}  // namespace orvane::desktop::test
