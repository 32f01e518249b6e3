// SPDX-License-Identifier: Apache-2.0
#include "fixwell/availability/ButtonDecision.h"
#include "orvane/desktop/toolkit/Help.h"
#include "orvane/desktop/toolkit/Text.h"
#include "orvane/support/texts/Catalogue.h"
#include "orvane/support/texts/Language.h"
#include "tests/module/FakeHost.h"

#include <QFile>
#include <QLineEdit>
#include <QListWidget>
#include <QRegularExpression>
#include <QTest>

#include <gtest/gtest.h>

namespace orvane::desktop {
namespace {

constexpr const char* languages[]{"en", "de", "es", "fr", "ja"};

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
            // Colours are the palette's, and nothing comes from elsewhere.
            for (const char* const forbidden :
                 {"color:", "color=", "style=", "<img", "<script", "http:"})
                EXPECT_FALSE(contentsOf(pages[i]).contains(QLatin1String(forbidden)))
                    << pages[i].toStdString() << " has " << forbidden;
            for (const auto& match : link.globalMatch(contentsOf(pages[i])))
                EXPECT_TRUE(QFile::exists(QFileInfo(pages[i]).path() + '/' + match.captured(1)))
                    << match.captured(1).toStdString();
        }
        EXPECT_TRUE(book.pageWith("ovhelp11868").endsWith(QStringLiteral("checking.html")));
        EXPECT_TRUE(book.pageWith("copying").endsWith(QStringLiteral("before.html")));
    }
}

TEST(HelpBook, ExplainsEveryReasonInTheWordsOfTheButtons)
{
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
    }
    setLanguage("");
}

TEST_F(HelpTest, OpensAtTheAnchorInTheLanguageThatHasABook)
{
    help.openHelpAnchor("ovhelp11868");
    EXPECT_EQ(page(), QStringLiteral("checking.html"));
    help.openHelpAnchor("");
    EXPECT_EQ(page(), QStringLiteral("index.html"));
    browser().backward();
    EXPECT_EQ(page(), QStringLiteral("checking.html"));
    struct Case {
        const char* language;
        std::string books;
        const char* text;
    };
    for (const Case& c :
         {Case{"de", HELP_BOOKS, "Orvane-Hilfe"}, Case{"tlh", HELP_BOOKS, "Orvane Help"},
          Case{"en", "/nonexistent", "book index.html cannot be read."}}) {
        bundle.language = c.language;
        bundle.books = c.books;
        QtHelp other(bundle, host);
        other.openHelpAnchor("");
        const QString shown = other.window()->findChild<QTextBrowser*>()->toPlainText();
        EXPECT_TRUE(shown.contains(QLatin1String(c.text))) << fromQt(shown);
    }
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

TEST_F(HelpTest, FindsWordsOnEveryPageUntilEscapeClosesIt)
{
    help.openHelpAnchor("");
    auto& hits = *help.window()->findChild<QListWidget*>(QStringLiteral("helpHits"));
    EXPECT_FALSE(hits.isVisible());
    find("ddrescue");
    EXPECT_EQ(page(), QStringLiteral("before.html")) << "where it stands most";
    EXPECT_EQ(browser().textCursor().selectedText(), QStringLiteral("ddrescue"));
    const int inPage = browser().textCursor().position();
    find("ddrescue");
    EXPECT_GT(browser().textCursor().position(), inPage) << "the page goes first";
    ASSERT_GE(hits.count(), 2);
    EXPECT_TRUE(hits.item(0)->text().contains(QStringLiteral("ddrescue")));
    hits.setCurrentRow(1);
    EXPECT_NE(page(), QStringLiteral("before.html"));
    EXPECT_EQ(browser().textCursor().selectedText(), QStringLiteral("ddrescue"));

    find("keys");
    EXPECT_EQ(page(), QStringLiteral("keys.html")) << "its title has it, though others do as well";
    find("IMAGE ddrescue");
    EXPECT_EQ(page(), QStringLiteral("before.html")) << "both words, whatever their case";
    find("no such words %@");
    EXPECT_EQ(hits.count(), 0);
    EXPECT_FALSE(hits.isVisible());

    ASSERT_TRUE(QTest::qWaitForWindowActive(help.window()));
    QTest::keyClick(help.window(), Qt::Key_Escape);
    QCoreApplication::sendPostedEvents(nullptr, QEvent::DeferredDelete);
    EXPECT_EQ(help.window(), nullptr);
}

}  // namespace
}  // namespace orvane::desktop
