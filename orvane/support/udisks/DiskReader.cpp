// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/udisks/DiskReader.h"

#include "orvane/support/udisks/UDisks.h"

#include <algorithm>
#include <chrono>

namespace orvane {
namespace {

constexpr std::chrono::milliseconds longestWait{50};

bool isMeant(const DiskTree& tree, const std::set<std::string>& nodes)
{
    return nodes.contains(tree.facts.path) ||
           std::any_of(tree.children.begin(), tree.children.end(),
                       [&](const DiskTree& child) { return isMeant(child, nodes); });
}

void mark(DiskTree& tree)
{
    tree.facts.hasSMARTError = true;
    for (DiskTree& child : tree.children)
        mark(child);
}

}  // namespace

void markFailing(std::vector<DiskTree>& disks, const std::set<std::string>& failingNodes)
{
    for (DiskTree& disk : disks)
        if (isMeant(disk, failingNodes))
            mark(disk);
}

std::vector<DiskTree> DiskReader::read(const DiskSources& sources)
{
    UDisks udisks;
    udisks.askForFailingDrives();
    auto disks = readSystemDisks(sources);
    const auto answer = udisks.failingDrives(longestWait);
    if (const auto* const failing = std::get_if<std::set<std::string>>(&answer))
        failing_ = *failing;
    else if (std::get<Refusal>(answer).kind != Refusal::Kind::Abandoned)
        failing_.clear();
    markFailing(disks, failing_);
    return disks;
}

}  // namespace orvane
