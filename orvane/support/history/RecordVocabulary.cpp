// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/history/RecordVocabulary.h"

#include "orvane/support/settings/ValueJSON.h"

#include <algorithm>
#include <utility>

namespace orvane {
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
