// SPDX-License-Identifier: Apache-2.0
#include "tests/terminal/Events.h"

#include <gtest/gtest.h>

#include <algorithm>

namespace orvane::test {

Events::Events(std::string_view output)
{
    while (!output.empty()) {
        const std::size_t end = output.find('\n');
        const std::string_view line = output.substr(0, end);
        output.remove_prefix(end == std::string_view::npos ? output.size() : end + 1);
        nlohmann::json event = nlohmann::json::parse(line, nullptr, false);
        if (event.is_object() && event.contains("event"))
            all_.push_back(std::move(event));
        else
            ADD_FAILURE() << "no event: " << line;
    }
}

std::vector<nlohmann::json> Events::named(std::string_view event) const
{
    std::vector<nlohmann::json> found;
    std::copy_if(all_.begin(), all_.end(), std::back_inserter(found),
                 [event](const nlohmann::json& one) { return one["event"] == event; });
    return found;
}

std::vector<std::string> Events::story(const std::vector<std::string>& names) const
{
    std::vector<std::string> story;
    for (const nlohmann::json& event : all_) {
        std::string line = event["event"];
        if (std::find(names.begin(), names.end(), line) == names.end())
            continue;
        for (const char* key : {"disk", "verdict"})
            if (event.contains(key))
                line += " " + event[key].get<std::string>();
        story.push_back(line);
    }
    return story;
}

std::vector<nlohmann::json> Events::recordsWith(std::string_view part) const
{
    std::vector<nlohmann::json> found = named("record");
    std::erase_if(found, [part](const nlohmann::json& record) {
        return record["text"].get<std::string>().find(part) == std::string::npos;
    });
    return found;
}

}  // namespace orvane::test
