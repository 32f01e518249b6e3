// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/settings/ValueJSON.h"

#include "contract/foundation/Array.h"
#include "contract/foundation/Dictionary.h"
#include "contract/foundation/UTF8.h"

#include <charconv>
#include <cmath>
#include <limits>

namespace orvane {
namespace {

using contract::Array;
using contract::Dictionary;
using contract::Kind;
using contract::StyledText;
using contract::TextStyle;
using contract::Value;
using nlohmann::json;

bool isUTF8(std::string_view text)
{
    constexpr std::string_view replacement = "\xEF\xBF\xBD";
    while (!text.empty()) {
        const std::string_view before = text;
        if (contract::takeCharacter(text) == 0xFFFD && !before.starts_with(replacement))
            return false;
    }
    return true;
}

std::string hexadecimal(std::string_view bytes)
{
    constexpr std::string_view digits = "0123456789abcdef";
    std::string text;
    for (const char c : bytes) {
        const auto byte = static_cast<unsigned char>(c);
        text += digits[byte >> 4U];
        text += digits[byte & 15U];
    }
    return text;
}

std::string bytesFrom(std::string_view text)
{
    std::string bytes;
    for (; text.size() >= 2; text.remove_prefix(2)) {
        unsigned byte = 0;
        std::from_chars(text.data(), text.data() + 2, byte, 16);
        bytes += static_cast<char>(byte);
    }
    return bytes;
}

json jsonFromString(std::string_view text)
{
    return isUTF8(text) ? json(text) : json{{"bytes", hexadecimal(text)}};
}

std::string stringFromJSON(const json& text)
{
    if (text.is_string())
        return text.get<std::string>();
    return text.is_object() ? bytesFrom(text.value("bytes", "")) : std::string();
}

json jsonFromReal(double real)
{
    if (std::isfinite(real))
        return real;
    return {{"real", std::isnan(real) ? "nan" : real > 0 ? "inf" : "-inf"}};
}

Value realFrom(const std::string& word)
{
    const double infinity = std::numeric_limits<double>::infinity();
    if (word == "nan")
        return std::numeric_limits<double>::quiet_NaN();
    return word == "-inf" ? -infinity : infinity;
}

json jsonFromArray(const Array& array)
{
    json list = json::array();
    for (const Value& value : array.values())
        list.push_back(jsonFromValue(value));
    return list;
}

json jsonFromDictionary(const Dictionary& dictionary)
{
    json entries = json::array();
    for (const Dictionary::Entry& entry : dictionary.entries())
        entries.push_back(
            json::array({jsonFromString(entry.key.text()), jsonFromValue(entry.value)}));
    return {{"dictionary", entries}};
}

json jsonFromStyledText(const StyledText& text)
{
    json runs = json::array();
    std::string_view left = text.characters();
    for (const StyledText::Run& run : text.runs()) {
        runs.push_back(
            json::array({jsonFromString(left.substr(0, run.length)), jsonFromStyle(*run.style)}));
        left.remove_prefix(run.length);
    }
    if (runs.empty())
        runs.push_back(json::array({"", jsonFromStyle(text.style())}));
    return {{"styled", runs}};
}

Value arrayFrom(const json& list)
{
    const Array array = Array::make();
    for (const json& value : list)
        array.append(valueFromJSON(value));
    return array;
}

Value dictionaryFrom(const json& entries)
{
    const Dictionary dictionary = Dictionary::make();
    for (const json& entry : entries)
        dictionary.set(contract::Name(stringFromJSON(entry.at(0))), valueFromJSON(entry.at(1)));
    return dictionary;
}

Value styledTextFrom(const json& runs)
{
    StyledText text;
    for (const json& run : runs) {
        const StyledText piece =
            StyledText::make(stringFromJSON(run.at(0)), styleFromJSON(run.at(1)));
        if (text)
            text.append(piece);
        else
            text = piece;
    }
    return text;
}

Value taggedFrom(const json& object)
{
    if (object.contains("bytes"))
        return stringFromJSON(object);
    if (object.contains("real"))
        return realFrom(object.at("real").get<std::string>());
    if (object.contains("dictionary"))
        return dictionaryFrom(object.at("dictionary"));
    if (object.contains("styled"))
        return styledTextFrom(object.at("styled"));
    return {};
}

// Far more than anything that is written, far less than what a stack can bear.
constexpr int deepestNesting = 100;

}  // namespace

json parsedJSON(std::string_view text)
{
    bool isTooDeep = false;
    const auto watch = [&isTooDeep](int depth, json::parse_event_t, const json&) {
        isTooDeep |= depth > deepestNesting;
        return !isTooDeep;
    };
    json value = json::parse(text, watch, false);
    return isTooDeep ? json(json::value_t::discarded) : value;
}

json jsonFromValue(const Value& value)
{
    switch (value.kind()) {
        case Kind::None: return nullptr;
        case Kind::Boolean: return value.boolean();
        case Kind::Integer: return value.integer();
        case Kind::Real: return jsonFromReal(value.real());
        case Kind::String: return jsonFromString(value.string());
        case Kind::Array: return jsonFromArray(value.array());
        case Kind::Dictionary: return jsonFromDictionary(value.dictionary());
        case Kind::StyledText: return jsonFromStyledText(value.styledText());
        case Kind::Object: return jsonFromString(value.object()->description());
    }
    return nullptr;
}

Value valueFromJSON(const json& value)
{
    switch (value.type()) {
        case json::value_t::boolean: return value.get<bool>();
        case json::value_t::number_integer:
        case json::value_t::number_unsigned: return value.get<std::int64_t>();
        case json::value_t::number_float: return value.get<double>();
        case json::value_t::string: return value.get<std::string>();
        case json::value_t::array: return arrayFrom(value);
        case json::value_t::object: return taggedFrom(value);
        default: return {};
    }
}

json jsonFromStyle(const TextStyle& style)
{
    json object = json::object();
    if (style.font)
        object["font"] = {style.font->isBold, style.font->points};
    if (const auto& color = style.color)
        object["color"] = {color->red, color->green, color->blue, color->alpha};
    if (const auto& paragraph = style.paragraph)
        object["paragraph"] = {static_cast<int>(paragraph->lineBreak), paragraph->firstLineIndent,
                               paragraph->headIndent, paragraph->spacingAfter};
    return object;
}

TextStyle styleFromJSON(const json& object)
{
    TextStyle style;
    if (const auto font = object.find("font"); font != object.end())
        style.font = contract::Font{font->at(0).get<bool>(), font->at(1).get<double>()};
    if (const auto color = object.find("color"); color != object.end())
        style.color = contract::Color{color->at(0), color->at(1), color->at(2), color->at(3)};
    if (const auto paragraph = object.find("paragraph"); paragraph != object.end())
        style.paragraph =
            contract::ParagraphStyle{static_cast<contract::LineBreak>(paragraph->at(0).get<int>()),
                                     paragraph->at(1), paragraph->at(2), paragraph->at(3)};
    return style;
}

}  // namespace orvane
