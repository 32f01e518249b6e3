// SPDX-License-Identifier: Apache-2.0
#include "pellar/outcome/Outcome.h"

#include "pellar/outcome/Damage.h"
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
    };
    const RepairPass nothing{sound(), false, false};
    const RepairPass replayed{sound(), true, false};
    const RepairPass some{damaged(true), false, true};
    const RepairPass all{corrected(), false, true};
    const RepairPass silent{sound(), false, true};  // btrfs does not say what it has changed
    for (const Case& c :
         {Case{{nothing}, sound(), Verdict::Sound}, Case{{all}, sound(), Verdict::Repaired},
          Case{{replayed}, sound(), Verdict::Repaired}, Case{{all}, damaged(), Verdict::Damaged},
          Case{{some, all}, sound(), Verdict::Repaired}, Case{{silent}, sound(), Verdict::Repaired},
          Case{{{killed(), false, false}}, damaged(), Verdict::Damaged}}) {
        const Outcome outcome = outcomeOfRepair(c.passes, c.confirmation);
        EXPECT_EQ(outcome.verdict, c.verdict);
        EXPECT_EQ(outcome.code, c.verdict == Verdict::Damaged ? contract::kPLErrorNotRepaired : 0);
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

TEST(E2fsckDamage, ProblemsAreToldApartByWhatTheyMean)
{
    using enum Damage::Kind;
    for (const auto& [problem, kind] :
         {std::pair("Free blocks count wrong (1, counted=40914).", Bookkeeping),
          {"Inode 2 ref count is 5, should be 4.  Fix? no", Bookkeeping},
          {"Inode 12, i_blocks is 8, should be 2.  Fix? no", Bookkeeping},
          {"Block bitmap differences:  -3357", Bookkeeping},
          {"Unattached inode 13", LostPlaces},
          {"Entry 'a' in / (2) has deleted/unused inode 12.  Clear? no", LostPlaces},
          {"Entry 'x' in / (2) is a duplicate name", Contents},
          {"Entry 'count wrong' in /count wrong (2) has an invalid name.  Fix? no", Contents},
          {"Root inode is not a directory.  Clear? no", Structure},
          {"Superblock has an invalid journal (inode 8).", Structure},
          {"Multiply-claimed block(s) in inode 13: 1630--1633", SharedBlocks},
          {"Inode 14 has illegal block(s).  Clear? no", Contents},
          {"Something that a later version says. Fix? no", Contents}})
        EXPECT_EQ(e2fsckDamageOf(problem), Damage(kind)) << problem;
}

TEST(Damage, OnlyMereBookkeepingIsCalledHarmless)
{
    EXPECT_TRUE(meaningOf({}).empty());
    ASSERT_EQ(meaningOf(Damage::Bookkeeping).size(), 1U);
    EXPECT_TRUE(test::contains(meaningOf(Damage::Bookkeeping).front(), "no file is affected"));
    for (const Damage::Kind kind :
         {Damage::LostPlaces, Damage::Contents, Damage::SharedBlocks, Damage::Structure}) {
        Damage damage = kind;
        damage.add(Damage::Bookkeeping);
        const auto sentences = meaningOf(damage);
        ASSERT_EQ(sentences.size(), 1U);
        EXPECT_FALSE(test::contains(sentences.front(), "no file is affected"));
    }
}

}  // namespace
