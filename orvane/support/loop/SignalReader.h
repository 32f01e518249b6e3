// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/process/FileDescriptor.h"

#include <csignal>

namespace orvane {

/// Takes the signals by which a user or the system ends a program (SIGINT, SIGTERM, SIGHUP) off
/// their ordinary way, from this object's making until its end: they can be read from a
/// descriptor instead. Threads that are started while it lives leave them alone; none may be
/// running before. From then on a write to a closed pipe is an error and no signal: output that is
/// not read any more must not end a repair in its middle.
class SignalReader {
public:
    SignalReader();
    SignalReader(const SignalReader&) = delete;
    SignalReader& operator=(const SignalReader&) = delete;
    ~SignalReader();

    /// Readable when a signal has come (signalfd(2)); -1 when the system gave none.
    int descriptor() const { return descriptor_.get(); }
    /// Takes the oldest signal that has come; NO when there is none.
    [[nodiscard]] bool take();

private:
    sigset_t before_{};
    pellar::FileDescriptor descriptor_;
};

}  // namespace orvane
