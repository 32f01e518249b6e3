// SPDX-License-Identifier: Apache-2.0
#pragma once

// The module speaks the contract's language on every line: here its names need no prefix.
namespace contract {
}
namespace fixwell {
using namespace contract;
}  // namespace fixwell
