// SPDX-License-Identifier: Apache-2.0
#pragma once

namespace orvane {

/// Sets right what whoever started the program may have left it: standard streams that are closed,
/// and a SIGCHLD that is ignored. Once, before anything else: no file is open and no thread runs.
void setInheritanceRight();

}  // namespace orvane
