// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/settings/Preferences.h"

#include <sys/statvfs.h>

namespace orvane {
namespace {

constexpr std::string_view showDetailsKey = "showDetailsInFixwell";

}  // namespace

bool isMountedReadOnly(const std::filesystem::path& path)
{
    struct statvfs status = {};
    return ::statvfs(path.c_str(), &status) == 0 && (status.f_flag & ST_RDONLY) != 0;
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
