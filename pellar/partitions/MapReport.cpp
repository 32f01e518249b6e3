// SPDX-License-Identifier: Apache-2.0
#include "pellar/partitions/MapReport.h"

#include <algorithm>

namespace pellar {
namespace {

// A list of a hundred partitions can be wrong in thousands of ways; the first tell enough.
constexpr std::size_t mostFindings = 50;

MapVerdict verdictOf(const std::vector<Finding>& findings)
{
    MapVerdict verdict = MapVerdict::Sound;
    for (const Finding& finding : findings) {
        if (levelOf(finding.kind) == FindingLevel::NeedsPerson)
            return MapVerdict::NeedsPerson;
        if (levelOf(finding.kind) == FindingLevel::Repairable)
            verdict = MapVerdict::Repairable;
    }
    return verdict;
}

}  // namespace

bool MapReport::has(FindingKind kind) const
{
    return std::any_of(findings.begin(), findings.end(),
                       [kind](const Finding& finding) { return finding.kind == kind; });
}

MapReport reportOn(const PartitionMap& map)
{
    MapReport report;
    if (map.kind == PartitionMap::Kind::None)
        return report;
    report.findings = map.kind == PartitionMap::Kind::GPT ? gptFindings(map) : mbrFindings(map);
    report.verdict = verdictOf(report.findings);
    if (report.findings.size() > mostFindings) {
        const std::uint64_t rest = report.findings.size() - mostFindings;
        report.findings.resize(mostFindings, {FindingKind::More, {}});
        report.findings.push_back({FindingKind::More, {rest}});
    }
    return report;
}

}  // namespace pellar
