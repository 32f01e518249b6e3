// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <filesystem>
#include <string>
#include <string_view>
#include <vector>

namespace orvane {

/// A field of a record in the system's journal.
struct JournalField {
    std::string_view name;  ///< capital letters, digits and underlines (systemd.journal-fields(7))
    std::string value;      ///< any bytes; no more than the first 16 KiB are kept
};

/// The record as the journal takes it (systemd, "Native Journal Protocol"): whatever a value holds,
/// it is one field's.
[[nodiscard]] std::string encodeForJournal(const std::vector<JournalField>& fields);

/// Hands a record to the journal; NO where there is none, or it takes nothing for two seconds.
bool writeToJournal(const std::vector<JournalField>& fields,
                    const std::filesystem::path& socket = "/run/systemd/journal/socket");

}  // namespace orvane
