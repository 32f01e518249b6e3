// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Bundle.h"
#include "contract/toolkit/Printing.h"
#include "orvane/desktop/toolkit/LogModel.h"
#include "orvane/desktop/toolkit/StyledLine.h"

#include <QPainter>
#include <QPointer>
#include <QPrinter>
#include <QProgressDialog>
#include <QTimer>
#include <QWidget>

#include <chrono>
#include <functional>
#include <memory>
#include <vector>

namespace orvane::desktop {

/// What stands at the top of every page.
struct PrintHeader {
    QString title;
    QString date;
    std::function<QString(int page, int pages)> pageText;
};

/// Prints a log in slices, so that the window stays alive whatever its length. With
/// `Pagination::Fit` everything is scaled down until the widest row has room, though not beyond
/// what can be read; what is wider than the paper goes on in the next line, and nothing is cut.
/// The printer outlives this object. Main thread.
class PrintJob {
public:
    enum class State { Working, Done, Failed };

    PrintJob(QPrinter& printer, std::vector<contract::StyledText> rows,
             const contract::Font& defaultFont, const contract::PrintInfo& info,
             PrintHeader header);
    PrintJob(const PrintJob&) = delete;
    PrintJob& operator=(const PrintJob&) = delete;
    /// Printing that has not come to its end is given up as by `cancel`.
    ~PrintJob();

    /// Goes on for about as long as `budget`.
    [[nodiscard]] State work(std::chrono::milliseconds budget);
    /// From 0 to 1.
    double progress() const;
    int pages() const { return pages_; }
    /// Nothing is printed, and a file that was begun is removed.
    void cancel();

private:
    enum class Phase { Measure, Count, Draw, Over };

    void step();
    void measure();
    void count();
    void draw();
    void settleScale();
    void settlePages();
    std::unique_ptr<QTextLayout> layout(const StyledLine& line) const;
    void startPage();
    void drawHeader();
    void finish();
    void fail();

    QPrinter& printer_;
    const std::vector<contract::StyledText> rows_;
    const contract::PrintInfo info_;
    const PrintHeader header_;
    LineLooks looks_;
    QPainter painter_;
    State state_ = State::Working;
    Phase phase_ = Phase::Measure;
    std::size_t next_ = 0;  ///< row of the phase

    // In units of the scaled painter, but for the page and the header.
    QRectF page_;
    double headerHeight_ = 0;
    double lineHeight_ = 1;
    double widest_ = 1;
    double scale_ = 1;
    double width_ = 1;
    double left_ = 0;
    int lines_ = 0;
    int linesPerPage_ = 1;
    int pages_ = 0;
    int pageNumber_ = 0;  ///< from 1
    double top_ = 0;
    int lineOfPage_ = 0;
};

/// Prints logs: the desktop's print panel, then the pages in slices, with a sheet that shows how
/// far it is once that takes long, and can give it up. One log at a time. Main thread.
class QtPrinting final : public contract::Printing {
public:
    /// Told when a log could not be printed.
    using Failed = std::function<void()>;

    /// `texts` outlives this object.
    QtPrinting(const contract::Bundle& texts, Failed failed);
    ~QtPrinting() override;

    /// The window that sheets are shown on, whichever window a module names.
    void setWindow(QWidget* window) { window_ = window; }
    /// Asked what is printed, for the head of the pages: the names of the disks. One line; what it
    /// answers may be hostile.
    void setTitle(std::function<std::string()> title) { title_ = std::move(title); }
    /// Asked what is known of the run that begins with a row, to be printed with it.
    void setNoteSource(std::function<RunNote(const contract::OutlineItem& start)> source)
    {
        noteOf_ = std::move(source);
    }
    /// A view goes away: what is being printed of it is given up.
    void forget(const contract::OutlineView& view);

    contract::PrintInfo& sharedPrintInfo() override { return info_; }
    void runPrintOperation(contract::OutlineView& view, const contract::PrintInfo& info,
                           bool showsPanel, contract::Window* window) override;

    bool isPrinting() const { return job_ != nullptr; }

private:
    QString text(std::string_view key) const;
    QString title() const;
    PrintHeader header() const;
    std::vector<contract::StyledText> rows() const;
    void start(std::shared_ptr<QPrinter> printer, const contract::PrintInfo& info);
    void goOn();
    void end(bool hasFailed);

    const contract::Bundle& texts_;
    Failed failed_;
    std::function<std::string()> title_;
    std::function<RunNote(const contract::OutlineItem& start)> noteOf_;
    contract::PrintInfo info_;
    QPointer<QWidget> window_;
    QPointer<QWidget> panel_;
    contract::OutlineView* view_ = nullptr;  ///< of the panel or the job
    std::shared_ptr<QPrinter> printer_;
    std::unique_ptr<PrintJob> job_;
    QPointer<QProgressDialog> progress_;
    QTimer nextSlice_;
};

}  // namespace orvane::desktop
