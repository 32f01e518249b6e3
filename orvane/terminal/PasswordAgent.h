// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <sys/types.h>

#include <memory>

namespace orvane {

/// Asks on the terminal for the passwords that the system's policy wants for what this program has
/// others do, for as long as it lives (pkttyagent(1)). Main thread.
///
/// pkexec(1) can ask as well, but is not believed where there is no login session of its own, as
/// over ssh: the answer is then "No session for cookie" (polkit 122). UDisks2 cannot ask at all.
class PasswordAgent {
public:
    /// Returns when it can ask; none where there is no terminal or no pkttyagent.
    [[nodiscard]] static std::unique_ptr<PasswordAgent> start();
    PasswordAgent(const PasswordAgent&) = delete;
    PasswordAgent& operator=(const PasswordAgent&) = delete;
    ~PasswordAgent();

    /// A Ctrl-C at its prompt ends it.
    [[nodiscard]] bool isRunning();

private:
    explicit PasswordAgent(pid_t id) : id_(id) {}

    pid_t id_;  ///< -1 when it has ended
};

}  // namespace orvane
