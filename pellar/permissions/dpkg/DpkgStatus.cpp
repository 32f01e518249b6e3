// SPDX-License-Identifier: Apache-2.0
#include "pellar/permissions/dpkg/DpkgStatus.h"

#include "pellar/permissions/Lines.h"

#include <algorithm>
#include <utility>

namespace pellar {
namespace {

// Debian Policy 5.6.1, 5.6.12: letters, digits and . + - ~ :, none of which leaves a directory as
// long as the text does not begin with a point, nor is an option where it begins with none.
bool isAllowedField(std::string_view text)
{
    constexpr std::size_t longest = 255;
    return !text.empty() && text.size() <= longest && text.front() != '.' && text.front() != '-' &&
           std::all_of(text.begin(), text.end(), [](char c) {
               return (c >= '0' && c <= '9') || (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') ||
                      std::string_view(".+-~:_").find(c) != std::string_view::npos;
           });
}

// Status: install ok installed
void takeStatus(std::string_view value, DpkgPackage& package, bool& isThere)
{
    takeWord(value);
    takeWord(value);
    const std::string_view state = takeWord(value);
    package.isConfigured = state == "installed" || state.starts_with("triggers-");
    isThere = !state.empty() && state != "not-installed" && state != "config-files";
}

}  // namespace

bool DpkgPackage::isAllowed() const
{
    return isAllowedField(name) && isAllowedField(version) && isAllowedField(architecture);
}

std::string DpkgPackage::fileName() const
{
    std::string escaped;
    for (const char c : version)
        escaped += c == ':' ? "%3a" : std::string(1, c);
    return name + '_' + escaped + '_' + architecture;
}

std::vector<DpkgPackage> parseDpkgStatus(std::string_view text)
{
    std::vector<DpkgPackage> packages;
    DpkgPackage package;
    bool isThere = false;
    const auto endParagraph = [&] {
        const DpkgPackage ended = std::exchange(package, {});
        if (std::exchange(isThere, false) && ended.isAllowed())
            packages.push_back(ended);
    };
    forEachLine(text, [&](std::string_view line) {
        if (line.empty())
            return endParagraph();
        const std::string_view field = takeField(line, ':');
        line.remove_prefix(std::min(line.find_first_not_of(' '), line.size()));
        if (field == "Package")
            package.name = line;
        else if (field == "Version")
            package.version = line;
        else if (field == "Architecture")
            package.architecture = line;
        else if (field == "Status")
            takeStatus(line, package, isThere);
    });
    endParagraph();
    return packages;
}

}  // namespace pellar
