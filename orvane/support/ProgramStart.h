// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string_view>

namespace orvane {

/// Sets right what the program's parent may have left it: standard streams that are closed,
/// a SIGCHLD that is ignored, and limits on the size of files and stacks. Once, before anything
/// else: no file is open and no thread runs. A stack that no work can be done on ends the program.
void setInheritanceRight();

/// "0.1.0"
[[nodiscard]] std::string_view programVersion();

}  // namespace orvane
