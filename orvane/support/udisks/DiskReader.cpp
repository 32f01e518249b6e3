// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/udisks/DiskReader.h"

#include "orvane/support/udisks/UDisks.h"

#include <algorithm>
#include <chrono>

namespace orvane {
namespace {

// The service is started by the first question where it does not run yet.
constexpr std::chrono::milliseconds longestFirstWait{3000};
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
    const auto answer = udisks.failingDrives(failing_ ? longestWait : longestFirstWait);
    if (answer)
        failing_ = *answer;
    else if (!failing_ || answer.error().kind != Refusal::Kind::Abandoned)
        failing_.emplace();
    markFailing(disks, *failing_);
    return disks;
}

}  // namespace orvane
