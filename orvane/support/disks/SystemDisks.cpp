// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/disks/SystemDisks.h"

#include "orvane/support/disks/BlockProbe.h"
#include "orvane/support/disks/UdevDatabase.h"
#include "orvane/support/files/WholeFile.h"
#include "pellar/process/FileDescriptor.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <sys/sysmacros.h>

#include <fmt/format.h>
#include <algorithm>
#include <charconv>
#include <cstdio>
#include <map>
#include <tuple>

namespace orvane {
namespace {

namespace fs = std::filesystem;

/// One attribute of a device in /sys, without the line end; empty when it has none.
std::string attribute(const fs::path& device, const char* name)
{
    const auto contents = readWholeFile(device / name, 4096);
    std::string text = contents ? *contents : std::string();
    text.erase(text.find_last_not_of(" \n") + 1);
    return text;
}

std::uint64_t numberIn(const std::string& text)
{
    std::uint64_t number = 0;
    std::from_chars(text.data(), text.data() + text.size(), number);
    return number;
}

// The unit of "size" is 512 bytes whatever the device's sectors are (linux/blk_types.h).
std::uint64_t sizeOf(const fs::path& device)
{
    return numberIn(attribute(device, "size")) * 512;
}

std::vector<fs::path> sortedEntries(const fs::path& directory)
{
    std::vector<fs::path> entries;
    std::error_code error;
    for (fs::directory_iterator entry(directory, error), end; !error && entry != end;
         entry.increment(error))
        entries.push_back(entry->path());
    // "sda2" before "sda10".
    std::sort(entries.begin(), entries.end(), [](const fs::path& a, const fs::path& b) {
        return std::make_tuple(a.native().size(), a.native()) <
               std::make_tuple(b.native().size(), b.native());
    });
    return entries;
}

bool isLeftOut(const fs::path& device)
{
    const std::string name = device.filename();
    const bool isMemory = name.starts_with("ram") || name.starts_with("zram");
    const bool isOptical = name.starts_with("sr");
    return isMemory || (sizeOf(device) == 0 && !isOptical);
}

/// What can be found out by reading the device, or about it where it may not be read.
struct Contents {
    Superblock superblock;
    std::optional<PartitionTable> table;
    std::optional<pellar::SpaceUse> space = {};
    bool hasExtBackup = false;
    bool hasTableTraces = false;
    bool hasBootSector = false;  ///< and what looks like a table is nothing else
    std::string tableType = {};
};

Contents contentsFromUdev(const std::string& number, const DiskSources& sources)
{
    auto properties = udevProperties(number, sources.udevData);
    Contents contents;
    contents.superblock = {properties["ID_FS_USAGE"], properties["ID_FS_TYPE"],
                           decodeUdevName(properties["ID_FS_LABEL_ENC"]), properties["ID_FS_UUID"],
                           properties["ID_FS_VERSION"]};
    contents.tableType = properties["ID_PART_TABLE_TYPE"];
    return contents;
}

Contents contentsOf(const fs::path& node, const std::string& number, std::uint64_t size,
                    const DiskSources& sources)
{
    const pellar::FileDescriptor device(
        sources.opensDevices ? ::open(node.c_str(), O_RDONLY | O_NONBLOCK | O_CLOEXEC) : -1);
    if (!device)
        return contentsFromUdev(number, sources);
    const ByteRange all{0, size};
    Contents contents{readSuperblock(device.get(), all),
                      readPartitionTable(device.get()),
                      {},
                      hasExtBackupSuperblock(device.get(), all),
                      hasPartitionTableTraces(device.get())};
    contents.space = pellar::spaceUseOf(device.get(), all, contents.superblock.type);
    contents.hasBootSector =
        contents.table && isBootSector(device.get(), *contents.table, contents.superblock);
    contents.tableType = contents.table ? contents.table->type : "";
    return contents;
}

// What the kernel has mounted it as is certain, also where the device may not be read. A file
// system in user space ("fuseblk") does not tell which it is.
std::string filesystemOf(const pellar::Mount& mount)
{
    if (mount.filesystem == "ntfs3")
        return "ntfs";
    return mount.filesystem.starts_with("fuse") ? std::string() : mount.filesystem;
}

/// `number` is the device's, as sysfs and udev name it ("8:2").
std::optional<pellar::Mount> mountOf(const DiskFacts& facts, const std::string& number,
                                     const DiskSources& sources)
{
    unsigned major = 0;
    unsigned minor = 0;
    if (std::sscanf(number.c_str(), "%u:%u", &major, &minor) != 2)
        return std::nullopt;
    return pellar::mountOfDevice(sources.mounts, makedev(major, minor), facts.path);
}

void addMount(DiskFacts& facts, const std::string& number, const DiskSources& sources)
{
    const auto mount = mountOf(facts, number, sources);
    if (!mount)
        return;
    facts.mountPoint = mount->target;
    facts.space = pellar::spaceUseOfMount(mount->target.c_str());
    if (facts.filesystem.empty())
        facts.filesystem = filesystemOf(*mount);
    facts.isWritable = facts.isWritable && !mount->isReadOnly;
    facts.isBootVolume = mount->target == "/";
    const auto home = sources.homeDirectory.empty()
                          ? std::nullopt
                          : pellar::mountHolding(sources.mounts, sources.homeDirectory);
    // What holds both is known as the startup disk.
    facts.containsUserHome = home && home->device == mount->device && !facts.isBootVolume;
}

void addSuperblock(DiskFacts& facts, const Contents& contents)
{
    const Superblock& superblock = contents.superblock;
    if (superblock.isFilesystem())
        facts.filesystem = superblock.type;
    else if (superblock.type.empty() && contents.hasExtBackup)
        facts.filesystem = "ext4";
    facts.filesystemVersion = superblock.version;
    facts.label = superblock.label;
    facts.space = contents.space;
    facts.uuid = superblock.isFilesystem() ? superblock.uuid : std::string();
    if (!facts.label.empty())
        facts.name = facts.label;
}

DiskFacts baseFacts(const fs::path& device, const fs::path& node)
{
    DiskFacts facts;
    facts.path = node;
    facts.identifier = node.native();
    facts.name = node.filename();
    facts.length = sizeOf(device);
    facts.isWritable = attribute(device, "ro") != "1";
    // Of whole disks only (Linux, Documentation/ABI/stable/sysfs-block, diskseq).
    facts.sequence = numberIn(attribute(device, "diskseq"));
    return facts;
}

// Linux, Documentation/ABI/stable/sysfs-block, "removable": the medium can leave the drive.
bool isEjectable(const fs::path& device)
{
    return attribute(device, "removable") == "1" || !attribute(device, "loop/backing_file").empty();
}

std::string nameOfWhole(const fs::path& device)
{
    const std::string backing = attribute(device, "loop/backing_file");
    if (!backing.empty())
        return fs::path(backing).filename();
    const std::string assembled = attribute(device, "dm/name");
    if (!assembled.empty())
        return assembled;
    const std::string model = attribute(device, "device/model");
    return model.empty() ? device.filename().native() : model;
}

std::int32_t typeOfWhole(const fs::path& device, const Contents& contents, bool hasPartitions,
                         bool isMounted)
{
    const std::string name = device.filename();
    if (name.starts_with("sr"))
        return diskType::opticalDisc;
    const bool hasVolume = !contents.superblock.type.empty() || contents.hasBootSector ||
                           (contents.hasExtBackup && !contents.hasTableTraces);
    const bool hasTable = contents.table && !contents.hasBootSector;
    const bool isBare = isMounted || (!hasPartitions && !hasTable && hasVolume);
    if (name.starts_with("dm-") || name.starts_with("md"))
        return hasPartitions ? diskType::whole : diskType::assembled;
    return isBare ? diskType::bareVolume : diskType::whole;
}

DiskTree readPartition(const fs::path& device, const std::optional<PartitionTable>& table,
                       const DiskSources& sources)
{
    const std::string number = attribute(device, "dev");
    DiskFacts facts = baseFacts(device, sources.dev / device.filename());
    facts.type = diskType::volume;
    facts.number = static_cast<std::int64_t>(numberIn(attribute(device, "partition")));
    const Partition* known = nullptr;
    for (const Partition& partition : table ? table->partitions : std::vector<Partition>())
        if (partition.number == facts.number)
            known = &partition;
    // The kernel gives the device of an extended partition two sectors, for its loader.
    const bool isContainer = known != nullptr ? known->isContainer : facts.length <= 1024;
    if (known != nullptr && !known->name.empty())
        facts.name = known->name;
    if (isContainer) {
        facts.type = diskType::container;
    } else {
        addSuperblock(facts, contentsOf(facts.path, number, facts.length, sources));
        addMount(facts, number, sources);
    }
    // Also one without a file system: it may have lost it, and lsblk(8) shows it, too.
    facts.isShown = !isContainer;
    return {facts, {}};
}

DiskTree readWhole(const fs::path& device, const DiskSources& sources)
{
    const std::string number = attribute(device, "dev");
    DiskFacts facts = baseFacts(device, sources.dev / device.filename());
    facts.name = nameOfWhole(device);
    facts.model = attribute(device, "device/model");
    facts.isEjectable = isEjectable(device);
    const Contents contents = contentsOf(facts.path, number, facts.length, sources);
    DiskTree tree;
    for (const fs::path& part : sortedEntries(device))
        if (!attribute(part, "partition").empty())
            tree.children.push_back(readPartition(part, contents.table, sources));
    facts.type = typeOfWhole(device, contents, !tree.children.empty(),
                             mountOf(facts, number, sources).has_value());
    facts.isWhole = facts.type == diskType::whole;
    facts.isBlankOptical = facts.type == diskType::opticalDisc && contents.superblock.type.empty();
    if (!facts.isWhole) {
        addSuperblock(facts, contents);
        addMount(facts, number, sources);
    } else {
        facts.partitionMap = contents.tableType;
    }
    tree.facts = facts;
    return tree;
}

}  // namespace

std::vector<DiskTree> readSystemDisks(const DiskSources& sources)
{
    std::vector<DiskTree> disks;
    for (const fs::path& device : sortedEntries(sources.sysBlock)) {
        if (isLeftOut(device))
            continue;
        disks.push_back(readWhole(device, sources));
        disks.back().facts.number = static_cast<std::int64_t>(disks.size()) - 1;
    }
    return disks;
}

std::optional<DiskFacts> readBlockDevice(const fs::path& node, const DiskSources& sources)
{
    struct stat status = {};
    if (::stat(node.c_str(), &status) != 0 || !S_ISBLK(status.st_mode))
        return std::nullopt;
    const std::string number = fmt::format("{}:{}", major(status.st_rdev), minor(status.st_rdev));
    const fs::path device = sources.sysBlock.parent_path() / "dev/block" / number;
    DiskFacts facts = baseFacts(device, node);
    const Contents contents = contentsOf(node, number, facts.length, sources);
    const bool isPartition = !attribute(device, "partition").empty();
    facts.type = isPartition ? diskType::volume
                             : typeOfWhole(device, contents, false,
                                           mountOf(facts, number, sources).has_value());
    facts.isWhole = facts.type == diskType::whole;
    addSuperblock(facts, contents);
    addMount(facts, number, sources);
    return facts;
}

}  // namespace orvane
