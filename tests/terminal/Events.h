// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <nlohmann/json.hpp>

#include <string>
#include <string_view>
#include <vector>

namespace orvane::test {

/// The events of a run with --json. A line that is no JSON object with an "event" fails the test.
class Events {
public:
    explicit Events(std::string_view output);

    const std::vector<nlohmann::json>& all() const { return all_; }
    std::vector<nlohmann::json> named(std::string_view event) const;
    std::size_t count(std::string_view event) const { return named(event).size(); }
    /// "started a.img", "finished a.img sound", "alert", ...: the events of these names, in order.
    std::vector<std::string> story(const std::vector<std::string>& names) const;
    /// The records whose text holds `part`.
    std::vector<nlohmann::json> recordsWith(std::string_view part) const;

private:
    std::vector<nlohmann::json> all_;
};

}  // namespace orvane::test
