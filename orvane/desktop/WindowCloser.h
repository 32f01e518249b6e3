// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/desktop/ModuleTabs.h"

#include <QMessageBox>
#include <QPointer>

#include <functional>

namespace orvane::desktop {

/// How the window is closed while a job runs, and when none does. Main thread.
class WindowCloser {
public:
    /// `closed` is told that the window is closed for good.
    WindowCloser(const SessionParts& parts, std::function<void()> closed)
        : at_(parts), closed_(std::move(closed))
    {
    }
    WindowCloser(const WindowCloser&) = delete;
    WindowCloser& operator=(const WindowCloser&) = delete;

    /// NO while a job runs; the user is asked whether it is to be stopped.
    bool mayClose();
    /// Stops the job that runs, and closes the window when it is over.
    void stopAndClose();
    /// Likewise; asked again, the job is stopped harder.
    void end();
    /// The window is to be closed as soon as it can be.
    bool isEnding() const { return isEnding_; }
    /// The window is free again.
    void jobEnded();

private:
    void askWhetherToStop();
    bool isCheck() const;

    const SessionParts at_;
    const std::function<void()> closed_;
    QPointer<QMessageBox> question_;
    bool isEnding_ = false;
};

}  // namespace orvane::desktop
