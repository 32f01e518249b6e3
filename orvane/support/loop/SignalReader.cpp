// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/loop/SignalReader.h"

#include <sys/signalfd.h>
#include <unistd.h>

namespace orvane {

SignalReader::SignalReader()
{
    std::signal(SIGPIPE, SIG_IGN);
    sigset_t signals;
    sigemptyset(&signals);
    for (const int number : {SIGINT, SIGTERM, SIGHUP})
        sigaddset(&signals, number);
    ::pthread_sigmask(SIG_BLOCK, &signals, &before_);
    descriptor_ = pellar::FileDescriptor(::signalfd(-1, &signals, SFD_CLOEXEC | SFD_NONBLOCK));
}

SignalReader::~SignalReader()
{
    ::pthread_sigmask(SIG_SETMASK, &before_, nullptr);
}

bool SignalReader::take()
{
    signalfd_siginfo information{};
    return ::read(descriptor(), &information, sizeof information) == sizeof information;
}

}  // namespace orvane
