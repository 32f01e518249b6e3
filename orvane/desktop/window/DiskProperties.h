// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/desktop/window/DiskRow.h"

#include <QString>

#include <vector>

namespace orvane::desktop {

/// One fact about a disk, fit to be shown as plain text.
struct DiskProperty {
    QString name;
    QString value;  ///< may have several lines
};

struct NamedCheck {
    std::string part;  ///< of the disk; empty for the disk itself
    Check check;
};

/// All that is known of a disk; what is not known is left out. `runs` are those on it and on its
/// parts, the newest first.
[[nodiscard]] std::vector<DiskProperty> propertiesOf(const DiskRow& row,
                                                     const std::vector<NamedCheck>& runs,
                                                     const Translator& texts);

/// "Name: VALUE" on lines; the further lines of a value are indented.
[[nodiscard]] QString plainText(const std::vector<DiskProperty>& properties);

}  // namespace orvane::desktop
