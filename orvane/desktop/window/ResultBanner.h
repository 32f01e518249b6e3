// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/desktop/window/ResultSummary.h"

#include <QHBoxLayout>
#include <QLabel>
#include <QPushButton>
#include <QWidget>

#include <functional>
#include <string>

namespace orvane::desktop {

/// What came out of the last job, in one sentence, with what can be done next as buttons; takes no
/// room while there is nothing to say. Main thread.
class ResultBanner final : public QWidget {
public:
    struct Events {
        std::function<void(NextStep step)> stepChosen;
        std::function<void(const std::string& identifier)> diskChosen;
    };

    explicit ResultBanner(const Translator& texts, QWidget* parent = nullptr);
    void setEvents(Events events) { events_ = std::move(events); }

    /// Nothing happens where it is shown already; what the user has closed stays closed.
    void show(const ResultSummary& summary);
    /// Where there is little room: without the details, and the buttons without their symbols.
    void setCompact(bool isCompact);

    const ResultSummary& summary() const { return shown_; }

protected:
    void paintEvent(QPaintEvent* event) override;
    void changeEvent(QEvent* event) override;

private:
    void fill();
    void addButtons();
    void adoptColors();

    const Translator& texts_;
    Events events_;
    ResultSummary shown_;
    bool isCompact_ = false;
    QLabel* icon_;
    QLabel* title_;
    QLabel* details_;
    QHBoxLayout* buttons_;
    QPushButton* close_;
};

}  // namespace orvane::desktop
