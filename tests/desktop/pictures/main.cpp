// SPDX-License-Identifier: Apache-2.0
// One run takes the pictures of one language and look: the environment says which, and how they
// are called (see `take`).

#include "orvane/desktop/toolkit/ColorScheme.h"
#include "orvane/support/texts/Language.h"
#include "tests/desktop/WindowFixture.h"

#include <QApplication>
#include <QTest>

#include <cstdlib>

namespace orvane::desktop::test {
namespace {

std::string look()
{
    return qEnvironmentVariable("PICTURE", QStringLiteral("light")).toStdString();
}

class Pictures : public WindowFixture {
protected:
    // Whatever the language.
    void verify(const std::string& image)
    {
        select(image);
        button("verifyDiskButton").press();
        ASSERT_TRUE(waitUntil([&] {
            return button("verifyDiskButton").action() == "verifyDisk:" &&
                   !cell(image, DiskColumn::Verdict).empty();
        }));
        if (QMessageBox* const box = sheet())
            box->close();
        QTest::qWait(50);
    }
};

TEST_F(Pictures, OfADamagedDiskThatWasVerified)
{
    const std::string sound = makeImage("Photos");
    const std::string damaged = makeDamagedImage("Letters");
    open({sound, damaged});
    window().resize(1180, 600);
    window().splitter().setSizes({420, 760});
    takePicture(look() + "-empty");
    verify(sound);
    verify(damaged);
    takePicture(look());
    session().host().sharedHelpManager().openHelpAnchor("ovhelp11868");
    QTest::qWait(50);
    QWidget& help = *session().host().sharedHelpManager().window();
    EXPECT_TRUE(
        help.grab().save(QString::fromStdString(SCREENSHOT_DIRECTORY "/" + look() + "-help.png")));
    EXPECT_LE(window().minimumSizeHint().width(), 1180) << "it has room on a small screen";
}

}  // namespace
}  // namespace orvane::desktop::test

int main(int argc, char** argv)
{
    ::setenv("LC_ALL", "C.UTF-8", 1);
    orvane::adoptUserLocale();
    testing::InitGoogleTest(&argc, argv);
    QApplication application(argc, argv);
    QLocale::setDefault(QLocale(QString::fromStdString(orvane::currentLanguage())));
    QApplication::setQuitOnLastWindowClosed(false);
    QApplication::setStyle(QStringLiteral("fusion"));
    if (qEnvironmentVariable("PICTURE").contains(QLatin1String("dark")))
        QApplication::setPalette(orvane::desktop::darkPalette());
    if (const int points = qEnvironmentVariableIntValue("FONT_POINTS"); points > 0) {
        QFont font = QApplication::font();
        font.setPointSize(points);
        QApplication::setFont(font);
    }
    return RUN_ALL_TESTS();
}
