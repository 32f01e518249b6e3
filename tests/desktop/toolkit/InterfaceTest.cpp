// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/Text.h"
#include "orvane/support/texts/Catalogue.h"
#include "orvane/support/texts/Language.h"
#include "tests/desktop/toolkit/ToolkitFixture.h"

#include <QFile>
#include <QKeyEvent>
#include <QLabel>
#include <QMessageBox>
#include <QTest>
#include <QXmlStreamReader>

namespace orvane::desktop {
namespace {

using Interface = ToolkitTest;

QMessageBox* openBox(QWidget& window)
{
    for (QMessageBox* box : window.findChildren<QMessageBox*>())
        if (box->isVisible())
            return box;
    return nullptr;
}

TEST(Alerts, TheAnswerIsTheTagOfTheButtonAndComesOnceAndLater)
{
    struct Case {
        int key;
        bool alternateIsDefault;
        long answer;
        const char* because;
    };
    for (const Case& c : {Case{Qt::Key_Return, false, 1, "Return is the default button"},
                          Case{Qt::Key_Return, true, 2, "which the module may have moved"},
                          Case{Qt::Key_Escape, false, 2, "Escape is the alternate button"},
                          Case{Qt::Key_Escape, true, 2, "wherever Return goes"}}) {
        QWidget window;
        window.show();
        QtAlerts alerts({});
        alerts.setWindow(&window);
        auto alert = alerts.makeAlert({"<b>Verify?</b>", "label %s <img>", "Verify", "Cancel"});
        alert->buttons().at(0)->setTag(1);
        alert->buttons().at(1)->setTag(2);
        if (c.alternateIsDefault) {
            alert->buttons().at(0)->setKeyEquivalent("");
            alert->buttons().at(1)->setKeyEquivalent("\r");
        }
        std::vector<long> answers;
        alert->beginSheetModalForWindow(nullptr, [&](contract::Alert&, long answer) {
            answers.push_back(answer);
            alert.reset();
        });
        QMessageBox* const box = openBox(window);
        ASSERT_NE(box, nullptr);
        for (const QLabel* label : box->findChildren<QLabel*>())
            EXPECT_EQ(label->textFormat(), Qt::PlainText) << label->text().toStdString();
        QKeyEvent event(QEvent::KeyPress, c.key, Qt::NoModifier);
        QApplication::sendEvent(box, &event);
        for (int i = 0; i < 20 && answers.empty(); ++i)
            QApplication::processEvents(QEventLoop::AllEvents, 50);
        EXPECT_EQ(answers, std::vector<long>{c.answer}) << c.because;
        QApplication::processEvents();
        EXPECT_EQ(openBox(window), nullptr);
    }
}

TEST_F(Interface, EveryOutletIsFilledAndEveryControlCanBeHeard)
{
    for (const char* name :
         {"verifyDiskButton", "repairDiskButton", "verifyPermissionsButton",
          "repairPermissionsButton", "showDetailsButton", "clearHistoryButton", "helpButton"}) {
        QtButton* const button = interface->button(name);
        ASSERT_NE(button, nullptr) << name;
        EXPECT_FALSE(button->action().empty()) << name;
    }
    EXPECT_EQ(interface->button("clearHistoryButton")->title(), "Verlauf &löschen");
}

// What the buttons say is the module's; that it reaches the widgets, and clicks the module, is not.
TEST_F(Interface, ButtonsShowWhatTheModuleSaysAndClicksReachIt)
{
    QAbstractButton& verify = interface->button("verifyDiskButton")->widget();
    QAbstractButton& permissions = interface->button("verifyPermissionsButton")->widget();
    disk->mount.reset();
    disk->permissionsRepairable = false;
    selectDisk();
    EXPECT_TRUE(verify.isEnabled());
    EXPECT_FALSE(permissions.isEnabled());
    EXPECT_TRUE(permissions.toolTip().contains(
        QStringLiteral("Not available because the selected disk is not mounted.")));
    disk->boot = true;
    disk->verifiesLive = true;
    selectDisk();
    const QKeySequence shortcut = verify.shortcut();
    host.qtAlerts.setWindow(&interface->widget());
    for (const bool isAltHeld : {false, true}) {
        QTest::mouseClick(&verify, Qt::LeftButton, isAltHeld ? Qt::AltModifier : Qt::NoModifier);
        EXPECT_EQ(host.isLocked, isAltHeld) << "Alt skips the question about the startup disk";
        auto* const question = interface->widget().findChild<QMessageBox*>();
        ASSERT_EQ(question != nullptr, !isAltHeld);
        if (question != nullptr) {
            QTest::keyClick(question, Qt::Key_Escape);
            EXPECT_TRUE(QTest::qWaitFor(
                [&] { return interface->widget().findChild<QMessageBox*>() == nullptr; }));
        }
    }
    EXPECT_EQ(verify.text().remove(u'&'), QStringLiteral("Stop Verify"));
    EXPECT_EQ(verify.shortcut(), shortcut) << "the key stays with the button";
    QTest::mouseClick(&verify, Qt::LeftButton);
    EXPECT_FALSE(verify.isEnabled()) << "it is being stopped";
}

TEST_F(Interface, EveryTextOfTheFileHasAGermanOne)
{
    QFile file(QStringLiteral(FXW_UI));
    ASSERT_TRUE(file.open(QIODevice::ReadOnly));
    setLanguage("de");
    const ModuleBundle bundle(MODULE_BUNDLE, "FXW");
    int texts = 0;
    for (QXmlStreamReader reader(&file); !reader.atEnd(); reader.readNext()) {
        if (!reader.isStartElement() || reader.name() != QLatin1String("string") ||
            reader.attributes().hasAttribute(QStringLiteral("notr")))
            continue;
        const std::string text = fromQt(reader.readElementText());
        EXPECT_TRUE(bundle.catalogue().find("FXW", text)) << text;
        ++texts;
    }
    EXPECT_GE(texts, 15);
    setLanguage("");
}

TEST_F(Interface, NothingIsSentToAModuleThatHasGone)
{
    addRow("one");
    reload();
    view->reloadData();
    module.reset();
    settle();
    EXPECT_EQ(interface->outlineView(), nullptr);
    EXPECT_EQ(table().model()->rowCount(), 0);
    interface->button("showDetailsButton")->press();
    interface->widget().grab();
}

}  // namespace
}  // namespace orvane::desktop
