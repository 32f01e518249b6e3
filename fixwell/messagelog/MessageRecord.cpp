// SPDX-License-Identifier: Apache-2.0
#include "fixwell/messagelog/MessageRecord.h"

#include "contract/foundation/Dictionary.h"
#include "contract/foundation/Format.h"

namespace fixwell {

TextStyle messageStyle(const Dictionary& record, const Color& errorColor, const Color& passColor)
{
    TextStyle style;
    style.font = verbosityOf(record) < verbosity::main ? Font::boldSystem(messageFontPoints)
                                                       : Font::system(messageFontPoints);
    const std::string_view type = record.string(kFsckMessageType);
    if (type == kFsckError.text() || type == kFsckFail.text())
        style.color = errorColor;
    else if (type == kFsckSuccess.text())
        style.color = passColor;
    return style;
}

namespace {

void replaceAll(std::string& text, std::string_view placeholder, std::string_view replacement)
{
    std::size_t at = text.find(placeholder);
    while (at != std::string::npos) {
        text.replace(at, placeholder.size(), replacement);
        at = text.find(placeholder, at + replacement.size());
    }
}

}  // namespace

std::string substitutedParameters(std::string_view text, const Array& parameters,
                                  const std::function<std::string(const Value&)>& decimal)
{
    const auto replacementFor = [&decimal](const Value& parameter) {
        if (parameter.kind() != Kind::Dictionary)
            return parameter.isNumber() ? decimal(parameter) : std::string(parameter.string());
        const Dictionary dictionary = parameter.dictionary();
        const Value first = dictionary.isEmpty() ? Value() : dictionary.entries().front().value;
        return first.isNumber() ? decimal(first) : std::string(first.string());
    };
    std::string result(text);
    for (std::size_t i = 0; i < parameters.size(); ++i)
        replaceAll(result, format("%%%ld$@", {i + 1}), replacementFor(parameters.at(i)));
    return result;
}

}  // namespace fixwell
