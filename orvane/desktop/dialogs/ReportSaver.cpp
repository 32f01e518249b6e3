// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/dialogs/ReportSaver.h"

#include "orvane/desktop/toolkit/Text.h"
#include "orvane/support/texts/Quantities.h"

#include <QElapsedTimer>
#include <QFile>
#include <QLocale>

#include <utility>

namespace orvane::desktop {
namespace {

using Kind = ReportLine::Kind;
using Tone = ReportLine::Tone;

constexpr int slice = 20;        // milliseconds
constexpr int linesAtOnce = 50;  // between two looks at the clock
constexpr int progressSteps = 1000;
constexpr double paperMargin = 15;        // millimetres
constexpr qint64 copiedAtOnce = 1 << 20;  // bytes

std::unique_ptr<ReportEncoding> encodingFor(const QString& file)
{
    const auto hasEnding = [&file](const char* ending) {
        return file.endsWith(QLatin1String(ending), Qt::CaseInsensitive);
    };
    if (hasEnding(".pdf"))
        return nullptr;
    if (hasEnding(".html") || hasEnding(".htm"))
        return makeHTMLEncoding(fromQt(QLocale().bcp47Name()));
    return makeTextEncoding();
}

/// As a line on paper.
contract::StyledText printed(const ReportLine& line)
{
    constexpr double points = 11;
    contract::TextStyle style;
    const bool isHeading = line.kind == Kind::Title || line.kind == Kind::Disk;
    const double size = line.kind == Kind::Title  ? points + 5
                        : line.kind == Kind::Disk ? points + 2
                                                  : points;
    style.font = contract::Font{isHeading || line.kind == Kind::Run || line.isBold, size};
    if (line.tone == Tone::Bad)
        style.color = contract::Color{1, 0, 0, 1};
    if (line.tone == Tone::Good)
        style.color = contract::Color{0, 0.8, 0.2, 1};
    const std::string indent = line.kind == Kind::Row || line.kind == Kind::Part ? "    " : "";
    const std::string name = line.kind == Kind::Fact ? line.name + ": " : "";
    return contract::StyledText::make(indent + name + line.text, style);
}

bool hasRoomAbove(Kind kind)
{
    return kind == Kind::Disk || kind == Kind::Run;
}

}  // namespace

ReportSaver::ReportSaver(std::unique_ptr<Report> report, const QString& file,
                         const Translator& texts, QWidget& window,
                         std::function<void(const std::string& failure)> ended)
    : report_(std::move(report)),
      texts_(texts),
      ended_(std::move(ended)),
      file_(file),
      encoding_(encodingFor(file)),
      progress_(new QProgressDialog(text("Saving the report…"), text("Cancel"), 0, progressSteps,
                                    &window))
{
    progress_->setObjectName(QStringLiteral("reportProgress"));
    // A modal one would let events in between, in the middle of a slice.
    progress_->setWindowModality(Qt::NonModal);
    progress_->setAutoClose(false);
    progress_->setAutoReset(false);
    QObject::connect(
        progress_, &QProgressDialog::canceled, &nextSlice_, [this] { end({}); },
        Qt::QueuedConnection);
    QObject::connect(&nextSlice_, &QTimer::timeout, &nextSlice_, [this] { work(); });
    nextSlice_.start(0);
}

ReportSaver::~ReportSaver()
{
    delete progress_;
}

QString ReportSaver::text(std::string_view key) const
{
    return toQt(texts_.text(key));
}

void ReportSaver::work()
{
    if (!file_.isOpen()) {
        if (!file_.open(QIODevice::WriteOnly))
            return fail(file_.errorString());
        if (encoding_)
            write(encoding_->begin(report_->title()));
    }
    switch (phase_) {
        case Phase::Collect: return collect();
        case Phase::Print: return print();
        case Phase::Copy: return copyPages();
    }
}

void ReportSaver::collect()
{
    QElapsedTimer clock;
    clock.start();
    for (int count = 0; !isOver_ && (count % linesAtOnce != 0 || !clock.hasExpired(slice));
         ++count) {
        const auto line = report_->next();
        if (!line && encoding_) {
            write(encoding_->end());
            return finish();
        }
        if (!line)
            return beginPages();
        take(*line);
    }
    // Laying out takes longer than collecting.
    showProgress(report_->progress() * (encoding_ ? 1 : 0.2));
}

void ReportSaver::take(const ReportLine& line)
{
    if (encoding_)
        return write(encoding_->add(line));
    if (hasRoomAbove(line.kind))
        rows_.push_back(contract::StyledText::make(" "));
    rows_.push_back(printed(line));
}

void ReportSaver::write(const std::string& bytes)
{
    if (!isOver_ && file_.write(bytes.data(), static_cast<qint64>(bytes.size())) < 0)
        fail(file_.errorString());
}

void ReportSaver::beginPages()
{
    if (!pages_.open())
        return fail(pages_.errorString());
    printer_ = std::make_unique<QPrinter>(QPrinter::HighResolution);
    printer_->setOutputFormat(QPrinter::PdfFormat);
    printer_->setOutputFileName(pages_.fileName());
    printer_->setDocName(toQt(report_->title()));
    printer_->setPageMargins({paperMargin, paperMargin, paperMargin, paperMargin},
                             QPageLayout::Millimeter);
    contract::PrintInfo info;
    info.horizontalPagination = contract::Pagination::Fit;
    info.isHorizontallyCentered = false;
    info.isVerticallyCentered = false;
    const PrintHeader header{toQt(report_->title()),
                             toQt(zonedTime(std::chrono::system_clock::now())),
                             [this](int page, int pages) {
                                 return toQt(texts_.sentence("Page %ld of %ld", {page, pages}));
                             }};
    printing_ = std::make_unique<PrintJob>(*printer_, std::exchange(rows_, {}),
                                           contract::Font::system(11), info, header);
    phase_ = Phase::Print;
}

void ReportSaver::print()
{
    const PrintJob::State state = printing_->work(std::chrono::milliseconds(slice));
    if (state == PrintJob::State::Failed)
        return fail(text("The pages could not be made."));
    if (state == PrintJob::State::Done)
        phase_ = Phase::Copy;
    showProgress(0.2 + 0.7 * printing_->progress());
}

// The printer has written to the file by its name.
void ReportSaver::copyPages()
{
    const QByteArray bytes = pages_.read(copiedAtOnce);
    if (bytes.isEmpty())
        return pages_.error() == QFile::NoError ? finish() : fail(pages_.errorString());
    write(bytes.toStdString());
}

void ReportSaver::finish()
{
    if (isOver_)
        return;
    if (!file_.commit())
        return fail(file_.errorString());
    end({});
}

void ReportSaver::fail(const QString& reason)
{
    file_.cancelWriting();
    end(texts_.sentence("The report could not be saved as ‘%@’: %@",
                        {contract::printable(fromQt(file_.fileName())), fromQt(reason)}));
}

void ReportSaver::showProgress(double done)
{
    if (progress_)
        progress_->setValue(static_cast<int>(done * (progressSteps - 1)));
}

// Told from the loop, because the listener deletes this.
void ReportSaver::end(const std::string& failure)
{
    if (std::exchange(isOver_, true))
        return;
    nextSlice_.stop();
    if (progress_)
        progress_->hide();
    QTimer::singleShot(0, &nextSlice_, [ended = ended_, failure] { ended(failure); });
}

}  // namespace orvane::desktop
