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

    /// From the module's command, through the panel; the log is being printed then.
    void startPrinting(int rows, const char* file)
    {
        for (int i = 0; i < rows; ++i)
            addRow("one line of many, number " + std::to_string(i));
        reload();
        host.qtPrinting.setWindow(&interface->widget());
        module->printModuleSpecific(nullptr);
        auto* const panel = interface->widget().findChild<QPrintDialog*>();
        ASSERT_NE(panel, nullptr) << "also where there is no printer";
        panel->printer()->setOutputFormat(QPrinter::PdfFormat);
        panel->printer()->setOutputFileName(toQt(fileNamed(file)));
        emit panel->accepted();
        panel->hide();
        ASSERT_TRUE(host.qtPrinting.isPrinting());
    }

    PrintJob::State print(const std::vector<StyledText>& rows, const std::string& file)
    {
        QPrinter printer(QPrinter::HighResolution);
        printer.setOutputFormat(QPrinter::PdfFormat);
        printer.setPageSize(QPageSize(QPageSize::A4));
        printer.setOutputFileName(toQt(file));
        contract::PrintInfo info;
        info.horizontalPagination = contract::Pagination::Fit;
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

TEST_F(PrintTest, EveryWordIsOnThePaperOnceAndColoursAreKept)
{
    constexpr int rowCount = 500;
    std::vector<StyledText> rows{
        StyledText::make(std::string(700, 'x') + "END\n", {{}, Color{1, 0, 0, 1}, {}}),
        StyledText::make("a fine end\n", {contract::Font::boldSystem(11), {}, {}})};
    for (int i = 0; i < rowCount; ++i)
        rows.push_back(StyledText::make("row" + std::to_string(1000 + i) +
                                        (i % 7 == 0 ? std::string(150, 'w') : "") + "\n"));
    const std::string pdf = fileNamed("log.pdf");
    ASSERT_EQ(print(rows, pdf), PrintJob::State::Done);

    const QString text = textOf(pdf);
    for (int i = 0; i < rowCount; ++i)
        EXPECT_EQ(text.count(QStringLiteral("row%1").arg(1000 + i)), 1) << i;
    const qsizetype pages = text.count(QLatin1Char('\f'));
    EXPECT_GE(pages, 5);
    EXPECT_TRUE(text.contains(QStringLiteral("Page %1 of %1").arg(pages)));
    for (const char* const wanted : {"xEND", "fine end", "USB <b>stick", "today"})
        EXPECT_TRUE(text.contains(QLatin1String(wanted))) << wanted;

    const QImage page = pageOf(pdf);
    int reds = 0;
    for (int y = 0; y < page.height(); ++y)
        for (int x = 0; x < page.width(); ++x) {
            const QColor color = page.pixelColor(x, y);
            reds += color.red() > 150 && color.green() < 100 && color.blue() < 100 ? 1 : 0;
            // No printer leaves a smaller edge than 8 points.
            ASSERT_TRUE(x <= page.width() - 8 || color.lightness() >= 250) << "cut at the edge";
        }
    EXPECT_GT(reds, 100) << "the problem is red";
}

TEST_F(PrintTest, WhatCannotBeWrittenIsAFailure)
{
    EXPECT_EQ(print({StyledText::make("one\n")}, "/nonexistent/log.pdf"), PrintJob::State::Failed);
}

TEST_F(PrintTest, ALongLogLeavesTheWindowItsTurnsAndCanBeGivenUp)
{
    startPrinting(20'000, "long.pdf");
    int turns = 0;
    QTimer others;
    QObject::connect(&others, &QTimer::timeout, [&turns] { ++turns; });
    others.start(0);
    auto* const progress = interface->widget().findChild<QProgressDialog*>();
    ASSERT_NE(progress, nullptr);
    ASSERT_TRUE(QTest::qWaitFor([&] { return progress->value() > 0; }, longestWait));
    EXPECT_GT(turns, 0);
    progress->findChild<QPushButton*>()->click();
    EXPECT_TRUE(QTest::qWaitFor([&] { return !host.qtPrinting.isPrinting(); }, longestWait));
    EXPECT_FALSE(QFile::exists(toQt(fileNamed("long.pdf")))) << "half a log is no log";
    EXPECT_EQ(host.printFailures, 0) << "to give up is no failure";
}

TEST_F(PrintTest, HeadingsAreDatedAndFoldedRowsArePrinted)
{
    addRun("first", {"folded"});
    addRun("second", {"shown"});
    selectDisk();
    host.qtPrinting.setNoteSource([](const contract::OutlineItem&) {
        return RunNote{"today", "sound", {}};
    });
    startPrinting(0, "dated.pdf");
    ASSERT_TRUE(QTest::qWaitFor([&] { return !host.qtPrinting.isPrinting(); }, longestWait));
    const QString text = textOf(fileNamed("dated.pdf"));
    for (const char* const line : {"first (today, sound)", "folded", "second (today, sound)"})
        EXPECT_EQ(text.count(QLatin1String(line)), 1) << line;
}

TEST_F(PrintTest, AModuleThatGoesTakesItsPrintingAlong)
{
    startPrinting(5000, "gone.pdf");
    host.qtPrinting.forget(*view);
    module.reset();
    settle();
    EXPECT_FALSE(host.qtPrinting.isPrinting());
    EXPECT_FALSE(QFile::exists(toQt(fileNamed("gone.pdf"))));
}

}  // namespace
}  // namespace orvane::desktop
