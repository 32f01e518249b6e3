// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/toolkit/Printing.h"
#include "orvane/desktop/toolkit/StyledLine.h"

#include <QPainter>
#include <QPrinter>

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
             const contract::Font& defaultFont, const contract::PrintInfo& info, PrintHeader header);
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

}  // namespace orvane::desktop
