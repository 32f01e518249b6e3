// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/settings/RepairSettings.h"

#include "orvane/support/files/WholeFile.h"
#include "orvane/support/settings/SettingsFile.h"
#include "orvane/support/settings/ValueJSON.h"

#include <algorithm>
#include <functional>
#include <string_view>

namespace orvane {
namespace {

using Lookup = std::function<contract::Value(std::string_view key)>;

void take(const contract::Value& value, std::uint64_t& number)
{
    if (value.kind() == contract::Kind::Integer && value.integer() >= 0 &&
        value.integer() <= static_cast<std::int64_t>(unlimitedRepairs))
        number = static_cast<std::uint64_t>(value.integer());
}

RepairSettings settingsFrom(const Lookup& valueOf)
{
    RepairSettings read;
    take(valueOf("keptRepairs"), read.keptRepairs);
    take(valueOf("keptRepairDays"), read.keptRepairDays);
    read.keptRepairDays = std::min(read.keptRepairDays, mostRepairDays);
    take(valueOf("keptRepairMegabytes"), read.keptRepairMegabytes);
    const contract::Value thorough = valueOf("thoroughVerification");
    read.thoroughVerification = thorough.kind() == contract::Kind::Boolean && thorough.boolean();
    return read;
}

}  // namespace

RepairSettings readRepairSettings(const std::filesystem::path& file)
{
    const auto contents = readWholeFile(file, largestSettingsFile);
    const auto settings = parsedJSON(contents ? *contents : "");
    return settingsFrom([&settings](std::string_view key) {
        const auto found = settings.is_object() ? settings.find(key) : settings.end();
        const bool isPlain =
            found != settings.end() && (found->is_number_integer() || found->is_boolean());
        return isPlain ? valueFromJSON(*found) : contract::Value();
    });
}

RepairSettings repairSettingsIn(const contract::UserDefaults& settings)
{
    return settingsFrom([&settings](std::string_view key) { return settings.objectForKey(key); });
}

}  // namespace orvane
