// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/QtAlerts.h"

#include <QApplication>
#include <QKeyEvent>
#include <QLabel>
#include <QMessageBox>

#include <gtest/gtest.h>

namespace orvane::desktop {
namespace {

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

}  // namespace
}  // namespace orvane::desktop
