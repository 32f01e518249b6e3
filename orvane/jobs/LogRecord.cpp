// SPDX-License-Identifier: Apache-2.0
#include "orvane/jobs/LogRecord.h"

#include "contract/foundation/StyledText.h"
#include "contract/pellar/MessageKeys.h"
#include "orvane/support/history/RunStart.h"

#include <array>

namespace orvane {
namespace {

const contract::Name libraryMessage{"kOV_typeOfOutput_dict"};
constexpr double fontPoints = 11;
constexpr contract::Color red{1, 0, 0, 1};
constexpr contract::Color green{0, 0.8, 0.2, 1};

contract::TextStyle styleOf(std::string_view type, std::int64_t verbosity)
{
    contract::TextStyle style;
    style.font = verbosity < contract::verbosity::main ? contract::Font::boldSystem(fontPoints)
                                                       : contract::Font::system(fontPoints);
    if (type == contract::kFsckError.text() || type == contract::kFsckFail.text())
        style.color = red;
    else if (type == contract::kFsckSuccess.text())
        style.color = green;
    return style;
}

/// The types of the library's messages; none for any other text.
std::optional<contract::Name> typeNamed(std::string_view text)
{
    for (const contract::Name& name :
         {contract::kFsckVerify, contract::kFsckRepair, contract::kFsckError,
          contract::kFsckSuccess, contract::kFsckFail, contract::kFsckProblem})
        if (name.text() == text)
            return name;
    return std::nullopt;
}

}  // namespace

contract::Dictionary logRecord(std::optional<contract::Name> type, const std::string& text,
                               std::int64_t verbosity)
{
    const std::string_view typeText = type ? type->text() : std::string_view();
    contract::Dictionary record = contract::Dictionary::of(
        {{contract::kFsckMessageString, std::string_view(text)},
         {contract::kFsckVerbosity, verbosity},
         {finalTextKey, contract::StyledText::make(text + "\n", styleOf(typeText, verbosity))}});
    if (type)
        record.set(contract::kFsckMessageType, *type);
    return record;
}

contract::Dictionary lineOfRun(contract::Dictionary record)
{
    record.set(typeOfOutputKey, libraryMessage);
    return record;
}

contract::Dictionary logRecordOf(const contract::Dictionary& message)
{
    const auto type = typeNamed(message.string(contract::kFsckMessageType));
    std::int64_t verbosity = message.integer(contract::kFsckVerbosity);
    if (type == contract::kFsckVerify || type == contract::kFsckRepair)
        verbosity = contract::verbosity::detail;
    else if (type == contract::kFsckError)
        verbosity = contract::verbosity::heading;
    return lineOfRun(
        logRecord(type, std::string(message.string(contract::kFsckMessageString)), verbosity));
}

}  // namespace orvane
