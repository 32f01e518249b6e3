// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/disks/Disk.h"
#include "orvane/support/disks/DiskFacts.h"
#include "orvane/support/texts/Catalogue.h"

#include <QDateTime>
#include <QIcon>
#include <QString>

#include <cstdint>
#include <functional>
#include <optional>
#include <string>
#include <string_view>

namespace orvane::desktop {

/// One action on a disk.
struct Check {
    std::string verdict;  ///< one of the library's verdicts; empty when it was cut off
    std::string message;  ///< one sentence; may be empty
    QDateTime started;
    std::string action = {};     ///< the name of the library's task
    std::int32_t errorCode = 0;  ///< of the library
    std::int64_t problems = 0;   ///< that the tool named; 0 when it is not known
    std::int64_t kinds = 0;      ///< of them
    bool hasLosses = false;      ///< the result cost something; the message says what
};

/// What is kept of the last actions on a disk, or on the part of it that is worst off.
struct LastCheck {
    Check told;                  ///< that came to an answer, where one did
    std::optional<Check> later;  ///< after it, and without an answer
    std::string part = {};       ///< the name of the part; empty for the disk itself
    /// Parts have not been checked, though nothing bad is known.
    bool isPartial = false;
};

/// What the list knows of a disk beyond its facts. Main thread.
struct DiskStates {
    /// None when the disk was never checked.
    std::function<std::optional<LastCheck>(const Disk& disk)> lastCheck;
    /// What a job is doing to the disk at this moment ("verifying…"); empty when none is.
    std::function<std::string(const Disk& disk)> activity;
    /// What is out of the ordinary about it, in a few words; mostly empty.
    std::function<std::string(const Disk& disk)> note;
    /// How far the activity is, from 0 to 100.
    std::function<double()> percent = [] {
        return 0.0;
    };
    /// When it is checked by itself; none where that is not known.
    std::function<std::optional<QDateTime>(const Disk& disk)> nextCheck = [](const Disk&) {
        return std::optional<QDateTime>();
    };
};

/// Nothing is wrong: sound, or repaired.
[[nodiscard]] bool isGood(std::string_view verdict);

/// By the kind of disk.
[[nodiscard]] QIcon diskIcon(const DiskFacts& facts);

/// A mark for one of the library's verdicts; the text beside it says the same.
[[nodiscard]] QIcon verdictIcon(std::string_view verdict);

/// The columns of the disk list.
enum class DiskColumn { Name, Verdict, Size, Format, MountPoint, LastCheck };
inline constexpr int diskColumnCount = 6;

/// What the disk list says about one disk, beside its name. A bare image file and the volume that
/// fills it are one row.
struct DiskRow {
    DiskFacts facts;
    std::string label;
    std::string format;  ///< of its file system, as people call it; empty where there is none
    std::optional<LastCheck> lastCheck;
    std::string activity = {};  ///< as of DiskStates
    double percent = 0;         ///< how far that is, from 0 to 100
    std::string note = {};
    std::optional<QDateTime> nextCheck = {};
};

/// As the log names it, by its label, and with the file or the device that bears it.
[[nodiscard]] QString nameText(const DiskRow& row);
/// The name alone; with its file or device in a second one, where they differ.
struct DiskNames {
    QString name;
    QString bearer;  ///< empty where it is the name
};
[[nodiscard]] DiskNames namesOf(const DiskRow& row);
/// In binary units; empty for 0.
[[nodiscard]] QString sizeText(std::uint64_t bytes);
/// "ext4", or the kind of disk where there is no file system.
[[nodiscard]] QString formatText(const DiskRow& row, const Translator& texts);
/// "64 %"
[[nodiscard]] std::string percentText(double percent, const Translator& texts);
/// "damaged"; "cut off" where there is none.
[[nodiscard]] QString verdictText(const Check& check, const Translator& texts);

/// One line, fit to be shown; empty where there is nothing to say.
[[nodiscard]] QString cellText(const DiskRow& row, DiskColumn column, const Translator& texts);
[[nodiscard]] QString columnTitle(DiskColumn column, const Translator& texts);
/// What the disk is: its format or kind, size and mount point, and what is odd about it. `isShort`:
/// with fewer words, where there is no room for them.
[[nodiscard]] QString rowDetails(const DiskRow& row, const Translator& texts, bool isShort = false);
/// Everything in one line, for those who hear it.
[[nodiscard]] QString rowSummary(const DiskRow& row, const Translator& texts);
/// Everything there is to say, on several lines of plain text.
[[nodiscard]] QString rowToolTip(const DiskRow& row, const Translator& texts);
/// Everything by which the user may look for it, on lines; no kind of it more than another.
[[nodiscard]] QString searchText(const DiskRow& row, const Translator& texts);
/// What is being done to the disk, or what is known of it and, where that is bad news of a part,
/// of which: "damaged: inner".
[[nodiscard]] QString stateText(const DiskRow& row, const Translator& texts);

}  // namespace orvane::desktop
