// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/WindowCloser.h"

#include "orvane/desktop/window/Question.h"

namespace orvane::desktop {

bool WindowCloser::mayClose()
{
    if (at_.controller.interfaceLock()) {
        if (!isEnding_)
            askWhetherToStop();
        return false;
    }
    at_.window.saveLayout(at_.host.standardUserDefaults());
    if (closed_)
        closed_();
    return true;
}

void WindowCloser::askWhetherToStop()
{
    // A question that was answered lives on until the event loop has come to it.
    if (question_ != nullptr && question_->isVisible()) {
        question_->raise();
        return;
    }
    const Translator& texts = at_.host.translator();
    question_ = ask(
        at_.window,
        {"closingQuestion",
         texts.text(isCheck() ? "A disk is still being verified or repaired."
                              : "A job is still running."),
         texts.text(isCheck() ? "The job must be stopped before the window can be closed. A repair "
                                "that is stopped may leave damage behind."
                              : "The job must be stopped before the window can be closed."),
         {{texts.text("Stop and Quit"),
           [this] {
               stopAndClose();
           }}},
         texts.text("Keep Open")});
}

// A job whose images are still being read cannot be stopped yet; it is as soon as a tool begins.
// Where its Stop button was pressed too early, the tool itself is stopped.
void WindowCloser::stopAndClose()
{
    isEnding_ = true;
    at_.host.mainRunLoop().post([this] {
        if (!at_.controller.interfaceLock())
            at_.window.close();
        else if (at_.ledger.currentRun() != nullptr || !isCheck())
            at_.tabs.stopJob();
    });
}

bool WindowCloser::isCheck() const
{
    return at_.ledger.currentRun() != nullptr || at_.tabs.lastActionIsCheck();
}

void WindowCloser::end()
{
    if (isEnding_)
        at_.tabs.stopHarder();
    stopAndClose();
}

// Posted, because the module has not finished with the job when it gives the window free.
void WindowCloser::jobEnded()
{
    if (question_ != nullptr)
        question_->close();
    if (isEnding_)
        at_.host.mainRunLoop().post([this] { at_.window.close(); });
}

}  // namespace orvane::desktop
