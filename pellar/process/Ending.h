// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <variant>

namespace pellar {

struct Exited {
    int status;
    friend bool operator==(const Exited&, const Exited&) = default;
};

struct Killed {
    int signal;
    friend bool operator==(const Killed&, const Killed&) = default;
};

struct NotStarted {
    int error;  ///< errno
    friend bool operator==(const NotStarted&, const NotStarted&) = default;
};

/// How a run of a tool ended. Only `Exited` carries a status, so a tool that crashed or never
/// started cannot be mistaken for one that answered 0.
using Ending = std::variant<Exited, Killed, NotStarted>;

}  // namespace pellar
