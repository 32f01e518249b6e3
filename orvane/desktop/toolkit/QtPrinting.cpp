// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/QtPrinting.h"

#include "orvane/desktop/toolkit/DesktopFont.h"
#include "orvane/desktop/toolkit/LogModel.h"
#include "orvane/desktop/toolkit/StyledLine.h"

#include <QPainter>
#include <QPrintDialog>

#include <algorithm>
#include <cmath>
#include <memory>

namespace orvane::desktop {
namespace {

constexpr double smallestScale = 0.5;
constexpr double lineSpacing = 1.15;

/// How the rows lie on the pages, in units of the scaled painter.
struct PageLayout {
    double scale = 1;
    double width = 0;  ///< of the page
    double height = 0;
    double left = 0;  ///< where rows start
    double rowHeight = 1;
    std::size_t rowsPerPage = 1;
};

LineLooks paperLooks(const fixwell::OutlineView& view)
{
    LineLooks looks;
    looks.defaultFont = view.dataCell() != nullptr ? view.dataCell()->font() : fixwell::Font();
    looks.textColor = Qt::black;
    looks.background = Qt::white;
    return looks;
}

double widestRow(fixwell::OutlineView& view, QPrinter& printer, const LineLooks& looks)
{
    double widest = 0;
    for (std::size_t row = 0; row < view.numberOfRows(); ++row) {
        const StyledLine line = oneLine(textOfRow(view, row));
        const QFontMetricsF metrics(widestFont(line, looks), &printer);
        widest = std::max(widest, metrics.horizontalAdvance(line.text));
    }
    return widest;
}

PageLayout layoutOf(fixwell::OutlineView& view, QPrinter& printer, const fixwell::PrintInfo& info,
                    const LineLooks& looks)
{
    const QRectF page = printer.pageLayout().paintRectPixels(printer.resolution());
    const double widest = std::max(1.0, widestRow(view, printer, looks) + 1);
    PageLayout layout;
    if (info.horizontalPagination == fixwell::Pagination::Fit)
        layout.scale = std::clamp(page.width() / widest, smallestScale, 1.0);
    layout.width = page.width() / layout.scale;
    layout.height = page.height() / layout.scale;
    if (info.isHorizontallyCentered)
        layout.left = std::max(0.0, (layout.width - widest) / 2);
    fixwell::Font bold = looks.defaultFont;
    bold.isBold = true;
    layout.rowHeight =
        QFontMetricsF(scaledFont(bold, looks.fontScale), &printer).height() * lineSpacing;
    layout.rowsPerPage =
        std::max<std::size_t>(1, static_cast<std::size_t>(layout.height / layout.rowHeight));
    return layout;
}

void printPage(QPainter& painter, fixwell::OutlineView& view, std::size_t first, std::size_t count,
               const PageLayout& layout, const LineLooks& looks, bool isCentered)
{
    const double used = static_cast<double>(count) * layout.rowHeight;
    const double top = isCentered ? std::max(0.0, (layout.height - used) / 2) : 0;
    for (std::size_t i = 0; i < count; ++i)
        draw(painter,
             QRectF(layout.left, top + static_cast<double>(i) * layout.rowHeight,
                    layout.width - layout.left, layout.rowHeight),
             oneLine(textOfRow(view, first + i)), looks);
}

}  // namespace

bool printRows(QPrinter& printer, fixwell::OutlineView& view, const fixwell::PrintInfo& info)
{
    QPainter painter;
    if (!painter.begin(&printer))
        return false;
    const LineLooks looks = paperLooks(view);
    const PageLayout layout = layoutOf(view, printer, info, looks);
    painter.scale(layout.scale, layout.scale);
    const std::size_t rows = view.numberOfRows();
    for (std::size_t first = 0; first < rows; first += layout.rowsPerPage) {
        if (first > 0 && !printer.newPage())
            return false;
        printPage(painter, view, first, std::min(layout.rowsPerPage, rows - first), layout, looks,
                  info.isVerticallyCentered);
    }
    return painter.end() && printer.printerState() != QPrinter::Error;
}

QtPrinting::~QtPrinting()
{
    delete panel_;
}

void QtPrinting::forget(const fixwell::OutlineView& view)
{
    if (panelView_ == &view)
        delete panel_;
}

void QtPrinting::runPrintOperation(fixwell::OutlineView& view, const fixwell::PrintInfo& info,
                                   bool showsPanel, fixwell::Window* /*window*/)
{
    const auto printer = std::make_shared<QPrinter>(QPrinter::HighResolution);
    if (!showsPanel) {
        print(*printer, view, info);
        return;
    }
    delete panel_;
    auto* const panel = new QPrintDialog(printer.get(), window_);
    panel->setAttribute(Qt::WA_DeleteOnClose);
    panel->setOptions(QAbstractPrintDialog::PrintToFile);
    QObject::connect(panel, &QDialog::accepted, panel,
                     [this, printer, &view, info] { print(*printer, view, info); });
    panel_ = panel;
    panelView_ = &view;
    panel->open();
}

void QtPrinting::print(QPrinter& printer, fixwell::OutlineView& view,
                       const fixwell::PrintInfo& info)
{
    if (!printRows(printer, view, info) && failed_)
        failed_();
}

}  // namespace orvane::desktop
