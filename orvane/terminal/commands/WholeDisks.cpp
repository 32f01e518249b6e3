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
    std::string why;
    if (whole->parentDisk() != nullptr)
        why = translator.text("it is a part of a disk, not a whole one");
    else
        why = session_.reasonAgainstPartitionMap(whole);
    // What fills a disk and looks like a map besides (an optical image) is listed as one volume.
    if (why.empty() && !whole->isWhole())
        why = translator.text("it is one volume, not a disk with partitions");
    return why.empty() ? why
                       : translator.sentence("cannot check the partition map of “%@”: %@",
                                             {named.name, why});
}

}  // namespace orvane
