// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Bundle.h"
#include "contract/toolkit/Printing.h"
#include "orvane/desktop/toolkit/PrintJob.h"

#include <QPointer>
#include <QPrinter>
#include <QProgressDialog>
#include <QTimer>
#include <QWidget>

#include <functional>
#include <memory>

namespace orvane::desktop {

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
    void start(std::shared_ptr<QPrinter> printer, const contract::PrintInfo& info);
    void goOn();
    void end(bool hasFailed);

    const contract::Bundle& texts_;
    Failed failed_;
    std::function<std::string()> title_;
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
