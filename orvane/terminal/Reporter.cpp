// SPDX-License-Identifier: Apache-2.0
#include "orvane/terminal/Reporter.h"

#include "contract/foundation/UTF8.h"

#include <cerrno>
#include <cstdio>

namespace orvane {
namespace {

// The number of what fills an image, without a partition map.
constexpr std::string_view wholeImage = "#0";

}  // namespace

std::string GivenNames::nameOf(std::string_view identifier) const
{
    for (const auto& [known, name] : names_) {
        if (!isWithin(identifier, known))
            continue;
        const std::string_view part = identifier.substr(known.size());
        return part == wholeImage ? name : name + std::string(part);
    }
    return std::string(identifier);
}

std::string GivenNames::namedOf(std::string_view identifier) const
{
    for (const auto& [known, name] : names_)
        if (isWithin(identifier, known))
            return name;
    return std::string(identifier);
}

bool GivenNames::isWithin(std::string_view identifier, std::string_view named)
{
    if (!identifier.starts_with(named))
        return false;
    const std::string_view part = identifier.substr(named.size());
    return part.empty() || (part.front() == '#' && part.size() > 1 &&
                            part.find_first_not_of("0123456789", 1) == std::string_view::npos);
}

// A reader that has gone away has seen what it wanted; any other loss is reported at the end.
void Reporter::flush()
{
    if (std::fflush(stdout) != 0 && errno != EPIPE)
        hasLostOutput_ = true;
}

void Reporter::writeError(const std::string& sentence)
{
    const std::string line = "fixwell: " + contract::printable(sentence) + "\n";
    std::fwrite(line.data(), 1, line.size(), stderr);
}

bool Reporter::end()
{
    flush();
    return !hasLostOutput_;
}

}  // namespace orvane
