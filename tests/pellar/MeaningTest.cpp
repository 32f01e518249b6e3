// SPDX-License-Identifier: Apache-2.0
#include "pellar/outcome/Damage.h"
#include "pellar/tools/ext/E2fsckOutput.h"

#include <gtest/gtest.h>

namespace pellar {

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

TEST(Meaning, OnlyMereBookkeepingIsCalledHarmless)
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

}  // namespace pellar
