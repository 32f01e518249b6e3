// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <optional>
#include <string>

namespace pellar {

/// Any way of writing capabilities in the one of cap_to_text(3); none when it is no such text.
[[nodiscard]] std::optional<std::string> canonicalCapabilities(const std::string& text);

/// Of an object opened with O_PATH; empty when it has none. None when they cannot be read, or
/// belong to another user namespace.
[[nodiscard]] std::optional<std::string> capabilitiesOf(int object);

/// Sets them, or takes them away when `text` is empty. Answers 0 or errno.
[[nodiscard]] int setCapabilities(int object, const std::string& text);

}  // namespace pellar
