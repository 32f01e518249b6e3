// SPDX-License-Identifier: Apache-2.0
#include "fixwell/messagelog/MessageStyle.h"

#include "fixwell/messagelog/MessageRecord.h"

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

}  // namespace fixwell
