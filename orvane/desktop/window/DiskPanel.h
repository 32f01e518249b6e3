// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/desktop/window/DiskList.h"

#include <QLineEdit>
#include <QWidget>

namespace orvane::desktop {

/// The list of disks, and above it the field in which the user says which of them to show. Main
/// thread.
class DiskPanel final : public QWidget {
public:
    explicit DiskPanel(const Translator& texts, QWidget* parent = nullptr);

    DiskList& list() { return *list_; }
    const DiskList& list() const { return *list_; }

    /// Puts the cursor into the field.
    void search();
    /// Where there is little room, the field is there only while it is used.
    void setCompact(bool isCompact);

protected:
    void changeEvent(QEvent* event) override;
    bool eventFilter(QObject* watched, QEvent* event) override;

private:
    void adoptFont();
    void adoptRoom();
    void leave();

    QLineEdit* field_;
    QAction* clear_;
    DiskList* list_;
    bool isCompact_ = false;
};

}  // namespace orvane::desktop
