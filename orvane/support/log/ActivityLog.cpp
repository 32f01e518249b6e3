// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/log/ActivityLog.h"

#include "orvane/support/files/WholeFile.h"

#include <unistd.h>
#include <algorithm>

namespace orvane {
namespace {

// The second level has errors, and what is worth a note besides, as that a module was loaded.
std::string_view nameOf(int level)
{
    switch (level) {
        case contract::OVLog::mismatch: return "mismatch ";
        case contract::OVLog::error: return "notice ";
        default: return "trace ";
    }
}

std::filesystem::path in(const std::filesystem::path& directory, const char* name)
{
    return directory.empty() ? directory : directory / name;
}

}  // namespace

ActivityLog::ActivityLog(const Options& options, const WarningSink& warn)
    : keptLevel_(options.keptLevel),
      shownLevel_(options.shownLevel),
      developers_(in(options.directory, "fixwell.log"), options.limits, warn),
      activity_(in(options.directory, "activity.log"), options.limits, warn)
{
}

bool ActivityLog::keepsLevel(int level) const
{
    return level <= std::max(keptLevel_, shownLevel_);
}

void ActivityLog::ov_log(int level, int /*flags*/, std::string_view line)
{
    if (!keepsLevel(level))
        return;
    while (line.ends_with('\n'))
        line.remove_suffix(1);
    std::string text(nameOf(level));
    appendLogText(text, line);
    text += '\n';
    if (level <= keptLevel_) {
        developers_.buffer().append(clock_.now()).append(text);
        developers_.flush();
    }
    // Standard error may be closed; there is nobody left to tell.
    if (level <= shownLevel_)
        static_cast<void>(writeAll(STDERR_FILENO, text));
}

void ActivityLog::log(std::string_view text)
{
    if (!isAtLineStart_)
        logPriorityWithEOL({}, 0, true);
    while (text.ends_with(' '))
        text.remove_suffix(1);
    logPriorityWithEOL(text, 0, !text.ends_with('\n'));
}

void ActivityLog::logPriorityWithEOL(std::string_view text, int /*priority*/, bool addsEndOfLine)
{
    std::string& buffer = activity_.buffer();
    const bool isBlank = text.empty() || text.front() == '\n';
    if (isAtLineStart_ && !isBlank)
        buffer += clock_.now();
    appendLogText(buffer, text);
    if (addsEndOfLine)
        buffer += '\n';
    if (!text.empty() || addsEndOfLine)
        isAtLineStart_ = addsEndOfLine || text.back() == '\n';
    activity_.flushWhenFull();
}

void ActivityLog::flush()
{
    activity_.flush();
}

}  // namespace orvane
