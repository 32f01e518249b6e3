// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/Text.h"
#include "orvane/desktop/window/DiskList.h"
#include "orvane/desktop/window/DiskPanel.h"
#include "orvane/support/loop/Notifications.h"

#include <gtest/gtest.h>

#include <QAbstractItemModelTester>
#include <QTest>

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
    DiskPanel panel_{texts_};
    DiskList& list_ = panel_.list();

    void addImage(const std::string& path)
    {
        DiskFacts facts = disk(path).facts;
        facts.storage = contract::DiskReference::Storage::FileRegion;
        facts.type = diskType::diskImage;
        facts.path = facts.imagePath = path;
        facts.name = facts.path.filename();
        controller_.add(facts);
        list_.synchronize();
    }
    std::string selected() const
    {
        std::string names;
        for (const auto& disk : list_.selectedDisks())
            names += disk->displayName() + " ";
        return names;
    }
    QLineEdit& field() { return *panel_.findChild<QLineEdit*>(); }
    /// What stands in the list's place; empty while it has rows.
    std::string note() const
    {
        const auto* const label = list_.findChild<QLabel*>(QStringLiteral("listNote"));
        return label->isVisibleTo(&list_) ? fromQt(label->text()) : "";
    }
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
         {Case{"sound", "damaged", "", "damaged: a1"}, Case{"damaged", "sound", "", "damaged"},
          Case{"sound", "failed", "", "failed: a1"}, Case{"sound", "sound", "", "sound"},
          Case{"", "sound", "", "sound"}, Case{"sound", "", "", "partly checked"},
          Case{"", "", "", ""}, Case{"damaged", "sound", "a1", "verifying…"}}) {
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

TEST_F(DiskListTest, HeadingsPartDisksFromImagesAndAreNeitherReachedNorSelected)
{
    const QAbstractItemModelTester tester(&model_,
                                          QAbstractItemModelTester::FailureReportingMode::Fatal);
    list_.show(model_, [] {});
    addImage("/x/i.img");
    EXPECT_EQ(shown(model_), "i.img\n") << "one kind alone needs no heading";
    synchronize({disk("a", {disk("a1")}), disk("b")});
    EXPECT_EQ(shown(model_), "Disks\na\n a1\nb\nDisk Images\ni.img\n");
    list_.selectAll();
    EXPECT_EQ(selected(), "a a1 b i.img ");
    list_.select(*controller_.diskNamed("b"));
    QTest::keyClick(&list_, Qt::Key_Down);
    EXPECT_EQ(selected(), "i.img ");
    QTest::keyClick(&list_, Qt::Key_Home);
    EXPECT_EQ(selected(), "a ");
    QTest::mouseClick(list_.viewport(), Qt::LeftButton, {},
                      list_.visualRect(model_.index(3, 0)).center());
    EXPECT_EQ(selected().find("Images"), std::string::npos);
    synchronize({});
    EXPECT_EQ(shown(model_), "i.img\n");
}

TEST_F(DiskListTest, TheFilterFindsByAllThatARowSays)
{
    list_.show(model_, [] {});
    addImage("/x/photos.img");
    DiskTree home = disk("/dev/a1");
    home.facts.path = "/dev/a1";
    home.facts.name = "Heim";
    home.facts.filesystem = "vfat";
    home.facts.filesystemVersion = "FAT32";
    checks_["b1"].told.verdict = "damaged";
    const std::vector<DiskTree> disks{disk("a", {home, disk("a2")}), disk("b", {disk("b1")})};
    synchronize(disks);
    for (const auto& [words, rows] :
         {std::pair("heim", "Disks\na\n Heim\n"), std::pair("fat32", "Disks\na\n Heim\n"),
          std::pair("  HEIM  fat ", "Disks\na\n Heim\n"), std::pair("heim xfs", ""),
          std::pair("/dev/a", "Disks\na\n Heim\n"), std::pair("damaged", "Disks\nb\n b1\n"),
          std::pair("photos", "Disk Images\nphotos.img\n")}) {
        field().setText(QString::fromUtf8(words));
        EXPECT_EQ(shown(model_), rows) << words;
    }
    field().setText(QStringLiteral("damaged"));
    checks_["b1"].told.verdict = "repaired";
    synchronize(disks);
    EXPECT_EQ(shown(model_), "Disks\nb\n b1\n") << "a repair does not take its disk away";
    EXPECT_EQ(list_.rowsBelow(model_.rowAt(model_.index(1, 0))).size(), 1U);
    field().setText(QStringLiteral("heim"));
    EXPECT_EQ(list_.rowsBelow(model_.rowAt(model_.index(1, 0))).size(), 2U)
        << "what is hidden is still a part of its disk";
}

TEST_F(DiskListTest, WhatTheFilterHidesIsNotSelectedAndADiskThatIsWantedComesOut)
{
    int changes = 0;
    std::string selection;
    list_.show(model_, [&] {
        ++changes;
        selection = selected();
    });
    synchronize({disk("a", {disk("a1")}), disk("b")});
    list_.selectAll();
    changes = 0;
    field().setText(QStringLiteral("a1"));
    EXPECT_EQ(selection, "a a1 ");
    EXPECT_EQ(changes, 1) << "told once, and of what is left";
    field().setText(QStringLiteral("a"));
    EXPECT_EQ(changes, 1) << "nothing has changed";
    list_.select(*controller_.diskNamed("b"));
    EXPECT_EQ(selected(), "b ");
    EXPECT_EQ(fromQt(field().text()), "");
}

TEST_F(DiskListTest, AnEmptyListSaysWhyAndWhatToDo)
{
    list_.setLooking(true);
    list_.show(model_, [] {});
    auto& button = *list_.findChild<QPushButton*>(QStringLiteral("listNoteButton"));
    EXPECT_EQ(note(), "Looking for disks…");
    EXPECT_FALSE(button.isVisibleTo(&list_));
    list_.setLooking(false);
    EXPECT_EQ(note(), "No disks were found. Open an image, or drop one here.");
    int opened = 0;
    list_.events().openImage = [&] {
        ++opened;
    };
    QTest::mouseClick(&button, Qt::LeftButton);
    EXPECT_EQ(opened, 1);
    synchronize({disk("a")});
    EXPECT_EQ(note(), "");
    field().setText(QStringLiteral("<b>x"));
    EXPECT_EQ(note(), "No disk matches “<b>x”.");
    QTest::mouseClick(&button, Qt::LeftButton);
    EXPECT_EQ(note(), "");
    EXPECT_EQ(shown(model_), "a\n");
}

TEST_F(DiskListTest, TheKeysOfTheFieldAndTheList)
{
    list_.show(model_, [] {});
    synchronize({disk("a"), disk("b")});
    panel_.show();
    int opened = 0;
    list_.events().opened = [&] {
        ++opened;
    };
    list_.select(*controller_.diskNamed("b"));
    QTest::keyClick(&list_, Qt::Key_Return);
    EXPECT_EQ(opened, 1);
    QTest::keyClick(&list_, Qt::Key_Slash);
    EXPECT_EQ(panel_.focusWidget(), &field());
    QTest::keyClicks(&field(), QStringLiteral("a"));
    EXPECT_EQ(selected(), "");
    QTest::keyClick(&field(), Qt::Key_Return);
    EXPECT_EQ(panel_.focusWidget(), &list_);
    EXPECT_EQ(selected(), "a ");
    panel_.setCompact(true);
    EXPECT_TRUE(field().isVisible()) << "what hides disks is in sight";
    QTest::keyClick(&field(), Qt::Key_Escape);
    EXPECT_EQ(shown(model_), "a\nb\n");
    panel_.setCompact(true);
    EXPECT_FALSE(field().isVisible());
    panel_.search();
    EXPECT_TRUE(field().isVisible());
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
