// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "fixwell/host/toolkit/Printing.h"

#include <QPointer>
#include <QPrinter>
#include <QWidget>

#include <functional>

namespace orvane::desktop {

/// Prints all rows, with page breaks between rows. With `Pagination::Fit` the widest row is
/// scaled down to the width of the page, but to no less than half its size; what is still wider
/// is shortened as on the screen. NO when the printer cannot be written to.
[[nodiscard]] bool printRows(QPrinter& printer, fixwell::OutlineView& view,
                             const fixwell::PrintInfo& info);

class QtPrinting final : public fixwell::Printing {
public:
    /// Told when a page could not be printed.
    using Failed = std::function<void()>;

    explicit QtPrinting(Failed failed) : failed_(std::move(failed)) {}
    ~QtPrinting() override;

    /// The window that the print panel is shown on, whichever window a module names.
    void setWindow(QWidget* window) { window_ = window; }
    /// A view goes away: a print panel that is still open for it is closed.
    void forget(const fixwell::OutlineView& view);

    fixwell::PrintInfo& sharedPrintInfo() override { return info_; }
    void runPrintOperation(fixwell::OutlineView& view, const fixwell::PrintInfo& info,
                           bool showsPanel, fixwell::Window* window) override;

private:
    void print(QPrinter& printer, fixwell::OutlineView& view, const fixwell::PrintInfo& info);

    Failed failed_;
    fixwell::PrintInfo info_;
    QPointer<QWidget> window_;
    QPointer<QWidget> panel_;
    const fixwell::OutlineView* panelView_ = nullptr;  ///< only an identity
};

}  // namespace orvane::desktop
