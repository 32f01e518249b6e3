// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/QtPrinting.h"

#include "contract/foundation/Format.h"
#include "contract/foundation/UTF8.h"
#include "orvane/desktop/toolkit/LogModel.h"
#include "orvane/desktop/toolkit/Text.h"

#include <QDateTime>
#include <QLocale>
#include <QPrintDialog>

namespace orvane::desktop {
namespace {

constexpr std::chrono::milliseconds slice{20};
constexpr double paperMargin = 15;  // millimetres
constexpr int progressSteps = 1000;

// The records are shared with the history, not copied.
std::vector<contract::StyledText> rowsOf(contract::OutlineView& view)
{
    std::vector<contract::StyledText> rows;
    rows.reserve(view.numberOfRows());
    for (std::size_t row = 0; row < view.numberOfRows(); ++row)
        rows.push_back(textOfRow(view, row));
    return rows;
}

}  // namespace

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
    job_ = std::make_unique<PrintJob>(*printer_, rowsOf(*view_), font, info, header());
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
