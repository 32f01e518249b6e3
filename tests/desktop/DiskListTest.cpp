// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/Text.h"
#include "orvane/desktop/window/DiskList.h"
#include "orvane/support/loop/Notifications.h"

#include <gtest/gtest.h>

#include <QAbstractItemModelTester>

namespace orvane::desktop::test {
namespace {

DiskTree disk(const std::string& identifier, std::vector<DiskTree> children = {})
{
    DiskTree tree;
    tree.facts.identifier = identifier;
    tree.facts.name = identifier;
    tree.children = std::move(children);
    return tree;
}

/// The list as indented lines.
std::string shown(const QAbstractItemModel& model, const QModelIndex& at = {},
                  const std::string& indent = "")
{
    std::string text;
    for (int row = 0; row < model.rowCount(at); ++row) {
        const QModelIndex index = model.index(row, 0, at);
        text += indent + fromQt(index.data().toString()) + "\n" + shown(model, index, indent + " ");
    }
    return text;
}

class DiskListTest : public testing::Test {
protected:
    void synchronize(const std::vector<DiskTree>& disks)
    {
        controller_.synchronize(disks);
        list_.synchronize();
    }

    Translator texts_;
    Notifications center_;
    DiskController controller_{
        center_, {[](std::string_view) { return FilesystemCapabilities(); }, nullptr}};
    std::map<std::string, LastCheck> checks_;
    std::string busy_;
    DiskTreeModel model_{
        controller_,
        {[this](const Disk& disk) {
             const auto found = checks_.find(disk.facts().identifier);
             return found != checks_.end() ? std::optional(found->second) : std::nullopt;
         },
         [this](const Disk& disk) { return disk.facts().identifier == busy_ ? "verifying…" : ""; },
         [](const Disk&) {
             return std::string();
         }},
        texts_};
    DiskList list_{texts_};
};

TEST_F(DiskListTest, FollowsDisksThatComeGoAndChange)
{
    const QAbstractItemModelTester tester(&model_,
                                          QAbstractItemModelTester::FailureReportingMode::Fatal);
    list_.show(model_, [] {});
    struct Case {
        std::vector<DiskTree> disks;
        std::string rows;
        std::string_view because;
    };
    for (const Case& c : {
             Case{{disk("a", {disk("a1"), disk("a2")})}, "a\n a1\n a2\n", "the first disk"},
             Case{{disk("a", {disk("a1"), disk("a2")}), disk("b")}, "a\n a1\n a2\nb\n", "one more"},
             Case{{disk("a", {disk("a2")}), disk("b")}, "a\n a2\nb\n", "a partition was deleted"},
             Case{{disk("b"), disk("a", {disk("a0"), disk("a2")})},
                  "a\n a0\n a2\nb\n",
                  "one was made before it"},
             Case{{disk("b")}, "b\n", "a disk with partitions was taken out"},
             Case{{}, "", "all are gone"},
         }) {
        synchronize(c.disks);
        EXPECT_EQ(shown(model_), c.rows) << c.because;
    }
}

TEST_F(DiskListTest, WhatIsSelectedStaysSelectedWhileOthersComeAndGo)
{
    int changes = 0;
    list_.show(model_, [&] { ++changes; });
    synchronize({disk("a", {disk("a1"), disk("a2")}), disk("b")});
    list_.selectAll();
    std::string order;
    for (const auto& selected : list_.selectedDisks())
        order += selected->diskIdentifier() + " ";
    EXPECT_EQ(order, "a a1 a2 b ") << "the list's order";
    changes = 0;
    list_.select(*controller_.diskNamed("b"));
    EXPECT_EQ(changes, 1);
    synchronize({disk("b"), disk("c")});
    ASSERT_EQ(list_.selectedDisks().size(), 1U);
    EXPECT_EQ(list_.selectedDisks().front()->diskIdentifier(), "b");
    synchronize({disk("c")});
    EXPECT_TRUE(list_.selectedDisks().empty()) << "a disk that is gone cannot be worked on";
    EXPECT_EQ(changes, 1) << "the modules hear of the disks by themselves";
}

TEST_F(DiskListTest, AParentSaysWhatItsWorstPartIs)
{
    list_.show(model_, [] {});
    struct Case {
        std::string verdictOfDisk;
        std::string verdictOfPart;
        std::string busy;
        std::string state;
    };
    for (const Case& c :
         {Case{"sound", "damaged", "", "damaged"}, Case{"damaged", "sound", "", "damaged"},
          Case{"sound", "failed", "", "failed"}, Case{"sound", "sound", "", "sound"},
          Case{"sound", "", "", "partly checked"}, Case{"", "", "", ""},
          Case{"damaged", "sound", "a1", "verifying…"}}) {
        checks_.clear();
        if (!c.verdictOfDisk.empty())
            checks_["a"].told.verdict = c.verdictOfDisk;
        if (!c.verdictOfPart.empty())
            checks_["a1"].told.verdict = c.verdictOfPart;
        busy_ = c.busy;
        synchronize({disk("a", {disk("a1")})});
        const QModelIndex row = model_.index(0, static_cast<int>(DiskColumn::Verdict));
        EXPECT_EQ(fromQt(row.data().toString()), c.state) << c.verdictOfDisk << c.verdictOfPart;
    }
}

TEST_F(DiskListTest, ALabelIsNeverMoreThanText)
{
    list_.show(model_, [] {});
    DiskTree hostile = disk("h");
    hostile.facts.name = "<img src=x>\n\x1b[31m\xff";
    hostile.facts.mountPoint = "/mnt/<b>\n";
    synchronize({hostile});
    const QModelIndex row = model_.index(0, 0);
    EXPECT_EQ(fromQt(row.data().toString()).find_first_of("\n\x1b"), std::string::npos);
    EXPECT_EQ(fromQt(row.data(Qt::ToolTipRole).toString()).find("<img"), std::string::npos);
    EXPECT_EQ(fromQt(row.data(Qt::ToolTipRole).toString()).find("/mnt/<b>"), std::string::npos);
}

}  // namespace
}  // namespace orvane::desktop::test
