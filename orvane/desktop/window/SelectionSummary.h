// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/desktop/window/DiskRow.h"
#include "orvane/support/texts/Catalogue.h"

#include <QDateTime>
#include <QString>
#include <QStringList>

#include <optional>
#include <string>
#include <vector>

namespace orvane::desktop {

/// A part of a whole disk, as the bar of its partitions shows it.
struct PartitionShare {
    QString name;
    QString toolTip;
    std::uint64_t bytes = 0;
    std::string identifier;  ///< the disk's
    std::string verdict;     ///< of its last check; empty when there was none
};

/// What the header says about the selected disks.
struct SelectionSummary {
    QString title;
    QString facts;    ///< one line
    QString state;    ///< what is being done, or the last verdict with its age
    QString warning;  ///< about the drive; mostly empty
    std::string verdict;
    /// Of one volume.
    std::optional<pellar::SpaceUse> space;
    QString spaceText;
    std::vector<PartitionShare> partitions;  ///< of one whole disk
};

/// `parts` are the volumes of the disk, where one alone is selected.
[[nodiscard]] SelectionSummary summaryOf(const std::vector<DiskRow>& selected,
                                         const std::vector<DiskRow>& parts, const QDateTime& now,
                                         const Translator& texts);

/// Their names, each with the file or device where another of them has the same one.
[[nodiscard]] QStringList distinctNames(const std::vector<DiskRow>& rows);

/// "2 damaged, 1 never checked": how many of the disks are in which state; the worst come first.
[[nodiscard]] QString countsOf(const std::vector<DiskRow>& rows, const Translator& texts);

/// "3 minutes ago"; the date where that says more.
[[nodiscard]] QString ageText(const QDateTime& then, const QDateTime& now, const Translator& texts);

/// With a capital at the beginning, as a sentence has it.
[[nodiscard]] QString capitalized(QString text);

}  // namespace orvane::desktop
