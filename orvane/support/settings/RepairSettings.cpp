// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/settings/RepairSettings.h"

#include "orvane/support/files/WholeFile.h"
#include "orvane/support/settings/SettingsFile.h"
#include "orvane/support/settings/ValueJSON.h"

#include <string_view>

namespace orvane {
namespace {

constexpr std::int64_t mostOfAnything = 1'000'000;

void take(const nlohmann::json& settings, std::string_view key, std::uint64_t& number)
{
    const auto found = settings.find(key);
    if (found == settings.end() || !found->is_number_integer())
        return;
    const auto value = found->get<std::int64_t>();
    if (value >= 0 && value <= mostOfAnything)
        number = static_cast<std::uint64_t>(value);
}

}  // namespace

RepairSettings readRepairSettings(const std::filesystem::path& file)
{
    RepairSettings read;
    const auto contents = readWholeFile(file, largestSettingsFile);
    const auto settings = parsedJSON(contents ? *contents : "");
    if (!settings.is_object())
        return read;
    take(settings, "keptRepairs", read.keptRepairs);
    take(settings, "keptRepairDays", read.keptRepairDays);
    take(settings, "keptRepairMegabytes", read.keptRepairMegabytes);
    const auto thorough = settings.find("thoroughVerification");
    read.thoroughVerification =
        thorough != settings.end() && thorough->is_boolean() && thorough->get<bool>();
    return read;
}

}  // namespace orvane
