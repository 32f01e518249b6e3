// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/QtPrinting.h"

#include "contract/foundation/Format.h"
#include "contract/foundation/UTF8.h"
#include "orvane/desktop/toolkit/StyledLine.h"
#include "orvane/desktop/toolkit/Text.h"
#include "orvane/support/history/RunStart.h"

#include <QDateTime>
#include <QFile>
#include <QLocale>
#include <QPrintDialog>
#include <QTextLayout>

#include <algorithm>
#include <utility>

namespace orvane::desktop {
namespace {

using Clock = std::chrono::steady_clock;

// Eleven points become eight: the least that is easily read on paper.
constexpr double smallestScale = 0.72;
constexpr double lineSpacing = 1.15;
constexpr double headerPoints = 9;
constexpr double headerLines = 2.5;      // with the room beneath
constexpr double continuationChars = 4;  // further lines of a row stand in
constexpr double partOfTitle = 0.55;     // of the header's width
constexpr int phases = 3;

LineLooks paperLooks(const contract::Font& defaultFont)
{
    LineLooks looks;
    looks.defaultFont = defaultFont;
    looks.textColor = Qt::black;
    looks.background = Qt::white;
    looks.joinsLetters = false;
    return looks;
}

QFont headerFont()
{
    return scaledFont(contract::Font::system(headerPoints), 1);
}

constexpr std::chrono::milliseconds slice{20};
constexpr double paperMargin = 15;  // millimetres
constexpr int progressSteps = 1000;

}  // namespace

PrintJob::PrintJob(QPrinter& printer, std::vector<contract::StyledText> rows,
                   const contract::Font& defaultFont, const contract::PrintInfo& info,
                   PrintHeader header)
    : printer_(printer),
      rows_(std::move(rows)),
      info_(info),
      header_(std::move(header)),
      looks_(paperLooks(defaultFont))
{
    if (!painter_.begin(&printer_)) {
        state_ = State::Failed;
        return;
    }
    page_ = QRectF(QPointF(), printer_.pageLayout().paintRectPixels(printer_.resolution()).size());
    headerHeight_ = QFontMetricsF(headerFont(), &printer_).height() * headerLines;
    contract::Font bold = looks_.defaultFont;
    bold.isBold = true;
    lineHeight_ = QFontMetricsF(scaledFont(bold, 1), &printer_).height() * lineSpacing;
    width_ = page_.width();
}

PrintJob::~PrintJob()
{
    if (state_ == State::Working)
        cancel();
}

PrintJob::State PrintJob::work(std::chrono::milliseconds budget)
{
    const Clock::time_point end = Clock::now() + budget;
    while (state_ == State::Working) {
        step();
        if (Clock::now() >= end)
            break;
    }
    return state_;
}

double PrintJob::progress() const
{
    const double done = rows_.empty() ? 0 : static_cast<double>(next_) / rows_.size();
    return (static_cast<double>(phase_) + done) / phases;
}

void PrintJob::step()
{
    if (next_ < rows_.size()) {
        switch (phase_) {
            case Phase::Measure: measure(); break;
            case Phase::Count: count(); break;
            case Phase::Draw: draw(); break;
            case Phase::Over: break;
        }
        ++next_;
        return;
    }
    next_ = 0;
    switch (std::exchange(phase_, static_cast<Phase>(static_cast<int>(phase_) + 1))) {
        case Phase::Measure: settleScale(); break;
        case Phase::Count: settlePages(); break;
        case Phase::Draw: finish(); break;
        case Phase::Over: break;
    }
}

void PrintJob::measure()
{
    const StyledLine line = oneLine(rows_[next_]);
    widest_ = std::max(
        widest_, QFontMetricsF(widestFont(line, looks_), &printer_).horizontalAdvance(line.text));
}

void PrintJob::settleScale()
{
    if (info_.horizontalPagination == contract::Pagination::Fit)
        scale_ = std::clamp(page_.width() / widest_, smallestScale, 1.0);
    width_ = page_.width() / scale_;
    if (info_.isHorizontallyCentered)
        left_ = std::max(0.0, (width_ - widest_) / 2);
    linesPerPage_ =
        std::max(1, static_cast<int>((page_.height() - headerHeight_) / (lineHeight_ * scale_)));
}

void PrintJob::count()
{
    lines_ += layout(oneLine(rows_[next_]))->lineCount();
}

void PrintJob::settlePages()
{
    pages_ = std::max(1, (lines_ + linesPerPage_ - 1) / linesPerPage_);
    startPage();
}

std::unique_ptr<QTextLayout> PrintJob::layout(const StyledLine& line) const
{
    const QFont font = widestFont(line, looks_);
    auto layout = std::make_unique<QTextLayout>(line.text, font, &printer_);
    QTextOption option;
    option.setWrapMode(QTextOption::WrapAtWordBoundaryOrAnywhere);
    layout->setTextOption(option);
    layout->setFormats(formatsOf(line, looks_));
    const double indent = QFontMetricsF(font, &printer_).averageCharWidth() * continuationChars;
    layout->beginLayout();
    for (QTextLine part = layout->createLine(); part.isValid(); part = layout->createLine()) {
        const double start = part.lineNumber() > 0 ? indent : 0;
        part.setLineWidth(width_ - left_ - start);
        part.setPosition({start, 0});
    }
    layout->endLayout();
    return layout;
}

void PrintJob::draw()
{
    const std::unique_ptr<QTextLayout> row = layout(oneLine(rows_[next_]));
    for (int i = 0; i < row->lineCount(); ++i) {
        if (lineOfPage_ == linesPerPage_) {
            if (!printer_.newPage()) {
                fail();
                return;
            }
            startPage();
        }
        row->lineAt(i).draw(&painter_, {left_, top_ + lineOfPage_++ * lineHeight_});
    }
}

void PrintJob::startPage()
{
    ++pageNumber_;
    lineOfPage_ = 0;
    painter_.resetTransform();
    drawHeader();
    const int linesLeft = lines_ - (pageNumber_ - 1) * linesPerPage_;
    top_ =
        info_.isVerticallyCentered ? std::max(0, linesPerPage_ - linesLeft) * lineHeight_ / 2 : 0;
    painter_.translate(0, headerHeight_);
    painter_.scale(scale_, scale_);
}

void PrintJob::drawHeader()
{
    painter_.setFont(headerFont());
    painter_.setPen(Qt::black);
    const QFontMetricsF metrics(headerFont(), &printer_);
    const QRectF line(0, 0, page_.width(), metrics.height());
    painter_.drawText(
        line, Qt::AlignLeft | Qt::TextSingleLine,
        metrics.elidedText(header_.title, Qt::ElideMiddle, page_.width() * partOfTitle));
    painter_.drawText(line, Qt::AlignRight | Qt::TextSingleLine,
                      header_.date + QStringLiteral("   ") + header_.pageText(pageNumber_, pages_));
    const double rule = metrics.height() * 1.3;
    painter_.setPen(QPen(Qt::gray, metrics.lineWidth()));
    painter_.drawLine(QPointF(0, rule), QPointF(page_.width(), rule));
}

void PrintJob::finish()
{
    const bool isWritten = painter_.end() && printer_.printerState() != QPrinter::Error;
    state_ = isWritten ? State::Done : State::Failed;
}

void PrintJob::fail()
{
    cancel();
    state_ = State::Failed;
}

// A queue forgets what was sent to it; a file has to be removed.
void PrintJob::cancel()
{
    printer_.abort();
    painter_.end();
    if (!printer_.outputFileName().isEmpty())
        QFile::remove(printer_.outputFileName());
    state_ = State::Failed;
}

QtPrinting::QtPrinting(const contract::Bundle& texts, Failed failed)
    : texts_(texts), failed_(std::move(failed))
{
    // A timer leaves the window its turn between two slices.
    nextSlice_.setInterval(0);
    QObject::connect(&nextSlice_, &QTimer::timeout, &nextSlice_, [this] { goOn(); });
}

QtPrinting::~QtPrinting()
{
    delete panel_;
    delete progress_;
}

QString QtPrinting::text(std::string_view key) const
{
    return toQt(texts_.localizedString(key));
}

QString QtPrinting::title() const
{
    const std::string title = title_ ? title_() : std::string();
    return title.empty() ? text("Log of checks and repairs") : toQt(contract::printable(title));
}

PrintHeader QtPrinting::header() const
{
    return {
        title(), QLocale().toString(QDateTime::currentDateTime(), QLocale::ShortFormat),
        [this](int page, int pages) {
            return toQt(contract::format(texts_.localizedString("Page %ld of %ld"), {page, pages}));
        }};
}

// The records are shared with the history, not copied, but for the headings.
std::vector<contract::StyledText> QtPrinting::rows() const
{
    std::vector<contract::StyledText> rows;
    rows.reserve(view_->numberOfRows());
    for (std::size_t row = 0; row < view_->numberOfRows(); ++row) {
        const contract::OutlineItem item = view_->itemAtRow(row);
        const contract::StyledText text = textOfItem(*view_, item);
        rows.push_back(noteOf_ && isStartOfRun(item) ? withNote(text, noteOf_(item)) : text);
    }
    return rows;
}

void QtPrinting::forget(const contract::OutlineView& view)
{
    if (view_ != &view)
        return;
    delete panel_;
    end(false);
}

void QtPrinting::runPrintOperation(contract::OutlineView& view, const contract::PrintInfo& info,
                                   bool showsPanel, contract::Window* /*window*/)
{
    if (isPrinting())
        return;
    view_ = &view;
    const auto printer = std::make_shared<QPrinter>(QPrinter::HighResolution);
    printer->setDocName(title());
    printer->setPageMargins({paperMargin, paperMargin, paperMargin, paperMargin},
                            QPageLayout::Millimeter);
    if (!showsPanel) {
        start(printer, info);
        return;
    }
    delete panel_;
    auto* const panel = new QPrintDialog(printer.get(), window_);
    panel->setAttribute(Qt::WA_DeleteOnClose);
    panel->setOptions(QAbstractPrintDialog::PrintToFile);
    QObject::connect(panel, &QDialog::accepted, panel,
                     [this, printer, info] { start(printer, info); });
    panel_ = panel;
    panel->open();
}

void QtPrinting::start(std::shared_ptr<QPrinter> printer, const contract::PrintInfo& info)
{
    printer_ = std::move(printer);
    const contract::Font font =
        view_->dataCell() != nullptr ? view_->dataCell()->font() : contract::Font();
    job_ = std::make_unique<PrintJob>(*printer_, rows(), font, info, header());
    // It shows itself when printing takes longer than a moment.
    progress_ =
        new QProgressDialog(text("Printing the log…"), text("Cancel"), 0, progressSteps, window_);
    progress_->setWindowModality(Qt::WindowModal);
    progress_->setAutoClose(false);
    progress_->setAutoReset(false);
    QObject::connect(
        progress_, &QProgressDialog::canceled, &nextSlice_, [this] { end(false); },
        Qt::QueuedConnection);
    nextSlice_.start();
}

void QtPrinting::goOn()
{
    const PrintJob::State state = job_->work(slice);
    if (state == PrintJob::State::Working)
        progress_->setValue(static_cast<int>(job_->progress() * progressSteps));
    else
        end(state == PrintJob::State::Failed);
}

void QtPrinting::end(bool hasFailed)
{
    nextSlice_.stop();
    if (progress_)
        progress_->deleteLater();
    progress_.clear();
    job_.reset();
    printer_.reset();
    view_ = nullptr;
    if (hasFailed && failed_)
        failed_();
}

}  // namespace orvane::desktop
