// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/desktop/window/LastCheck.h"
#include "orvane/support/texts/Translator.h"

#include <QString>

namespace orvane::desktop {

/// The columns of the disk list.
enum class DiskColumn { Name, Verdict, Size, Format, MountPoint, LastCheck };
inline constexpr int diskColumnCount = 6;

/// What the disk list says about one disk, beside its name. A bare image file and the volume that
/// fills it are one row.
struct DiskRow {
    DiskFacts facts;
    std::string filesystem;
    std::optional<LastCheck> lastCheck;
};

/// One line, fit to be shown; empty where there is nothing to say.
[[nodiscard]] QString cellText(const DiskRow& row, DiskColumn column, const Translator& texts);
[[nodiscard]] QString columnTitle(DiskColumn column, const Translator& texts);
/// Everything there is to say, on several lines of plain text.
/// What the disk is: its format or kind, size and mount point.
[[nodiscard]] QString rowDetails(const DiskRow& row, const Translator& texts);
/// Everything in one line, for those who hear it.
[[nodiscard]] QString rowSummary(const DiskRow& row, const Translator& texts);
[[nodiscard]] QString rowToolTip(const DiskRow& row, const Translator& texts);
/// The library's verdict in the user's language.
[[nodiscard]] QString verdictText(const LastCheck& check, const Translator& texts);

}  // namespace orvane::desktop
