// SPDX-License-Identifier: Apache-2.0
// The window as a screen reader finds it.

#include "tests/desktop/WindowFixture.h"

#include "orvane/desktop/toolkit/Text.h"

#include <QAccessible>
#include <QAction>
#include <QMenu>
#include <QMenuBar>

#include <map>

namespace orvane::desktop::test {
namespace {

class AccessibilityTest : public WindowFixture {
protected:
    using Visit = std::function<void(QAccessibleInterface&)>;

    // Rows are asked for as rows.
    static void walk(QAccessibleInterface* object, const Visit& visit)
    {
        if (object == nullptr || !object->isValid())
            return;
        visit(*object);
        if (object->tableInterface() != nullptr)
            return;
        for (int i = 0; i < object->childCount(); ++i)
            walk(object->child(i), visit);
    }

    static std::string read(QAccessibleInterface& object)
    {
        return fromQt(object.text(QAccessible::Name));
    }

    /// Every cell of a table or tree.
    static std::vector<std::string> cells(QWidget& widget)
    {
        QAccessibleInterface* const object = QAccessible::queryAccessibleInterface(&widget);
        QAccessibleTableInterface* const table = object->tableInterface();
        std::vector<std::string> read;
        for (int row = 0; row < table->rowCount(); ++row)
            for (int column = 0; column < table->columnCount(); ++column)
                read.push_back(fromQt(table->cellAt(row, column)->text(QAccessible::Name)));
        return read;
    }
};

bool holds(const std::vector<std::string>& texts, const std::string& wanted)
{
    return std::any_of(texts.begin(), texts.end(), [&](const std::string& text) {
        return text.find(wanted) != std::string::npos;
    });
}

TEST_F(AccessibilityTest, WhateverTakesTheFocusHasANameAndNoMarksInItsTexts)
{
    open({makeImage("sound")});
    int focusable = 0;
    walk(QAccessible::queryAccessibleInterface(&window()), [&](QAccessibleInterface& object) {
        const QString description = object.text(QAccessible::Description);
        EXPECT_FALSE(description.contains(QStringLiteral("</"))) << fromQt(description);
        if (!object.state().focusable || object.state().invisible)
            return;
        ++focusable;
        EXPECT_NE(read(object), "") << "role " << object.role() << " in " << read(*object.parent());
    });
    EXPECT_GE(focusable, 8);
}

TEST_F(AccessibilityTest, RowsAreReadWithTheirTypeNotByTheirColourAlone)
{
    const std::string image = makeDamagedImage("damaged");
    open({image});
    run("verifyDiskButton", image);
    (void)logRows();  // what is waiting is shown now
    const std::vector<std::string> rows = cells(log());
    EXPECT_TRUE(holds(rows, "Problem: Free blocks count wrong")) << testing::PrintToString(rows);
    EXPECT_TRUE(holds(rows, "Problem: Error: The volume is damaged"));
    const std::vector<std::string> disks = cells(window().disks());
    EXPECT_TRUE(holds(disks, "damaged.img")) << testing::PrintToString(disks);
    EXPECT_TRUE(std::find(disks.begin(), disks.end(), "damaged") != disks.end())
        << "the state is not its icon alone";
    takeSheet();
    run("repairDiskButton", image);
    (void)logRows();
    EXPECT_TRUE(holds(cells(log()), "Good result: The volume “damaged” was repaired"));
}

// Two commands on one key cancel each other out: neither is carried out.
TEST_F(AccessibilityTest, NoTwoCommandsShareAKey)
{
    open({});
    std::map<QString, std::string> owners;
    const auto claim = [&owners](const QKeySequence& key, const QString& owner) {
        if (key.isEmpty())
            return;
        const auto [place, isNew] = owners.try_emplace(key.toString(), fromQt(owner));
        EXPECT_TRUE(isNew) << fromQt(key.toString()) << ": " << place->second << " and "
                           << fromQt(owner);
    };
    for (const QAction* action : window().findChildren<QAction*>())
        if (action->menu() != nullptr)
            claim(QKeySequence::mnemonic(action->text()), action->text());
        else
            claim(action->shortcut(), action->text());
    for (const QAbstractButton* widget : window().findChildren<QAbstractButton*>())
        claim(widget->shortcut(), widget->text());
    EXPECT_GE(owners.size(), 10U);
}

}  // namespace
}  // namespace orvane::desktop::test
