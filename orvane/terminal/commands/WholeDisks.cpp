// SPDX-License-Identifier: Apache-2.0
#include "orvane/terminal/commands/WholeDisks.h"

#include "orvane/terminal/ExitStatus.h"

namespace orvane {

WholeDisks::WholeDisks(const std::vector<NamedDisk>& named, Session& session, Reporter& reporter,
                       int& status)
    : session_(session)
{
    for (const NamedDisk& disk : named)
        add(disk, reporter, status);
}

WholeDisks::~WholeDisks()
{
    for (const std::shared_ptr<Disk>& disk : attached_)
        session_.detach(disk);
}

void WholeDisks::add(const NamedDisk& named, Reporter& reporter, int& status)
{
    const std::shared_ptr<Disk> whole = wholeOf(named);
    const std::string objection = this->objection(named, whole);
    if (objection.empty()) {
        disks_.push_back({named.name, whole});
        return;
    }
    reporter.failure(named.name, objection);
    status |= exitUnchecked;
}

std::shared_ptr<Disk> WholeDisks::wholeOf(const NamedDisk& named)
{
    if (!named.disk->isOfflineDiskImage())
        return named.disk;
    std::shared_ptr<Disk> top = session_.attach(named.disk);
    if (top)
        attached_.push_back(top);
    return top;
}

std::string WholeDisks::objection(const NamedDisk& named, const std::shared_ptr<Disk>& whole) const
{
    const Translator& translator = session_.host().translator();
    if (!whole)
        return session_.host().imageAttachment().lastError(named.disk->diskImagePath());
    if (whole->parentDisk() != nullptr)
        return translator.sentence(
            "cannot check the partition map of “%@”: it is a part of a disk, not a whole one",
            {named.name});
    if (!whole->isWhole() || !session_.hasPartitionMap(whole))
        return translator.sentence(
            "cannot check the partition map of “%@”: there is no partition map", {named.name});
    return {};
}

}  // namespace orvane
