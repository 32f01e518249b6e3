// SPDX-License-Identifier: Apache-2.0
#include "pellar/partitions/Extents.h"

#include "contract/foundation/UTF8.h"

#include <algorithm>
#include <tuple>

namespace pellar {

// A name like "%2$@" must not be taken for a place that the next argument fills.
std::string partitionLabel(std::uint64_t number, const std::string& name)
{
    std::string shown = contract::printable(name);
    std::replace(shown.begin(), shown.end(), '%', ' ');
    return std::to_string(number) + (shown.empty() ? "" : " “" + shown + "”");
}

void findOverlaps(std::vector<Extent> extents, std::vector<Finding>& findings)
{
    std::stable_sort(extents.begin(), extents.end(), [](const Extent& a, const Extent& b) {
        return std::tie(a.first, a.last) < std::tie(b.first, b.last);
    });
    const Extent* reaching = nullptr;  // of those before, the one that ends last
    for (const Extent& extent : extents) {
        if (reaching != nullptr && extent.first <= reaching->last)
            findings.push_back({FindingKind::Overlap, {reaching->label, extent.label}});
        if (reaching == nullptr || extent.last > reaching->last)
            reaching = &extent;
    }
}

}  // namespace pellar
