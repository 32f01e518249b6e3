// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/settings/SettingsFile.h"

#include "orvane/support/files/WholeFile.h"
#include "orvane/support/settings/ValueJSON.h"

#include <sys/statvfs.h>

#include <algorithm>
#include <array>
#include <cctype>
#include <cerrno>
#include <optional>
#include <utility>

namespace orvane {
namespace {

std::optional<bool> truthValue(std::string_view text)
{
    constexpr std::array<std::string_view, 4> affirmative{"yes", "true", "on", "1"};
    constexpr std::array<std::string_view, 4> negative{"no", "false", "off", "0"};
    std::string lower(text);
    std::transform(lower.begin(), lower.end(), lower.begin(),
                   [](unsigned char c) { return static_cast<char>(std::tolower(c)); });
    if (std::find(affirmative.begin(), affirmative.end(), lower) != affirmative.end())
        return true;
    if (std::find(negative.begin(), negative.end(), lower) != negative.end())
        return false;
    return std::nullopt;
}

}  // namespace

SettingsFile::SettingsFile(std::filesystem::path file, WarningSink warn)
    : file_(std::move(file)), warn_(std::move(warn))
{
    read();
}

contract::Value SettingsFile::objectForKey(std::string_view key) const
{
    const auto found = settings_.find(key);
    if (found == settings_.end())
        return {};
    const bool isText = found->second.kind() == contract::Kind::String;
    if (const auto truth = isText ? truthValue(found->second.string()) : std::nullopt)
        return *truth;
    return found->second;
}

void SettingsFile::setObjectForKey(const contract::Value& value, std::string_view key)
{
    read();
    if (value.isNone())
        settings_.erase(std::string(key));
    else
        settings_.insert_or_assign(std::string(key), value);
    write();
}

void SettingsFile::read()
{
    if (file_.empty())
        return;
    const auto contents = readWholeFile(file_, largestSettingsFile);
    if (!contents) {
        const int error = contents.error();
        if (error == EFBIG || error == EINVAL)
            setAside();
        else if (error != ENOENT)
            goOnInMemory(cannot("read the settings", file_.native(), error).message);
        return;
    }
    const auto json = parsedJSON(*contents);
    if (!json.is_object()) {
        setAside();
        return;
    }
    Settings settings;
    try {
        for (const auto& [key, value] : json.items())
            settings.emplace(key, valueFromJSON(value));
    } catch (const nlohmann::json::exception&) {
        setAside();
        return;
    }
    settings_ = std::move(settings);
}

void SettingsFile::setAside()
{
    std::filesystem::path aside = file_;
    aside += ".broken";
    std::error_code error;
    std::filesystem::rename(file_, aside, error);
    if (error)
        goOnInMemory(cannot("read the settings", file_.native(), "they are damaged").message);
    else
        warn_(cannot("read the settings", file_.native(),
                     "they are damaged and are kept as ‘" + aside.filename().native() + "’")
                  .message);
}

void SettingsFile::write()
{
    if (file_.empty())
        return;
    nlohmann::json json = nlohmann::json::object();
    for (const auto& [key, value] : settings_)
        json[key] = jsonFromValue(value);
    const auto replaceHandler = nlohmann::json::error_handler_t::replace;
    const auto directory = createPrivateDirectory(file_.parent_path());
    const auto written = !directory
                             ? directory
                             : replaceFile(file_, json.dump(4, ' ', false, replaceHandler) + "\n");
    if (!written)
        goOnInMemory(written.error().message);
}

void SettingsFile::goOnInMemory(const std::string& sentence)
{
    file_.clear();
    warn_(sentence + "; changed settings hold until the program ends");
}

namespace {

constexpr std::string_view showDetailsKey = "showDetailsInFixwell";

}  // namespace

bool Preferences::rootVolumeIsReadOnly() const
{
    struct statvfs status = {};
    return ::statvfs("/", &status) == 0 && (status.f_flag & ST_RDONLY) != 0;
}

bool Preferences::showDetailsInFixwell() const
{
    return settings_.objectForKey(showDetailsKey).boolean();
}

void Preferences::setShowDetailsInFixwell(bool shows)
{
    if (shows != showDetailsInFixwell())
        settings_.setObjectForKey(shows, showDetailsKey);
}

}  // namespace orvane
