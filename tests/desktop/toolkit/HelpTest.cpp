// SPDX-License-Identifier: Apache-2.0
#include "fixwell/availability/ButtonDecision.h"
#include "orvane/desktop/toolkit/QtHelp.h"
#include "orvane/desktop/toolkit/Text.h"
#include "orvane/support/texts/Catalogue.h"
#include "orvane/support/texts/Language.h"
#include "tests/module/FakeHost.h"

#include <QFile>
#include <QLineEdit>
#include <QRegularExpression>
#include <QTest>

#include <gtest/gtest.h>

#include <clocale>

namespace orvane::desktop {
namespace {

constexpr const char* languages[]{"en", "de"};

QString contentsOf(const QString& page)
{
    QFile file(page);
    return file.open(QIODevice::ReadOnly) ? QString::fromUtf8(file.readAll()) : QString();
}

HelpBook bookIn(const std::string& language)
{
    return HelpBook(HELP_BOOKS "/help/" + language);
}

std::string oneLine(const QString& text)
{
    return fromQt(text.simplified());
}

/// The marks of a page that readers and the window go by, without its words.
QStringList skeleton(const QString& page)
{
    static const QRegularExpression mark(
        QStringLiteral("<a [^>]*>|</?(?:h1|h2|li|dt|dd|tr|td|pre|p)>"));
    QStringList marks;
    for (const QRegularExpressionMatch& match : mark.globalMatch(contentsOf(page)))
        marks += match.captured();
    return marks;
}

/// The help books of the sources, in one language.
struct BookBundle final : contract::Bundle {
    std::string language = "en";
    std::string books = HELP_BOOKS;

    std::string localizedString(std::string_view key, std::string_view,
                                std::string_view) const override
    {
        return key == "en" ? language : std::string(key);
    }
    std::uint64_t stringRevision() const override { return 1; }
    std::filesystem::path pathForResource(std::string_view name) const override
    {
        const auto path = std::filesystem::path(books) / name;
        return std::filesystem::exists(path) ? path : std::filesystem::path();
    }
};

class HelpTest : public testing::Test {
protected:
    QTextBrowser& browser() { return *help.window()->findChild<QTextBrowser*>(); }
    QString page() { return browser().source().fileName(); }
    void find(const char* words)
    {
        auto& field = *help.window()->findChild<QLineEdit*>();
        field.setText(QString::fromUtf8(words));
        QTest::keyClick(&field, Qt::Key_Return);
    }

    BookBundle bundle;
    fixwell::testing::FakeHost host;
    QtHelp help{bundle, host};
};

TEST(HelpBook, EveryLanguageHasTheSamePagesAndEveryLinkLeadsToOne)
{
    const QStringList english = bookIn("en").pages();
    ASSERT_GE(english.size(), 10);
    static const QRegularExpression link(QStringLiteral("href=\"([^\"]*)\""));
    for (const char* const language : languages) {
        const HelpBook book = bookIn(language);
        const QStringList pages = book.pages();
        ASSERT_EQ(pages.size(), english.size()) << language;
        for (qsizetype i = 0; i < pages.size(); ++i) {
            EXPECT_FALSE(HelpBook::plainText(pages[i]).isEmpty()) << pages[i].toStdString();
            EXPECT_EQ(skeleton(pages[i]), skeleton(english[i])) << pages[i].toStdString();
            for (const auto& match : link.globalMatch(contentsOf(pages[i])))
                EXPECT_TRUE(QFile::exists(QFileInfo(pages[i]).path() + '/' + match.captured(1)))
                    << match.captured(1).toStdString();
        }
        EXPECT_TRUE(book.pageWith("ovhelp11868").endsWith(QStringLiteral("checking.html")));
    }
}

TEST(HelpBook, LeavesTheColoursToThePalette)
{
    for (const char* const language : languages)
        for (const QString& page : bookIn(language).pages())
            for (const char* const forbidden : {"color", "style=", "<img", "<script", "http:"})
                EXPECT_FALSE(contentsOf(page).contains(QLatin1String(forbidden)))
                    << page.toStdString() << " has " << forbidden;
}

TEST(HelpBook, ExplainsEveryReasonInTheWordsOfTheButtons)
{
    std::setlocale(LC_ALL, "C.UTF-8");
    std::setlocale(LC_NUMERIC, "C");
    const ModuleBundle module(MODULE_BUNDLE, "FXW");
    for (const char* const language : languages) {
        setLanguage(language);
        const std::string page = oneLine(HelpBook::plainText(
            QStringLiteral(HELP_BOOKS "/help/") + language + QStringLiteral("/unavailable.html")));
        for (int reason = fixwell::FXWReasonIgnoresOwnership;
             reason <= fixwell::FXWReasonNotWritable; ++reason) {
            const std::string said = module.localizedString(fixwell::reasonText(reason, false));
            EXPECT_NE(page.find(said), std::string::npos) << language << ": " << said;
        }
        for (const char* const button : {"Verify Disk", "Repair Disk", "Stop Verify"})
            EXPECT_NE(oneLine(HelpBook::plainText(bookIn(language).pages()[1]))
                          .find(module.localizedString(button)),
                      std::string::npos)
                << language << ": " << button;
    }
    setLanguage("");
}

TEST_F(HelpTest, OpensAtTheAnchorAndGoesBackAndForward)
{
    help.openHelpAnchor("ovhelp11868");
    EXPECT_EQ(page(), QStringLiteral("checking.html"));
    help.openHelpAnchor("");
    EXPECT_EQ(page(), QStringLiteral("index.html"));
    browser().backward();
    EXPECT_EQ(page(), QStringLiteral("checking.html"));
    bundle.language = "de";
    help.window()->close();
    QCoreApplication::sendPostedEvents(nullptr, QEvent::DeferredDelete);
    help.openHelpAnchor("");
    EXPECT_TRUE(browser().toPlainText().contains(QStringLiteral("Orvane-Hilfe")));
}

TEST_F(HelpTest, ALanguageWithoutABookGetsTheEnglishOneAndNoBookIsSaid)
{
    bundle.language = "tlh";
    help.openHelpAnchor("ovhelp11868");
    EXPECT_EQ(page(), QStringLiteral("checking.html"));
    bundle.books = "/nonexistent";
    QtHelp missing(bundle, host);
    missing.openHelpAnchor("ovhelp11868");
    EXPECT_EQ(missing.window()->findChild<QTextBrowser*>()->toPlainText(),
              QStringLiteral("The help book index.html cannot be read."));
}

TEST_F(HelpTest, OnlyLinksInsideTheBookAreFollowed)
{
    help.openHelpAnchor("");
    for (const char* const link :
         {"https://example.org/", "file:///etc/passwd", "../de/index.html", "nowhere.html"}) {
        emit browser().anchorClicked(QUrl(QLatin1String(link)));
        EXPECT_EQ(page(), QStringLiteral("index.html")) << link;
        EXPECT_TRUE(browser().source().path().contains(QStringLiteral("/en/"))) << link;
    }
    emit browser().anchorClicked(QUrl(QStringLiteral("verdicts.html")));
    EXPECT_EQ(page(), QStringLiteral("verdicts.html"));
}

TEST_F(HelpTest, FindsWordsOnEveryPage)
{
    help.openHelpAnchor("");
    find("ddrescue");
    EXPECT_EQ(page(), QStringLiteral("verdicts.html"));
    EXPECT_EQ(browser().textCursor().selectedText(), QStringLiteral("ddrescue"));
    find("sqlite3");
    EXPECT_EQ(page(), QStringLiteral("log.html"));
    find("Orvane Help");
    EXPECT_EQ(page(), QStringLiteral("index.html")) << "behind the last page comes the first";
    find("no such words %@");
    EXPECT_EQ(page(), QStringLiteral("index.html"));
}

TEST_F(HelpTest, EscapeClosesItAndTheSizeIsKept)
{
    help.openHelpAnchor("");
    help.window()->resize(500, 400);
    ASSERT_TRUE(QTest::qWaitForWindowActive(help.window()));
    QTest::keyClick(help.window(), Qt::Key_Escape);
    QCoreApplication::sendPostedEvents(nullptr, QEvent::DeferredDelete);
    ASSERT_EQ(help.window(), nullptr);
    help.openHelpAnchor("");
    EXPECT_EQ(help.window()->size(), QSize(500, 400));
}

}  // namespace
}  // namespace orvane::desktop
