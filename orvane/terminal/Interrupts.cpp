// SPDX-License-Identifier: Apache-2.0
#include "orvane/terminal/Interrupts.h"

#include <poll.h>
#include <sys/signalfd.h>
#include <unistd.h>
#include <csignal>

namespace orvane {
namespace {

sigset_t endingSignals()
{
    sigset_t signals;
    sigemptyset(&signals);
    for (const int number : {SIGINT, SIGTERM, SIGHUP})
        sigaddset(&signals, number);
    return signals;
}

}  // namespace

Interrupts::Interrupts(MainLoop& loop, std::function<void()> interrupted)
    : loop_(loop), interrupted_(std::move(interrupted))
{
    // Output that nobody reads any more must not end a repair in its middle.
    std::signal(SIGPIPE, SIG_IGN);
    const sigset_t signals = endingSignals();
    ::pthread_sigmask(SIG_BLOCK, &signals, &before_);
    descriptor_ = FileDescriptor(::signalfd(-1, &signals, SFD_CLOEXEC | SFD_NONBLOCK));
    if (descriptor_)
        loop_.watch(descriptor_.get(), POLLIN, [this](short) { take(); });
}

Interrupts::~Interrupts()
{
    if (descriptor_)
        loop_.unwatch(descriptor_.get());
    ::pthread_sigmask(SIG_SETMASK, &before_, nullptr);
}

void Interrupts::take()
{
    signalfd_siginfo information{};
    while (::read(descriptor_.get(), &information, sizeof information) == sizeof information)
        interrupted_();
}

}  // namespace orvane
