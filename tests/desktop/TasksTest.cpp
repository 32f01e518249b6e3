// SPDX-License-Identifier: Apache-2.0
// What people come to the window for, by the mouse alone and by the keyboard alone, in no more
// steps than docs/usability.md says. A step is a click, a key with what is held down beside it, the
// pointer coming to rest, or a word that is typed.

#include "tests/desktop/WindowFixture.h"

#include "orvane/desktop/toolkit/Text.h"

#include <QApplication>
#include <QClipboard>
#include <QLineEdit>
#include <QMenu>
#include <QMenuBar>
#include <QTest>
#include <QToolTip>

#include <array>

namespace orvane::desktop::test {
namespace {

using orvane::test::contentsOf;

enum class Hand { Mouse, Keyboard };

class TasksTest : public WindowFixture, public testing::WithParamInterface<Hand> {
protected:
    bool isMouse() const { return GetParam() == Hand::Mouse; }

    /// The window as the desktop brings it up: in front, and nothing done in it yet.
    void begin(const std::vector<std::string>& images)
    {
        asksFirst_ = true;
        open(images);
        window().activateWindow();
        ASSERT_TRUE(QTest::qWaitForWindowActive(&window()));
        steps_ = 0;
    }
    /// The same, after the image was treated in an earlier window.
    void beginAfter(const char* button, const std::string& image)
    {
        asksFirst_ = false;
        open({image});
        run(button, image);
        close();
        begin({image});
    }
    void expectSteps(int byMouse, int byKeyboard) const
    {
        EXPECT_LE(steps_, isMouse() ? byMouse : byKeyboard);
    }

    // By the mouse: what is at that place gets it.

    void click(QWidget& widget, const QPoint& place, Qt::KeyboardModifiers held = {},
               Qt::MouseButton pressed = Qt::LeftButton)
    {
        ++steps_;
        QWidget& top = *widget.window();
        const QPoint inTop = widget.mapTo(&top, place);
        QWidget* const hit = top.childAt(inTop);
        ASSERT_TRUE(widget.isVisible()) << fromQt(widget.objectName());
        ASSERT_TRUE(&widget == &top || hit == &widget || widget.isAncestorOf(hit))
            << fromQt(widget.objectName()) << " is covered";
        QTest::mouseClick(top.windowHandle(), pressed, held, inTop);
        QCoreApplication::processEvents();
    }
    void click(QWidget& widget) { click(widget, widget.rect().center()); }
    void clickRow(const std::string& image, Qt::KeyboardModifiers held = {},
                  Qt::MouseButton pressed = Qt::LeftButton)
    {
        QWidget& viewport = *window().disks().viewport();
        const QRect place = window().disks().visualRect(row(image));
        ASSERT_TRUE(viewport.rect().contains(place)) << "it is not in sight";
        click(viewport, place.center(), held, pressed);
    }
    void clickCommandOfMenu(const char* name)
    {
        auto* const menu = qobject_cast<QMenu*>(QApplication::activePopupWidget());
        ASSERT_NE(menu, nullptr) << name;
        ASSERT_TRUE(menu->actions().contains(&command(name))) << name;
        click(*menu, menu->actionGeometry(&command(name)).center());
    }
    void clickMenu(const char* commandOfIt)
    {
        QMenuBar& bar = *window().menuBar();
        QAction* const title = qobject_cast<QMenu*>(command(commandOfIt).parent())->menuAction();
        click(bar, bar.actionGeometry(title).center());
    }
    void restOn(QWidget& widget)
    {
        ++steps_;
        QTest::mouseMove(window().windowHandle(), widget.mapTo(&window(), widget.rect().center()));
    }

    // By the keyboard: whatever has the focus gets it.

    /// Another program's window may have taken the focus, which here is no step of the user's.
    QWindow* focused()
    {
        const bool isThere = waitUntil([this] {
            QWidget* const modal = QApplication::activeModalWidget();
            if (QGuiApplication::focusWindow() == nullptr)
                (modal != nullptr ? modal : &window())->activateWindow();
            return QGuiApplication::focusWindow() != nullptr;
        });
        EXPECT_TRUE(isThere);
        return QGuiApplication::focusWindow();
    }
    void type(QKeyCombination keys)
    {
        ++steps_;
        QWindow* const focus = focused();
        ASSERT_NE(focus, nullptr);
        QTest::keyClick(focus, keys.key(), keys.keyboardModifiers());
        QCoreApplication::processEvents();
    }
    void typeWord(const char* word)
    {
        ++steps_;
        for (const char* letter = word; *letter != 0; ++letter)
            if (QWindow* const focus = focused())
                QTest::keyClick(focus, *letter);
        QCoreApplication::processEvents();
    }
    /// Goes on with Tab until the widget has the focus.
    void tabTo(const QWidget* wanted)
    {
        constexpr int most = 30;
        for (int i = 0; i < most && QApplication::focusWidget() != wanted; ++i)
            type(Qt::Key_Tab);
        EXPECT_EQ(QApplication::focusWidget(), wanted);
    }

    // By either.

    template <class Widget = QAbstractButton>
    Widget& widget(const char* name)
    {
        const auto found = window().findChildren<Widget*>(QLatin1String(name));
        const auto isShown = [](const Widget* one) {
            return one->isVisible();
        };
        const auto shown = std::ranges::find_if(found, isShown);
        return **(shown != found.end() ? shown : found.begin());
    }
    void choose(const char* widgetName, QKeyCombination keys)
    {
        if (isMouse())
            click(widget<QWidget>(widgetName));
        else
            type(keys);
    }
    void chooseDisk(const std::string& image)
    {
        if (isMouse())
            clickRow(image);
        else
            type(Qt::Key_Down);
        EXPECT_EQ(window().disks().currentIndex(), row(image));
        EXPECT_EQ(window().disks().selectedDisks().size(), 1U);
    }
    void answer(const char* question, const char* title)
    {
        ASSERT_TRUE(waitUntil([&] {
            return sheet() != nullptr && fromQt(sheet()->objectName()) == question &&
                   QApplication::focusWindow() == sheet()->windowHandle();
        })) << question;
        QAbstractButton* chosen = nullptr;
        for (QAbstractButton* button : sheet()->buttons())
            if (fromQt(button->text().remove(QLatin1Char('&'))) == title)
                chosen = button;
        ASSERT_NE(chosen, nullptr) << title;
        if (isMouse()) {
            click(*chosen);
            return;
        }
        const QKeySequence letter = chosen->shortcut();
        ASSERT_FALSE(letter.isEmpty()) << title;
        type(letter[0]);
    }
    /// What the window says about the disk that is selected.
    bool says(const std::string& sentence)
    {
        return waitUntil([&] {
            return window().banner().isVisible() &&
                   fromQt(widget<QLabel>("resultTitle").text()).find(sentence) != std::string::npos;
        });
    }
    std::string said() { return fromQt(widget<QLabel>("resultTitle").text()); }

    int steps_ = 0;
};

TEST_P(TasksTest, FindOutWhetherAnImageIsSound)
{
    const std::string image = makeImage("photos");
    begin({image});
    chooseDisk(image);
    choose("barVerify", Qt::CTRL | Qt::SHIFT | Qt::Key_V);
    EXPECT_TRUE(says("No damage was found.")) << said();
    expectSteps(2, 2);
}

TEST_P(TasksTest, SeeWhatWasFound)
{
    const std::string image = makeDamagedImage("letters");
    begin({image});
    chooseDisk(image);
    choose("barVerify", Qt::CTRL | Qt::SHIFT | Qt::Key_V);
    EXPECT_TRUE(says("Damaged")) << said();
    EXPECT_TRUE(logHolds("Free blocks count wrong")) << testing::PrintToString(logRows());
    EXPECT_FALSE(logHolds("Checking directory structure")) << "it is no problem";
    choose("showDetailsButton", Qt::CTRL | Qt::Key_D);
    EXPECT_TRUE(logHolds("Checking directory structure")) << testing::PrintToString(logRows());
    expectSteps(3, 3);
}

// All that the banner offers is on the way of the Tab key, in the order in which it stands there.
TEST_P(TasksTest, DoWhatTheBannerOffers)
{
    const std::string image = makeDamagedImage("letters");
    const std::string before = contentsOf(image);
    beginAfter("verifyDiskButton", image);
    chooseDisk(image);
    ASSERT_TRUE(waitForStep(NextStep::Preview));
    auto& step =
        widget(qPrintable(QStringLiteral("step%1").arg(static_cast<int>(NextStep::Preview))));
    if (isMouse()) {
        click(step);
    } else {
        tabTo(&step);
        type(Qt::Key_Return);
    }
    ASSERT_TRUE(waitForJob());
    EXPECT_TRUE(says("A repair was tried, and would leave no damage.")) << said();
    EXPECT_TRUE(contentsOf(image) == before);
    expectSteps(2, 4);
}

TEST_P(TasksTest, PreviewARepair)
{
    const std::string image = makeDamagedImage("letters");
    const std::string before = contentsOf(image);
    begin({image});
    chooseDisk(image);
    if (isMouse()) {
        click(widget("barPreview"));
    } else {
        type(Qt::ALT | Qt::Key_K);
        type(Qt::Key_W);
    }
    EXPECT_TRUE(waitForStep(NextStep::Repair)) << said();
    EXPECT_TRUE(contentsOf(image) == before);
    expectSteps(2, 3);
}

TEST_P(TasksTest, RepairTheImageThatWasJustOpened)
{
    const std::string image = makeDamagedImage("letters");
    begin({makeImage("photos")});
    session().open({image});
    ASSERT_TRUE(waitUntil([&] {
        return row(image).isValid() && window().disks().currentIndex() == row(image) &&
               widget("barRepair").isEnabled();
    })) << "what is opened is selected";
    choose("barRepair", Qt::CTRL | Qt::SHIFT | Qt::Key_R);
    answer("repairQuestion", "Repair");
    EXPECT_TRUE(says("epaired")) << said();
    EXPECT_EQ(verdict(image), "repaired");
    expectSteps(2, 2);
}

TEST_P(TasksTest, UndoARepair)
{
    const std::string image = makeDamagedImage("letters");
    const std::string before = contentsOf(image);
    beginAfter("repairDiskButton", image);
    ASSERT_FALSE(contentsOf(image) == before);
    chooseDisk(image);
    if (isMouse()) {
        click(widget("barUndo"));
    } else {
        type(Qt::ALT | Qt::Key_K);
        type(Qt::Key_U);
    }
    answer("undoQuestion", "Undo Repair");
    EXPECT_TRUE(waitUntil([&] { return verdict(image) == "undone"; })) << verdict(image);
    EXPECT_TRUE(contentsOf(image) == before);
    expectSteps(3, 4);
}

TEST_P(TasksTest, StopARunningCheck)
{
    useEndlessTool();
    const std::string image = makeImage("photos");
    begin({image});
    chooseDisk(image);
    choose("barVerify", Qt::CTRL | Qt::SHIFT | Qt::Key_V);
    ASSERT_TRUE(waitUntil([&] { return verdict(image) == "verifying…"; }));
    steps_ = 0;
    choose("barStop", Qt::CTRL | Qt::Key_Period);
    ASSERT_TRUE(waitForJob());
    EXPECT_TRUE(logHolds("Stopped by user")) << testing::PrintToString(logRows());
    expectSteps(1, 1);
}

TEST_P(TasksTest, CheckSeveralAndFindTheDamagedOne)
{
    const std::vector<std::string> images{makeImage("films"), makeDamagedImage("letters"),
                                          makeImage("photos")};
    begin(images);
    if (isMouse()) {
        clickRow(images.front());
        clickRow(images.back(), Qt::ShiftModifier);
    } else {
        type(Qt::CTRL | Qt::Key_A);
    }
    choose("barVerify", Qt::CTRL | Qt::SHIFT | Qt::Key_V);
    EXPECT_TRUE(says("3 disks were checked: 1 damaged, 2 sound.")) << said();
    QLabel& details = widget<QLabel>("resultDetails");
    EXPECT_TRUE(details.text().contains(QStringLiteral(">letters</a>"))) << fromQt(details.text());
    EXPECT_FALSE(details.text().contains(QStringLiteral("photos")));
    if (isMouse()) {
        click(details, {8, details.height() / 2});
    } else {
        tabTo(&details);
        type(Qt::Key_Tab);  // to the first link
        type(Qt::Key_Return);
    }
    EXPECT_TRUE(says("Damaged: ")) << said();
    EXPECT_EQ(window().disks().currentIndex(), row(images[1]));
    expectSteps(4, 5);
}

TEST_P(TasksTest, FindADiskByPartOfItsName)
{
    const std::vector<std::string> images{makeImage("films"), makeImage("letters"),
                                          makeImage("photos")};
    begin(images);
    choose("diskFilter", Qt::CTRL | Qt::Key_L);
    typeWord("oto");
    EXPECT_FALSE(row(images[0]).isValid());
    if (isMouse())
        clickRow(images[2]);
    else
        type(Qt::Key_Return);
    const auto selected = window().disks().selectedDisks();
    ASSERT_EQ(selected.size(), 1U);
    EXPECT_EQ(selected.front()->facts().path, images[2]);
    expectSteps(3, 3);
}

TEST_P(TasksTest, LookForAWordInTheLog)
{
    const std::string image = makeDamagedImage("letters");
    beginAfter("verifyDiskButton", image);
    chooseDisk(image);
    steps_ = 0;
    if (isMouse()) {
        clickMenu("findInLog");
        clickCommandOfMenu("findInLog");
    } else {
        type(Qt::CTRL | Qt::Key_F);
    }
    typeWord("blocks");
    EXPECT_TRUE(waitUntil([this] { return log().currentIndex().isValid(); }));
    EXPECT_TRUE(log().currentIndex().data().toString().contains(QStringLiteral("blocks")));
    EXPECT_TRUE(widget<QLineEdit>("logSearchField").isVisible());
    expectSteps(3, 2);
}

TEST_P(TasksTest, CopyAReport)
{
    const std::string image = makeDamagedImage("letters");
    begin({image});
    QApplication::clipboard()->clear();
    chooseDisk(image);
    choose("barVerify", Qt::CTRL | Qt::SHIFT | Qt::Key_V);
    EXPECT_TRUE(says("Damaged")) << said();
    if (isMouse()) {
        clickRow(image, {}, Qt::RightButton);
        clickCommandOfMenu("copyReport");
    } else {
        type(Qt::CTRL | Qt::SHIFT | Qt::Key_C);
    }
    const std::string report = fromQt(QApplication::clipboard()->text());
    EXPECT_NE(report.find(image), std::string::npos) << report;
    EXPECT_NE(report.find("needs to be repaired"), std::string::npos) << report;
    expectSteps(4, 3);
}

TEST_P(TasksTest, FindOutWhyRepairIsGrey)
{
    DiskTree system;
    system.facts.identifier = system.facts.path = "/dev/system";
    system.facts.name = "system";
    system.facts.type = diskType::volume;
    system.facts.filesystem = "ext4";
    system.facts.mountPoint = "/";
    system.facts.isBootVolume = true;
    begin({});
    session().host().sharedDiskController().synchronize({system});
    ASSERT_TRUE(waitUntil([&] { return row("/dev/system").isValid(); }));
    chooseDisk("/dev/system");
    ASSERT_TRUE(waitUntil([this] { return !widget("barRepair").isEnabled(); }));
    if (isMouse()) {
        restOn(widget("barRepair"));
    } else {
        type(Qt::ALT | Qt::Key_K);
        type(Qt::Key_Down);
    }
    EXPECT_TRUE(waitUntil([] { return QToolTip::isVisible(); }));
    EXPECT_TRUE(QToolTip::text().contains(QStringLiteral("the disk is in use: ")))
        << fromQt(QToolTip::text());
    expectSteps(2, 3);
}

TEST_P(TasksTest, CloseAnImageAndOpenItAgain)
{
    const std::string image = makeImage("photos");
    begin({image});
    if (isMouse()) {
        clickRow(image, {}, Qt::RightButton);
        clickCommandOfMenu("closeImage");
    } else {
        chooseDisk(image);
        type(Qt::CTRL | Qt::Key_W);
    }
    ASSERT_TRUE(waitUntil([&] { return !row(image).isValid(); }));
    EXPECT_TRUE(says("photos")) << said();
    ASSERT_TRUE(waitForStep(NextStep::Reopen));
    choose(qPrintable(QStringLiteral("step%1").arg(static_cast<int>(NextStep::Reopen))),
           Qt::CTRL | Qt::SHIFT | Qt::Key_T);
    EXPECT_TRUE(waitUntil([&] { return row(image).isValid(); }));
    expectSteps(3, 3);
}

INSTANTIATE_TEST_SUITE_P(By, TasksTest, testing::Values(Hand::Mouse, Hand::Keyboard),
                         [](const auto& hand) {
                             return hand.param == Hand::Mouse ? "Mouse" : "Keyboard";
                         });

}  // namespace
}  // namespace orvane::desktop::test
