// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/support/OVPreferences.h"
#include "orvane/support/files/Failure.h"

#include <filesystem>
#include <map>
#include <string>
#include <string_view>

namespace orvane {

inline constexpr std::string_view settingsFileName = "settings.json";
inline constexpr std::size_t largestSettingsFile = 1U << 20U;

/// The stored settings: one JSON object in a file that is replaced as a whole. Main thread only.
///
/// A file that cannot be read as settings is kept aside as NAME.broken; one that may not be read
/// or written is left alone. Either is said once through the warning sink, and the settings then
/// hold for this run.
class SettingsFile final : public contract::UserDefaults {
public:
    /// An empty path keeps the settings in memory.
    SettingsFile(std::filesystem::path file, WarningSink warn);

    contract::Value objectForKey(std::string_view key) const override;
    /// Written at once. Reads the file again first, so that another program's change to another
    /// key is kept.
    void setObjectForKey(const contract::Value& value, std::string_view key) override;

private:
    using Settings = std::map<std::string, contract::Value, std::less<>>;

    void read();
    void setAside();
    void write();
    void goOnInMemory(const std::string& sentence);

    std::filesystem::path file_;
    WarningSink warn_;
    Settings settings_;
};

/// The preferences, kept in the stored settings, which must outlive this object.
class Preferences final : public contract::OVPreferences {
public:
    explicit Preferences(contract::UserDefaults& settings) : settings_(settings) {}

    bool showDetailsInFixwell() const override;
    void setShowDetailsInFixwell(bool shows) override;
    /// Whether "/" is mounted so (statvfs(3)); NO when it cannot be told.
    bool rootVolumeIsReadOnly() const override;

private:
    contract::UserDefaults& settings_;
};

}  // namespace orvane
