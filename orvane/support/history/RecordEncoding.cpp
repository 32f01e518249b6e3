// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/history/RecordEncoding.h"

#include "contract/pellar/MessageKeys.h"
#include "orvane/support/settings/ValueJSON.h"

#include <algorithm>
#include <array>
#include <utility>

namespace orvane {
namespace {

using contract::Dictionary;
using contract::Kind;
using contract::Name;
using contract::Value;

// The log's own keys, which the module adds to a library message.
const Name originKey{"kOV_typeOfOutputKey"};
const Name finalTextKey{"kOV_finalAttributedString_type"};
const std::array<Value, 3> origins{Name{"kOV_typeOfOutput_string"}, Name{"kOV_typeOfOutput_dict"},
                                   Name{"kOV_typeOfOutput_OV_addition"}};
const std::array<Name, 7> types{
    contract::kFsckVerify, contract::kFsckRepair,  contract::kFsckError,   contract::kFsckSuccess,
    contract::kFsckFail,   contract::kFsckProblem, contract::kFsckProgress};

bool isOrigin(const Value& value)
{
    return std::find(origins.begin(), origins.end(), value) != origins.end();
}

bool isInOneStyle(const Value& value)
{
    return value.kind() == Kind::StyledText && value.styledText().runs().size() < 2;
}

RecordSlot slotFor(Name key, const Value& value)
{
    const Kind kind = value.kind();
    if (key == finalTextKey && isInOneStyle(value))
        return RecordSlot::Text;
    if (key == contract::kFsckVerbosity && kind == Kind::Integer)
        return RecordSlot::Verbosity;
    if (key == originKey && kind == Kind::String && isOrigin(value))
        return RecordSlot::Origin;
    if (key == contract::kFsckMessageType && kind == Kind::String)
        return RecordSlot::Type;
    if (key == contract::kFsckMessageString && kind == Kind::String)
        return RecordSlot::Message;
    return RecordSlot::Extra;
}

RecordShape::Entry shapeOf(const Dictionary::Entry& entry)
{
    const RecordSlot slot = slotFor(entry.key, entry.value);
    return {entry.key, slot, slot == RecordSlot::Origin ? entry.value : Value()};
}

// A million rows with the same type share one value.
Value typeNamed(std::string_view text)
{
    const auto known =
        std::find_if(types.begin(), types.end(), [=](Name name) { return name.text() == text; });
    return known != types.end() ? Value(*known) : Value(text);
}

/// Hands out the values of the extra column, in the order of the shape.
class Extras {
public:
    explicit Extras(std::string_view text)
    {
        if (!text.empty())
            values_ = parsedJSON(text);
    }

    Value next()
    {
        if (!values_.is_array() || next_ >= values_.size())
            return {};
        try {
            return valueFromJSON(values_[next_++]);
        } catch (const nlohmann::json::exception&) {
            return {};
        }
    }

private:
    nlohmann::json values_;
    std::size_t next_ = 0;
};

}  // namespace

RecordShape RecordShape::of(const Dictionary& record)
{
    RecordShape shape;
    for (const Dictionary::Entry& entry : record.entries())
        shape.entries.push_back(shapeOf(entry));
    return shape;
}

bool RecordShape::fits(const Dictionary& record) const
{
    const auto given = record.entries();
    return std::equal(entries.begin(), entries.end(), given.begin(), given.end(),
                      [](const Entry& mine, const Dictionary::Entry& entry) {
                          return mine.key == entry.key &&
                                 mine.slot == slotFor(entry.key, entry.value) &&
                                 (mine.slot != RecordSlot::Origin || mine.origin == entry.value);
                      });
}

std::string RecordShape::toJSON() const
{
    nlohmann::json list = nlohmann::json::array();
    for (const Entry& entry : entries)
        list.push_back(nlohmann::json::array({jsonFromValue(entry.key.text()),
                                              std::string(1, static_cast<char>(entry.slot)),
                                              jsonFromValue(entry.origin)}));
    return list.dump();
}

std::optional<RecordShape> RecordShape::fromJSON(std::string_view text)
{
    const auto list = parsedJSON(text);
    if (!list.is_array())
        return std::nullopt;
    RecordShape shape;
    try {
        for (const auto& entry : list)
            shape.entries.push_back({Name(valueFromJSON(entry.at(0)).string()),
                                     static_cast<RecordSlot>(entry.at(1).get<std::string>().at(0)),
                                     typeNamed(valueFromJSON(entry.at(2)).string())});
    } catch (const std::exception&) {
        return std::nullopt;
    }
    return shape;
}

RecordColumns columnsOf(const Dictionary& record, const RecordShape& shape, std::string& room)
{
    RecordColumns columns;
    nlohmann::json extras;
    for (std::size_t i = 0; i < shape.entries.size(); ++i) {
        const Value& value = record.entries()[i].value;
        switch (shape.entries[i].slot) {
            case RecordSlot::Type: columns.type = value.string(); break;
            case RecordSlot::Verbosity: columns.verbosity = value.integer(); break;
            case RecordSlot::Message: columns.message = value.string(); break;
            case RecordSlot::Text:
                columns.text = value.styledText().characters();
                columns.style = &value.styledText().style();
                break;
            case RecordSlot::Origin: break;
            case RecordSlot::Extra: extras.push_back(jsonFromValue(value)); break;
        }
    }
    room.clear();
    if (!extras.empty())
        room = extras.dump();
    columns.extra = room;
    return columns;
}

Dictionary recordFrom(const RecordColumns& columns, const RecordShape& shape)
{
    Extras extras(columns.extra);
    const Dictionary record = Dictionary::make();
    for (const RecordShape::Entry& entry : shape.entries) {
        switch (entry.slot) {
            case RecordSlot::Type: record.set(entry.key, typeNamed(columns.type)); break;
            case RecordSlot::Verbosity: record.set(entry.key, columns.verbosity); break;
            case RecordSlot::Message: record.set(entry.key, columns.message); break;
            case RecordSlot::Text:
                record.set(entry.key,
                           contract::StyledText::make(columns.text, columns.style != nullptr
                                                                        ? *columns.style
                                                                        : contract::TextStyle()));
                break;
            case RecordSlot::Origin: record.set(entry.key, entry.origin); break;
            case RecordSlot::Extra: record.set(entry.key, extras.next()); break;
        }
    }
    return record;
}

namespace {

contract::TextStyle readStyle(const std::string& text)
{
    try {
        return styleFromJSON(parsedJSON(text));
    } catch (const nlohmann::json::exception&) {
        return {};
    }
}

}  // namespace

RecordVocabulary::RecordVocabulary(Database& database)
    : styles_(database, "styles", "style"), shapes_(database, "shapes", "shape")
{
}

// The shape that fitted last fits most often, so it is kept in front.
const RecordVocabulary::NumberedShape* RecordVocabulary::shapeOf(const contract::Dictionary& record)
{
    const auto known = std::find_if(shapesWritten_.begin(), shapesWritten_.end(),
                                    [&](const auto& one) { return one.shape.fits(record); });
    if (known != shapesWritten_.end()) {
        std::rotate(shapesWritten_.begin(), known, known + 1);
        return &shapesWritten_.front();
    }
    NumberedShape shape{RecordShape::of(record), 0};
    shape.number = shapes_.intern(shape.shape.toJSON());
    if (shape.number == 0)
        return nullptr;
    // A tool that makes up keys without end must not make the search long.
    if (shapesWritten_.size() >= 64)
        shapesWritten_.pop_back();
    shapesWritten_.push_front(std::move(shape));
    return &shapesWritten_.front();
}

std::int64_t RecordVocabulary::numberOf(const contract::TextStyle* style)
{
    if (const auto known = stylesWritten_.find(style); known != stylesWritten_.end())
        return known->second;
    const std::int64_t number = styles_.intern(jsonFromStyle(*style).dump());
    if (number != 0)
        stylesWritten_.emplace(style, number);
    return number;
}

const contract::TextStyle* RecordVocabulary::style(std::int64_t number)
{
    if (const auto known = stylesRead_.find(number); known != stylesRead_.end())
        return &known->second;
    const auto text = styles_.text(number);
    return &stylesRead_.emplace(number, text ? readStyle(*text) : contract::TextStyle())
                .first->second;
}

const RecordShape& RecordVocabulary::shape(std::int64_t number)
{
    if (const auto known = shapesRead_.find(number); known != shapesRead_.end())
        return known->second;
    const auto text = shapes_.text(number);
    const auto shape = text ? RecordShape::fromJSON(*text) : std::nullopt;
    return shapesRead_.emplace(number, shape.value_or(RecordShape())).first->second;
}

void RecordVocabulary::forget()
{
    shapesWritten_.clear();
    stylesWritten_.clear();
    stylesRead_.clear();
    shapesRead_.clear();
}

}  // namespace orvane
