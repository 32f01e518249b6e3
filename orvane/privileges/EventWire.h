// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/jobs/EventQueue.h"

#include <optional>
#include <string>
#include <string_view>

namespace orvane {

/// A job's event as one line of JSON without its end, and back. What a line of another program
/// holds is no event.
[[nodiscard]] std::string lineFromEvent(const pellar::Event& event);
[[nodiscard]] std::optional<pellar::Event> eventFromLine(std::string_view line);

}  // namespace orvane
