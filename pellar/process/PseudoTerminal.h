// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/process/FileDescriptor.h"

#include <optional>

namespace pellar {

/// A pseudo-terminal for a program that holds its output back unless it sees one (pty(7)): raw, so
/// that nothing is added to what is written, without echo, and so wide that nobody wraps a line.
/// It becomes nobody's controlling terminal. The read end does not block; it answers EIO when every
/// writer is gone. None when the system has no pseudo-terminals, as in a bare rescue shell.
[[nodiscard]] std::optional<Pipe> makePseudoTerminal();

}  // namespace pellar
