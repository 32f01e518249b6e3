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
    std::string label;
    std::string filesystem;
    std::optional<LastCheck> lastCheck;
    std::string activity = {};  ///< as of DiskStates
    std::string note = {};
};

/// One line, fit to be shown; empty where there is nothing to say.
[[nodiscard]] QString cellText(const DiskRow& row, DiskColumn column, const Translator& texts);
[[nodiscard]] QString columnTitle(DiskColumn column, const Translator& texts);
/// What the disk is: its format or kind, size and mount point, and what is odd about it.
[[nodiscard]] QString rowDetails(const DiskRow& row, const Translator& texts);
/// Everything in one line, for those who hear it.
[[nodiscard]] QString rowSummary(const DiskRow& row, const Translator& texts);
/// Everything there is to say, on several lines of plain text.
[[nodiscard]] QString rowToolTip(const DiskRow& row, const Translator& texts);
/// What is being done to the disk, or what is known of it, in the user's language.
[[nodiscard]] QString stateText(const DiskRow& row, const Translator& texts);

}  // namespace orvane::desktop
