// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/Text.h"
#include "tests/desktop/toolkit/ToolkitFixture.h"

#include <QFile>
#include <QImage>
#include <QPrintDialog>
#include <QProcess>
#include <QPushButton>
#include <QStandardPaths>
#include <QTemporaryDir>
#include <QTest>

namespace orvane::desktop {
namespace {

using contract::Color;
using contract::StyledText;

constexpr int longestWait = 60'000;  // milliseconds

class PrintTest : public ToolkitTest {
protected:
    void SetUp() override
    {
        if (QStandardPaths::findExecutable(QStringLiteral("pdftotext")).isEmpty())
            GTEST_SKIP() << "pdftotext is not installed (package poppler-utils)";
        ToolkitTest::SetUp();
    }

    static void run(const char* tool, const QStringList& arguments)
    {
        ASSERT_EQ(QProcess::execute(QLatin1String(tool), arguments), 0) << tool;
    }

    std::string fileNamed(const char* name)
    {
        return fromQt(directory.filePath(QLatin1String(name)));
    }

    PrintJob::State print(const std::vector<StyledText>& rows, const std::string& file)
    {
        QPrinter printer(QPrinter::HighResolution);
        printer.setOutputFormat(QPrinter::PdfFormat);
        printer.setPageSize(QPageSize(QPageSize::A4));
        printer.setOutputFileName(toQt(file));
        contract::PrintInfo info;
        info.horizontalPagination = contract::Pagination::Fit;
        info.isHorizontallyCentered = false;
        info.isVerticallyCentered = false;
        PrintJob job(
            printer, rows, contract::Font::system(11), info,
            {QStringLiteral("USB <b>stick"), QStringLiteral("today"), [](int page, int pages) {
                 return QStringLiteral("Page %1 of %2").arg(page).arg(pages);
             }});
        PrintJob::State state = PrintJob::State::Working;
        while (state == PrintJob::State::Working)
            state = job.work(std::chrono::seconds(1));
        return state;
    }

    /// The words on the pages, as another program reads them.
    QString textOf(const std::string& pdf)
    {
        run("pdftotext", {"-layout", toQt(pdf), toQt(fileNamed("text"))});
        QFile text(toQt(fileNamed("text")));
        return text.open(QIODevice::ReadOnly) ? QString::fromUtf8(text.readAll()) : QString();
    }

    /// The first page in points, as another program paints it.
    QImage pageOf(const std::string& pdf)
    {
        run("pdftoppm", {"-r", "72", "-png", "-singlefile", toQt(pdf), toQt(fileNamed("page"))});
        return QImage(toQt(fileNamed("page.png")));
    }

    QTemporaryDir directory;
};

template <class Matches>
int count(const QImage& image, Matches matches)
{
    int pixels = 0;
    for (int y = 0; y < image.height(); ++y)
        for (int x = 0; x < image.width(); ++x)
            pixels += matches(image.pixelColor(x, y), x) ? 1 : 0;
    return pixels;
}

TEST_F(PrintTest, EveryWordOfALongLineIsOnThePaperAndColoursAreKept)
{
    std::vector<StyledText> rows;
    std::string words;
    for (int i = 0; i < 60; ++i)
        words += "w" + std::to_string(100 + i) + " ";
    ASSERT_GE(words.size(), 300U);
    rows.push_back(StyledText::make("Verifying\n", {contract::Font::boldSystem(11), {}, {}}));
    rows.push_back(StyledText::make(words + "\n"));
    rows.push_back(StyledText::make(std::string(700, 'x') + "END\n", {{}, Color{1, 0, 0, 1}, {}}));
    rows.push_back(StyledText::make("a fine end of it all\n", {{}, Color{0, 0.8, 0.2, 1}, {}}));
    const std::string pdf = fileNamed("log.pdf");
    ASSERT_EQ(print(rows, pdf), PrintJob::State::Done);

    const QString text = textOf(pdf);
    for (int i = 0; i < 60; ++i)
        EXPECT_TRUE(text.contains(QStringLiteral("w%1").arg(100 + i))) << 100 + i;
    for (const char* const wanted :
         {"Verifying", "xEND", "fine end", "USB <b>stick", "today", "Page 1 of 1"})
        EXPECT_TRUE(text.contains(QLatin1String(wanted))) << wanted << " in " << fromQt(text);

    const QImage page = pageOf(pdf);
    ASSERT_FALSE(page.isNull());
    constexpr int margin = 8;  // less than any printer leaves
    EXPECT_EQ(
        count(page, [&](const QColor& color,
                        int x) { return x > page.width() - margin && color.lightness() < 250; }),
        0)
        << "something is cut at the right edge";
    EXPECT_GT(count(page,
                    [](const QColor& color, int) {
                        return color.red() > 150 && color.green() < 100 && color.blue() < 100;
                    }),
              100)
        << "the problem is red";
    EXPECT_GT(count(page,
                    [](const QColor& color, int) {
                        return color.green() > color.red() + 60 &&
                               color.green() > color.blue() + 60;
                    }),
              5)
        << "the good end is green";
    QFile::remove(QStringLiteral(SCREENSHOTS "/log.pdf"));
    QFile::copy(toQt(pdf), QStringLiteral(SCREENSHOTS "/log.pdf"));
}

TEST_F(PrintTest, NoRowIsLostBetweenTwoPages)
{
    std::vector<StyledText> rows;
    for (int i = 0; i < 500; ++i)
        rows.push_back(StyledText::make("row" + std::to_string(1000 + i) +
                                        (i % 7 == 0 ? std::string(150, 'w') : "") + "\n"));
    const std::string pdf = fileNamed("pages.pdf");
    ASSERT_EQ(print(rows, pdf), PrintJob::State::Done);
    const QString text = textOf(pdf);
    for (int i = 0; i < 500; ++i)
        EXPECT_EQ(text.count(QStringLiteral("row%1").arg(1000 + i)), 1) << i;
    const qsizetype pages = text.count(QLatin1Char('\f'));
    EXPECT_GE(pages, 5);
    EXPECT_TRUE(text.contains(QStringLiteral("Page %1 of %1").arg(pages)));
}

TEST_F(PrintTest, WhatCannotBeWrittenIsAFailure)
{
    EXPECT_EQ(print({StyledText::make("one\n")}, "/nonexistent/log.pdf"), PrintJob::State::Failed);
}

TEST_F(PrintTest, ALongLogLeavesTheWindowItsTurnsAndCanBeGivenUp)
{
    for (int i = 0; i < 20'000; ++i)
        addRow("one line of many, number " + std::to_string(i));
    reload();
    const std::string pdf = fileNamed("long.pdf");
    host.qtPrinting.setWindow(&interface->widget());
    module->printModuleSpecific(nullptr);
    auto* const panel = interface->widget().findChild<QPrintDialog*>();
    ASSERT_NE(panel, nullptr) << "also where there is no printer";
    panel->printer()->setOutputFormat(QPrinter::PdfFormat);
    panel->printer()->setOutputFileName(toQt(pdf));
    emit panel->accepted();
    panel->hide();
    ASSERT_TRUE(host.qtPrinting.isPrinting());

    int turns = 0;
    QTimer others;
    QObject::connect(&others, &QTimer::timeout, [&turns] { ++turns; });
    others.start(0);
    auto* const progress = interface->widget().findChild<QProgressDialog*>();
    ASSERT_NE(progress, nullptr);
    ASSERT_TRUE(QTest::qWaitFor([&] { return progress->value() > 0; }, longestWait));
    EXPECT_TRUE(host.qtPrinting.isPrinting());
    EXPECT_GT(turns, 0);
    progress->findChild<QPushButton*>()->click();
    EXPECT_TRUE(QTest::qWaitFor([&] { return !host.qtPrinting.isPrinting(); }, longestWait));
    EXPECT_FALSE(QFile::exists(toQt(pdf))) << "half a log is no log";
    EXPECT_EQ(host.printFailures, 0) << "to give up is no failure";
}

TEST_F(PrintTest, AModuleThatGoesTakesItsPrintingAlong)
{
    for (int i = 0; i < 5000; ++i)
        addRow("row");
    reload();
    host.qtPrinting.runPrintOperation(*view, {}, true, nullptr);
    auto* const panel = qobject_cast<QPrintDialog*>(QApplication::activeModalWidget());
    ASSERT_NE(panel, nullptr);
    panel->printer()->setOutputFormat(QPrinter::PdfFormat);
    panel->printer()->setOutputFileName(toQt(fileNamed("gone.pdf")));
    emit panel->accepted();
    settle();
    host.qtPrinting.forget(*view);
    module.reset();
    settle();
    EXPECT_FALSE(host.qtPrinting.isPrinting());
    EXPECT_FALSE(QFile::exists(toQt(fileNamed("gone.pdf"))));
}

}  // namespace
}  // namespace orvane::desktop
