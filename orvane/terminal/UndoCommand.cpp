// SPDX-License-Identifier: Apache-2.0
#include "contract/pellar/MessageKeys.h"
#include "orvane/terminal/Commands.h"

#include <algorithm>
#include <charconv>
#include <filesystem>

namespace orvane {
namespace {

/// "backup.img#2" is the second volume of an image, as this program names it.
struct VolumeName {
    std::string image;
    std::string number;  ///< with its "#"; empty when all of the image is meant
};

VolumeName readVolumeName(const std::string& name)
{
    const std::size_t sign = name.rfind('#');
    std::error_code error;
    if (sign == std::string::npos || std::filesystem::exists(name, error) ||
        !GivenNames::isWithin(name, std::string_view(name).substr(0, sign)))
        return {name, ""};
    return {name.substr(0, sign), name.substr(sign)};
}

std::vector<std::shared_ptr<Disk>> volumesOf(const std::shared_ptr<Disk>& top)
{
    std::vector<std::shared_ptr<Disk>> volumes;
    for (const std::shared_ptr<Disk>& part : top->parts())
        if (part->facts().isShown)
            volumes.push_back(part);
    if (top->parts().empty())
        volumes.push_back(top);
    return volumes;
}

std::string namesOf(const std::vector<std::shared_ptr<Disk>>& volumes, const Session& session)
{
    std::string names;
    for (const std::shared_ptr<Disk>& volume : volumes)
        names += (names.empty() ? "" : ", ") + session.names().nameOf(volume->facts().identifier);
    return names;
}

/// Of several volumes the only one of which a repair is kept.
std::shared_ptr<Disk> onlyRepaired(const std::vector<std::shared_ptr<Disk>>& volumes,
                                   Session& session)
{
    std::shared_ptr<Disk> repaired;
    for (const std::shared_ptr<Disk>& volume : volumes) {
        if (session.repairRecords().newestOf(volume->facts()) == nullptr)
            continue;
        if (repaired)
            return nullptr;
        repaired = volume;
    }
    return repaired;
}

/// The volume that is meant, or why there is none.
Result<std::shared_ptr<Disk>, std::string> volumeIn(const std::shared_ptr<Disk>& top,
                                                    const std::string& number, Session& session,
                                                    const std::string& name)
{
    const auto volumes = volumesOf(top);
    for (const std::shared_ptr<Disk>& volume : volumes)
        if (!number.empty() && volume->facts().identifier.ends_with(number))
            return volume;
    if (number.empty() && volumes.size() == 1)
        return volumes.front();
    if (number.empty())
        if (auto repaired = onlyRepaired(volumes, session))
            return repaired;
    if (volumes.empty() || !number.empty())
        return session.texts().sentence("there is no such volume in “%@”", {name});
    return session.texts().sentence("“%@” holds several volumes; name one: %@",
                                    {name, namesOf(volumes, session)});
}

Result<std::shared_ptr<Disk>, std::string> diskFor(const Request& request, const NamedDisk& named,
                                                   const AttachedImage& image,
                                                   const std::string& number, Session& session)
{
    if (!named.disk->isOfflineDiskImage())
        return named.disk;
    if (!image.top())
        return session.host().imageAttachment().lastError(named.disk->diskImagePath());
    if (request.treatsPartitionMap)
        return image.top();
    return volumeIn(image.top(), number, session, named.name);
}

pellar::Subject subjectOf(const Request& request)
{
    if (request.treatsPermissions)
        return pellar::Subject::Permissions;
    return request.treatsPartitionMap ? pellar::Subject::PartitionMap : pellar::Subject::Filesystem;
}

int treat(const Request& request, const NamedDisk& named, const std::string& number,
          Session& session, Reporter& reporter)
{
    const AttachedImage image(session, named.disk);
    const auto disk = diskFor(request, named, image, number, session);
    if (!disk) {
        reporter.failure(named.name, disk.error());
        return exitUnchecked;
    }
    const pellar::Task task{subjectOf(request), request.command == Command::Undo
                                                    ? pellar::Operation::Undo
                                                    : pellar::Operation::Finish};
    const RunEnd end = session.carryOut(task, *disk);
    if (end.errorCode == contract::kPLNoError)
        return exitSound;
    return end.verdict == contract::kPLVerdictStopped.text() ? exitStopped : exitUnchecked;
}

}  // namespace

int runUndo(const Request& request, Session& session, Reporter& reporter)
{
    int status = exitSound;
    for (const std::string& name : request.disks) {
        if (session.wasStopped())
            return status | exitStopped;
        const VolumeName volume = readVolumeName(name);
        for (const NamedDisk& named : session.findDisks({volume.image}, status))
            status |= treat(request, named, volume.number, session, reporter);
    }
    return status;
}

}  // namespace orvane
