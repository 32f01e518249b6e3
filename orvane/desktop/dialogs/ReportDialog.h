// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/jobs/Report.h"
#include "orvane/support/texts/Catalogue.h"

#include <QCheckBox>
#include <QDialog>
#include <QRadioButton>

#include <functional>

namespace orvane::desktop {

/// Asks what a report is to tell, and under which name it is saved. Main thread.
class ReportDialog final : public QDialog {
public:
    using Chosen = std::function<void(ReportScope scope, const QString& file)>;

    /// `subject` is what the report is about, one line. The texts outlive the dialog.
    ReportDialog(const QString& subject, bool showsDetails, const Translator& texts, Chosen chosen,
                 QWidget* parent);

private:
    QString text(std::string_view key) const;
    void chooseFile();

    const Translator& texts_;
    const QString subject_;
    const Chosen chosen_;
    QRadioButton* lastAlone_;
    QCheckBox* details_;
};

}  // namespace orvane::desktop
