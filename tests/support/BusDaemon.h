// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "tests/support/TestDirectory.h"

#include <sys/types.h>

#include <string>

namespace orvane::test {

/// A bus of the test's own, on which nothing is started by itself; it ends with this object.
class BusDaemon {
public:
    BusDaemon();
    BusDaemon(const BusDaemon&) = delete;
    BusDaemon& operator=(const BusDaemon&) = delete;
    ~BusDaemon();

    /// NO where no bus can be started (no dbus-daemon).
    bool isRunning() const { return !address_.empty(); }
    const std::string& address() const { return address_; }

private:
    const TestDirectory directory_;
    pid_t daemon_ = 0;
    std::string address_;
};

}  // namespace orvane::test
