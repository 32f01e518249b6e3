// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/PrintJob.h"

#include "orvane/desktop/toolkit/DesktopFont.h"

#include <QFile>
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

}  // namespace orvane::desktop
