// SPDX-License-Identifier: Apache-2.0
// The window as a screen reader finds it.

#include "tests/desktop/WindowFixture.h"

#include "orvane/desktop/toolkit/Text.h"

#include <QAccessible>
#include <QAction>
#include <QMenu>

#include <map>

namespace orvane::desktop::test {
namespace {

class AccessibilityTest : public WindowFixture {
protected:
    // Rows are asked for as rows.
    template <class Visit>
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

    /// Every cell of a table or tree, one a line.
    static std::string cells(QWidget& widget)
    {
        QAccessibleInterface* const object = QAccessible::queryAccessibleInterface(&widget);
        QAccessibleTableInterface* const table = object->tableInterface();
        std::string read;
        for (int row = 0; row < table->rowCount(); ++row)
            for (int column = 0; column < table->columnCount(); ++column)
                read += fromQt(table->cellAt(row, column)->text(QAccessible::Name)) + "\n";
        return read;
    }
};

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
        EXPECT_FALSE(object.text(QAccessible::Name).isEmpty()) << "role " << object.role();
    });
    EXPECT_GE(focusable, 8);
}

TEST_F(AccessibilityTest, RowsAreReadWithTheirTypeNotByTheirColourAlone)
{
    const std::string image = makeDamagedImage("damaged");
    open({image});
    run("verifyDiskButton", image);
    (void)logRows();  // what is waiting is shown now
    const std::string rows = cells(log());
    EXPECT_NE(rows.find("Problem: Free blocks count wrong"), std::string::npos) << rows;
    EXPECT_NE(rows.find(", damaged, expanded\n"), std::string::npos) << "of the run: " << rows;
    EXPECT_NE(cells(window().disks()).find("\ndamaged\n"), std::string::npos)
        << "the state is not its icon alone";
    takeSheet();
    run("repairDiskButton", image);
    (void)logRows();
    EXPECT_NE(cells(log()).find("Good result: The volume"), std::string::npos);
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
