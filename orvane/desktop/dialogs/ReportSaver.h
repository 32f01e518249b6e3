// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/desktop/toolkit/QtPrinting.h"
#include "orvane/jobs/ReportEncoding.h"

#include <QPointer>
#include <QProgressDialog>
#include <QSaveFile>
#include <QTemporaryFile>
#include <QTimer>

#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace orvane::desktop {

/// Saves one report to a file, in slices, so that the window stays alive whatever its length, with
/// a sheet that shows how far it is once that takes long, and can give it up. What was there under
/// this name stays until the new file is complete. Main thread.
class ReportSaver final {
public:
    /// The name's ending says whether it becomes PDF (".pdf"), HTML (".html", ".htm") or text.
    /// `ended` is told a sentence in the user's language when it could not be saved, and nothing
    /// when it was, or was given up; the saver may be deleted then. The rest outlives this object.
    ReportSaver(std::unique_ptr<Report> report, const QString& file, const Translator& texts,
                QWidget& window, std::function<void(const std::string& failure)> ended);
    ReportSaver(const ReportSaver&) = delete;
    ReportSaver& operator=(const ReportSaver&) = delete;
    /// Gives up what is not complete.
    ~ReportSaver();

private:
    enum class Phase { Collect, Print, Copy };

    void work();
    void collect();
    void take(const ReportLine& line);
    void write(const std::string& bytes);
    void beginPages();
    void print();
    void copyPages();
    void finish();
    void fail(const QString& reason);
    void end(const std::string& failure);
    void showProgress(double done);
    QString text(std::string_view key) const;

    const std::unique_ptr<Report> report_;
    const Translator& texts_;
    const std::function<void(const std::string& failure)> ended_;
    QSaveFile file_;
    std::unique_ptr<ReportEncoding> encoding_;  ///< none for PDF
    Phase phase_ = Phase::Collect;
    bool isOver_ = false;

    // Of PDF, whose pages are laid out when all is known, in a file of its own.
    std::vector<contract::StyledText> rows_;
    QTemporaryFile pages_;
    std::unique_ptr<QPrinter> printer_;
    std::unique_ptr<PrintJob> printing_;

    QPointer<QProgressDialog> progress_;
    QTimer nextSlice_;
};

}  // namespace orvane::desktop
