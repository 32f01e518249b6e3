// SPDX-License-Identifier: Apache-2.0
#include "orvane/privileges/EventWire.h"

#include "orvane/support/settings/ValueJSON.h"

namespace orvane {
namespace {

using nlohmann::json;

json jsonFromText(const std::string& text)
{
    return jsonFromValue(contract::Value(std::string_view(text)));
}

json jsonFromDictionary(const contract::Dictionary& dictionary)
{
    return dictionary ? jsonFromValue(contract::Value(dictionary)) : json();
}

struct Writer {
    json operator()(const pellar::Started&) const { return json::array({"started"}); }
    json operator()(const pellar::Message& message) const
    {
        return json::array(
            {"message", jsonFromText(message.text), jsonFromDictionary(message.dictionary)});
    }
    json operator()(const pellar::Trace& trace) const
    {
        return json::array({"trace", jsonFromText(trace.line)});
    }
    json operator()(const pellar::Finished& finished) const
    {
        return json::array({"finished", finished.mainError, finished.detailError,
                            jsonFromDictionary(finished.result)});
    }
};

std::string textFromJSON(const json& part)
{
    return std::string(valueFromJSON(part).string());
}

std::optional<pellar::Event> read(const json& parts)
{
    const auto& kind = parts.at(0).get_ref<const std::string&>();
    if (kind == "started")
        return pellar::Started{};
    if (kind == "message")
        return pellar::Message{textFromJSON(parts.at(1)), valueFromJSON(parts.at(2)).dictionary()};
    if (kind == "trace")
        return pellar::Trace{textFromJSON(parts.at(1))};
    if (kind == "finished")
        return pellar::Finished{parts.at(1).get<std::int32_t>(), parts.at(2).get<std::int32_t>(),
                                valueFromJSON(parts.at(3)).dictionary()};
    return std::nullopt;
}

}  // namespace

std::string lineFromEvent(const pellar::Event& event)
{
    return std::visit(Writer{}, event).dump();
}

std::optional<pellar::Event> eventFromLine(std::string_view line)
{
    const json parts = parsedJSON(line);
    if (!parts.is_array() || parts.empty())
        return std::nullopt;
    try {
        return read(parts);
    } catch (const json::exception&) {
        return std::nullopt;
    }
}

}  // namespace orvane
