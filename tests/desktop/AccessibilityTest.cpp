// SPDX-License-Identifier: Apache-2.0
// The window as a screen reader finds it.

#include "tests/desktop/WindowFixture.h"

#include "orvane/desktop/toolkit/ColorScheme.h"
#include "orvane/desktop/toolkit/Text.h"
#include "orvane/desktop/window/WindowColors.h"
#include "orvane/support/texts/Language.h"

#include <QAccessible>
#include <QAction>
#include <QApplication>
#include <QLabel>
#include <QMenu>
#include <QScrollArea>
#include <QTest>

#include <cstdlib>
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
    const std::string image = makeDamagedImage("damaged");
    open({image, makePartitionedImage("partitioned")});
    run("verifyDiskButton", image);
    ASSERT_TRUE(waitForStep(NextStep::Repair));
    int focusable = 0;
    walk(QAccessible::queryAccessibleInterface(&window()), [&](QAccessibleInterface& object) {
        const QString description = object.text(QAccessible::Description);
        EXPECT_FALSE(description.contains(QStringLiteral("</"))) << fromQt(description);
        if (!object.state().focusable || object.state().invisible)
            return;
        ++focusable;
        EXPECT_FALSE(object.text(QAccessible::Name).isEmpty()) << "role " << object.role();
    });
    EXPECT_GE(focusable, 20);
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

TEST_F(AccessibilityTest, WhatCameOutIsReadAsText)
{
    const std::string image = makeDamagedImage("damaged");
    open({image});
    run("verifyDiskButton", image);
    ASSERT_TRUE(waitForStep(NextStep::Repair));
    for (const auto& [name, beginning] : {std::pair("resultTitle", "Damaged: "),
                                          {"diskState", "Damaged"},
                                          {"diskTitle", "damaged"}}) {
        QAccessibleInterface* const label =
            QAccessible::queryAccessibleInterface(window().findChild<QLabel*>(QLatin1String(name)));
        EXPECT_EQ(label->role(), QAccessible::StaticText) << name;
        EXPECT_TRUE(fromQt(label->text(QAccessible::Name)).starts_with(beginning))
            << fromQt(label->text(QAccessible::Name));
        EXPECT_FALSE(label->state().invisible) << name;
    }
}

class ColorTest : public testing::TestWithParam<bool> {
protected:
    static void expectText(const QColor& ground, const QColor& text, const char* what)
    {
        EXPECT_EQ(text.alpha(), 255) << what;
        EXPECT_GE(contrastRatio(ground, text), readableContrast) << what;
    }
    static void expectMark(const QColor& ground, const QColor& mark, const char* what)
    {
        EXPECT_GE(contrastRatio(ground, mark), visibleContrast) << what;
    }
};

// The colours that are drawn, in those that the program itself has.
TEST_P(ColorTest, TextIsReadableAndMarksAreSeen)
{
    QPalette palette = GetParam() ? darkPalette() : QApplication::style()->standardPalette();
    QApplication::style()->polish(palette);
    for (const Tone tone : {Tone::Neutral, Tone::Good, Tone::Caution, Tone::Bad}) {
        const BannerColors banner = bannerColors(tone, palette);
        expectText(banner.ground, banner.text, "banner");
        expectText(banner.ground, banner.link, "link in the banner");
        expectMark(banner.ground, banner.stripe, "stripe of the banner");
    }
    for (const auto group : {QPalette::Active, QPalette::Inactive})
        for (const bool isSelected : {false, true}) {
            const RowColors row = rowColors(palette, group, isSelected);
            expectText(row.ground, row.text, isSelected ? "selected row" : "row");
            expectText(row.ground, row.faint, isSelected ? "selected row, faint" : "row, faint");
            expectMark(row.track, row.bar, "progress in a row");
        }
    expectText(palette.color(QPalette::Base), headingColor(palette), "section of the list");
    expectText(palette.color(QPalette::Base), palette.color(QPalette::PlaceholderText), "note");
    expectText(palette.color(QPalette::Window), palette.color(QPalette::WindowText), "header");
    expectMark(spaceColors(palette).track, spaceColors(palette).used, "used space");
    for (const bool isMarked : {false, true}) {
        const PartColors part = partColors(palette, isMarked);
        expectText(part.ground, part.text, "partition");
        expectMark(palette.color(QPalette::Window), part.frame, "frame of a partition");
        const PrimaryColors primary = primaryColors(palette, isMarked);
        expectText(primary.ground, primary.text, "primary button");
    }
}

INSTANTIATE_TEST_SUITE_P(In, ColorTest, testing::Bool(),
                         [](const auto& isDark) { return isDark.param ? "Dark" : "Light"; });

/// A language, and how much larger the font is.
class RoomTest : public WindowFixture,
                 public testing::WithParamInterface<std::tuple<const char*, double>> {
protected:
    void SetUp() override
    {
        ::setenv("LANGUAGE", std::get<0>(GetParam()), 1);
        adoptUserLocale();
        QFont larger = font_;
        larger.setPointSizeF(font_.pointSizeF() * std::get<1>(GetParam()));
        QApplication::setFont(larger);
    }
    void TearDown() override
    {
        close();
        QApplication::setFont(font_);
        ::unsetenv("LANGUAGE");
        adoptUserLocale();
    }

    static bool isInScrollArea(const QWidget& widget)
    {
        for (const QWidget* above = widget.parentWidget(); above != nullptr;
             above = above->parentWidget())
            if (qobject_cast<const QScrollArea*>(above) != nullptr)
                return true;
        return false;
    }
    /// What is not in sight as a whole, and said nowhere else.
    static std::string fault(const QWidget& widget)
    {
        const QSize has = widget.size();
        const QSize needs = widget.hasHeightForWidth()
                                ? QSize(0, widget.heightForWidth(has.width()))
                                : widget.sizeHint();
        const bool isElided = dynamic_cast<const ElidedLabel*>(&widget) != nullptr;
        if (needs.height() > has.height())
            return "too low";
        if (needs.width() > has.width() && !(isElided && !widget.toolTip().isEmpty()))
            return "too narrow";
        return widget.visibleRegion().boundingRect() == widget.rect() ? "" : "cut off";
    }
    template <class Widget>
    int expectRoomForAll()
    {
        int looked = 0;
        for (const Widget* widget : window().template findChildren<Widget*>()) {
            if (!widget->isVisible() || widget->text().isEmpty() || isInScrollArea(*widget))
                continue;
            ++looked;
            EXPECT_EQ(fault(*widget), "")
                << fromQt(widget->objectName()) << ": " << fromQt(widget->text()) << " has "
                << widget->width() << " x " << widget->height() << " of "
                << widget->sizeHint().width() << " x " << widget->sizeHint().height();
        }
        return looked;
    }

    const QFont font_ = QApplication::font();
};

TEST_P(RoomTest, NothingIsClipped)
{
    const std::string image = makeDamagedImage("A label, longer");
    open({image, makePartitionedImage("partitioned")});
    window().resize(1180, 720);
    run("verifyDiskButton", image);
    ASSERT_TRUE(waitForStep(NextStep::Repair));
    const bool isEnglish = result().starts_with("Damaged");
    EXPECT_EQ(isEnglish, std::string(std::get<0>(GetParam())) == "C") << result();
    QTest::qWait(0);
    EXPECT_EQ(window().width(), 1180) << "it needs more";
    EXPECT_EQ(window().height(), 720) << "it needs more";
    EXPECT_GE(expectRoomForAll<QLabel>(), 3);
    EXPECT_GE(expectRoomForAll<QAbstractButton>(), 12);
    if (std::get<1>(GetParam()) > 1)
        return;
    window().resize(600, 400);
    QTest::qWait(0);
    EXPECT_EQ(window().size(), QSize(600, 400)) << "it needs more";
    EXPECT_GE(expectRoomForAll<QLabel>(), 3);
    EXPECT_GE(expectRoomForAll<QAbstractButton>(), 12);
}

INSTANTIATE_TEST_SUITE_P(At, RoomTest,
                         testing::Combine(testing::Values("C", "de", "es", "fr", "ja"),
                                          testing::Values(1.0, 2.0)),
                         [](const auto& look) {
                             return std::string(std::get<0>(look.param)) +
                                    (std::get<1>(look.param) > 1 ? "Large" : "");
                         });

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
