// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/desktop/window/DiskRow.h"
#include "orvane/support/texts/Catalogue.h"

#include <string>
#include <vector>

namespace orvane::desktop {

/// What can be done about a result.
enum class NextStep {
    Repair,
    Preview,
    Undo,
    UndoPermissions,  ///< a repair of them
    Finish,
    ApplyUnproven,   ///< a repair that was tried, and may leave damage
    RepairDirectly,  ///< without trying it first
    ShowProblems,
    CopyDisk,
    Reopen,  ///< what was closed
};

enum class Tone { Neutral, Good, Caution, Bad };

/// What came out of the last job on the selected disks, and what follows from it. All texts are
/// plain, and in the user's language.
struct ResultSummary {
    struct Link {
        std::string name;
        std::string identifier;  ///< the disk's

        friend bool operator==(const Link&, const Link&) = default;
    };

    Tone tone = Tone::Neutral;
    std::string title;  ///< one sentence; empty when there is nothing to say
    std::string details;
    std::vector<NextStep> steps;
    std::vector<Link> disks;  ///< those that are not sound, of several

    friend bool operator==(const ResultSummary&, const ResultSummary&) = default;
};

/// What is possible with the one disk that is selected.
struct ResultSituation {
    bool canRepair = false;
    bool canUndo = false;
    bool canUndoPermissions = false;  ///< a repair of the permissions of its files
    bool isInterrupted = false;       ///< a repair of it is half written
};

[[nodiscard]] ResultSummary resultOf(const DiskRow& disk, const ResultSituation& situation,
                                     const Translator& texts);
/// Of none: the images that were closed last.
[[nodiscard]] ResultSummary resultOfClosing(const std::vector<std::string>& images,
                                            const Translator& texts);
/// Of several; nothing where none of them was checked.
[[nodiscard]] ResultSummary resultOfSeveral(const std::vector<DiskRow>& disks,
                                            const Translator& texts);

}  // namespace orvane::desktop
