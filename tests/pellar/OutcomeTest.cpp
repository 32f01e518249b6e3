// SPDX-License-Identifier: Apache-2.0
#include "pellar/outcome/Outcome.h"

#include "pellar/outcome/Damage.h"
#include "pellar/texts/ErrorTexts.h"
#include "pellar/tools/ext/E2fsckOutput.h"
#include "tests/pellar/JobFixture.h"

#include <gtest/gtest.h>

namespace {

using namespace pellar;

Judgement sound()
{
    return {Verdict::Sound, 0, 0, {}, false};
}

Judgement damaged(bool madeProgress = false)
{
    return {Verdict::Damaged, contract::kPLErrorDamaged, 4, {}, madeProgress};
}

Judgement corrected()
{
    return {Verdict::Sound, 0, 1, {}, true};
}

Judgement killed()
{
    return {Verdict::Failed, contract::kPLErrorToolFailed, 9, {"killed", {}, {}}, false};
}

TEST(Outcome, OfARepairIsWhatTheVerificationFinds)
{
    struct Case {
        std::vector<RepairPass> passes;
        Judgement confirmation;
        Verdict verdict;
        contract::ErrorCode code;
        std::string_view because;
    };
    for (const Case& c :
         {Case{{{sound(), false, false}}, sound(), Verdict::Sound, 0, "nothing to do"},
          Case{{{corrected(), false, true}}, sound(), Verdict::Repaired, 0, "all put right"},
          Case{{{sound(), true, false}}, sound(), Verdict::Repaired, 0, "a replayed journal"},
          Case{{{corrected(), false, true}},
               damaged(),
               Verdict::Damaged,
               contract::kPLErrorNotRepaired,
               "the tool was too sure of itself"},
          Case{{{damaged(true), false, true}, {corrected(), false, true}},
               sound(),
               Verdict::Repaired,
               0,
               "the second pass did it"},
          Case{{{killed(), false, false}},
               damaged(),
               Verdict::Damaged,
               contract::kPLErrorNotRepaired,
               "the repair was killed"}}) {
        const Outcome outcome = outcomeOfRepair(c.passes, c.confirmation);
        EXPECT_EQ(outcome.verdict, c.verdict) << c.because;
        EXPECT_EQ(outcome.code, c.code) << c.because;
    }
}

TEST(Outcome, RepairsAgainOnlyWhileThatHelps)
{
    EXPECT_TRUE(isWorthAnotherPass({{damaged(true), false, true}}, damaged()));
    EXPECT_FALSE(isWorthAnotherPass({{damaged(false), false, true}}, damaged())) << "got nowhere";
    EXPECT_FALSE(isWorthAnotherPass({{corrected(), false, true}}, sound())) << "is done";
    EXPECT_FALSE(isWorthAnotherPass({{corrected(), false, true}}, killed())) << "is not known";
    const std::vector<RepairPass> many(mostRepairPasses, {damaged(true), false, true});
    EXPECT_FALSE(isWorthAnotherPass(many, damaged())) << "goes on for ever";
}

TEST(Outcome, SaysSoWhenOnlyTheJournalWasReplayed)
{
    const test::EnglishTexts texts;
    const auto message = [&texts](bool foundProblems) {
        return messageOf(outcomeOfRepair({{sound(), true, foundProblems}}, sound()),
                         Operation::Repair, "%2$@", texts);
    };
    EXPECT_EQ(message(false), "repaired “%2$@”: its journal was replayed; nothing else was wrong");
    EXPECT_EQ(message(true), "repaired “%2$@”: no damage is left");
}

TEST(E2fsckDamage, ProblemsAreToldApartByWhatTheyMean)
{
    struct Case {
        std::string_view problem;
        Damage::Kind kind;
    };
    for (const Case& c : {
             Case{"Free blocks count wrong (1, counted=40914).", Damage::Bookkeeping},
             Case{"Inode 2 ref count is 5, should be 4.  Fix? no", Damage::Bookkeeping},
             Case{"Inode 12, i_blocks is 8, should be 2.  Fix? no", Damage::Bookkeeping},
             Case{"Block bitmap differences:  -3357", Damage::Bookkeeping},
             Case{"Unattached inode 13", Damage::LostPlaces},
             Case{"Entry 'a' in / (2) has deleted/unused inode 12.  Clear? no", Damage::LostPlaces},
             Case{"Entry 'x' in / (2) is a duplicate name", Damage::Contents},
             Case{"Entry 'count wrong' in /count wrong (2) has an invalid name.  Fix? no",
                  Damage::Contents},
             Case{"Root inode is not a directory.  Clear? no", Damage::Structure},
             Case{"Superblock has an invalid journal (inode 8).", Damage::Structure},
             Case{"Multiply-claimed block(s) in inode 13: 1630--1633", Damage::SharedBlocks},
             Case{"Inode 14 has illegal block(s).  Clear? no", Damage::Contents},
             Case{"Something that a later version says. Fix? no", Damage::Contents},
         })
        EXPECT_EQ(e2fsckDamageOf(c.problem), Damage(c.kind)) << c.problem;
}

TEST(Damage, OnlyMereBookkeepingIsCalledHarmless)
{
    EXPECT_TRUE(meaningOf({}).empty());
    ASSERT_EQ(meaningOf(Damage::Bookkeeping).size(), 1U);
    EXPECT_NE(meaningOf(Damage::Bookkeeping).front().find("no file is affected"),
              std::string_view::npos);
    for (const Damage::Kind kind :
         {Damage::LostPlaces, Damage::Contents, Damage::SharedBlocks, Damage::Structure}) {
        Damage damage = kind;
        damage.add(Damage::Bookkeeping);
        const auto sentences = meaningOf(damage);
        ASSERT_EQ(sentences.size(), 1U);
        EXPECT_EQ(sentences.front().find("no file is affected"), std::string_view::npos);
    }
}

TEST(Sentence, HasAFormOfItsOwnForOne)
{
    const test::EnglishTexts texts;
    const auto said = [&texts](std::uint64_t count) {
        return sentenceAbout(count, "%1$@ file of %2$@", "%1$@ files of %2$@", "1").in(texts);
    };
    EXPECT_EQ(said(0), "0 files of 1");
    EXPECT_EQ(said(1), "1 file of 1");
    EXPECT_EQ(said(11), "11 files of 1");
}

TEST(ErrorTexts, AnUnknownCodeIsNamed)
{
    EXPECT_EQ(errorText(-12345, test::EnglishTexts()), "Error -12345.");
}

}  // namespace
