// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/loop/EndingSignals.h"

#include <sys/signalfd.h>
#include <unistd.h>

namespace orvane {

EndingSignals::EndingSignals()
{
    std::signal(SIGPIPE, SIG_IGN);
    sigset_t signals;
    sigemptyset(&signals);
    for (const int number : {SIGINT, SIGTERM, SIGHUP})
        sigaddset(&signals, number);
    ::pthread_sigmask(SIG_BLOCK, &signals, &before_);
    descriptor_ = FileDescriptor(::signalfd(-1, &signals, SFD_CLOEXEC | SFD_NONBLOCK));
}

EndingSignals::~EndingSignals()
{
    ::pthread_sigmask(SIG_SETMASK, &before_, nullptr);
}

bool EndingSignals::take()
{
    signalfd_siginfo information{};
    return ::read(descriptor(), &information, sizeof information) == sizeof information;
}

}  // namespace orvane
