// SPDX-License-Identifier: Apache-2.0
// How the window is closed while a job runs, and when none does.

#include "orvane/desktop/DesktopSession.h"
#include "orvane/desktop/toolkit/Text.h"
#include "orvane/desktop/window/WindowState.h"

#include <QPushButton>

namespace orvane::desktop {

bool DesktopSession::mayClose()
{
    if (controller_.interfaceLock()) {
        if (!isEnding_)
            askWhetherToStop();
        return false;
    }
    saveWindow(window_, host_.standardUserDefaults());
    if (options_.closed)
        options_.closed();
    return true;
}

void DesktopSession::askWhetherToStop()
{
    // A question that was answered lives on until the event loop has come to it.
    if (question_ != nullptr && question_->isVisible()) {
        question_->raise();
        return;
    }
    question_ = new QMessageBox(QMessageBox::Warning, toQt("Orvane"),
                                toQt(text("A disk is still being verified or repaired.")),
                                QMessageBox::NoButton, &window_);
    question_->setObjectName(QStringLiteral("closingQuestion"));
    question_->setTextFormat(Qt::PlainText);
    question_->setInformativeText(
        toQt(text("The job must be stopped before the window can be closed. A repair that is "
                  "stopped may leave damage behind.")));
    question_->setWindowModality(Qt::WindowModal);
    question_->setAttribute(Qt::WA_DeleteOnClose);
    QPushButton* const stop =
        question_->addButton(toQtTitle(text("Stop and Quit")), QMessageBox::DestructiveRole);
    QPushButton* const keep =
        question_->addButton(toQtTitle(text("Keep Open")), QMessageBox::RejectRole);
    question_->setDefaultButton(keep);
    question_->setEscapeButton(keep);
    QObject::connect(stop, &QPushButton::clicked, &window_, [this] { stopAndClose(); });
    question_->open();
}

// A job whose images are still being read cannot be stopped yet; it is as soon as a tool begins.
// Where its Stop button was pressed too early, the tool itself is stopped.
void DesktopSession::stopAndClose()
{
    isEnding_ = true;
    loop_.post([this] {
        if (!controller_.interfaceLock())
            window_.close();
        else if (jobs_.currentRun() != nullptr)
            stopJob();
    });
}

void DesktopSession::stopJob()
{
    for (const auto& tab : tabs_)
        if (tab->stopJob())
            return;
    for (const auto& tab : tabs_)
        tab->stopHarder();
}

void DesktopSession::end()
{
    if (isEnding_)
        for (const auto& tab : tabs_)
            tab->stopHarder();
    stopAndClose();
}

// Posted, because the module has not finished with the job when it gives the window free.
void DesktopSession::lockChanged(bool isLocked)
{
    if (isLocked) {
        jobBegan();
        return;
    }
    jobEnded();
    if (question_ != nullptr)
        question_->close();
    if (isEnding_)
        loop_.post([this] { window_.close(); });
}

}  // namespace orvane::desktop
