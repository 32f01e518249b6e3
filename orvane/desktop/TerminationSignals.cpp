// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/TerminationSignals.h"

#include <sys/signalfd.h>
#include <unistd.h>
#include <csignal>

#include <utility>

namespace orvane::desktop {
namespace {

sigset_t endingSignals()
{
    sigset_t ending;
    sigemptyset(&ending);
    for (const int number : {SIGINT, SIGTERM, SIGHUP})
        sigaddset(&ending, number);
    return ending;
}

}  // namespace

TerminationSignals::TerminationSignals()
{
    // Output that nobody reads any more must not end a repair in its middle.
    std::signal(SIGPIPE, SIG_IGN);
    const sigset_t ending = endingSignals();
    ::pthread_sigmask(SIG_BLOCK, &ending, nullptr);
    descriptor_ = FileDescriptor(::signalfd(-1, &ending, SFD_CLOEXEC | SFD_NONBLOCK));
}

void TerminationSignals::watch(std::function<void()> received)
{
    if (!descriptor_)
        return;
    received_ = std::move(received);
    notifier_ = std::make_unique<QSocketNotifier>(descriptor_.get(), QSocketNotifier::Read);
    QObject::connect(notifier_.get(), &QSocketNotifier::activated, notifier_.get(),
                     [this] { take(); });
}

void TerminationSignals::take()
{
    signalfd_siginfo information{};
    while (::read(descriptor_.get(), &information, sizeof information) == sizeof information)
        received_();
}

}  // namespace orvane::desktop
