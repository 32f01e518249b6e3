// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/support/OVPreferences.h"

#include <filesystem>

namespace orvane {

/// Whether the file system at `path` is mounted read-only (statvfs(3)); NO when it cannot be told.
[[nodiscard]] bool isMountedReadOnly(const std::filesystem::path& path);

/// The preferences, kept in the stored settings, which must outlive this object.
class Preferences final : public contract::OVPreferences {
public:
    explicit Preferences(contract::UserDefaults& settings) : settings_(settings) {}

    bool showDetailsInFixwell() const override;
    void setShowDetailsInFixwell(bool shows) override;
    bool rootVolumeIsReadOnly() const override { return isMountedReadOnly("/"); }

private:
    contract::UserDefaults& settings_;
};

}  // namespace orvane
