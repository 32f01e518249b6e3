// SPDX-License-Identifier: Apache-2.0
#include "pellar/probe/DiskProbe.h"

#include <blkid/blkid.h>

#include <array>
#include <charconv>
#include <memory>
#include <set>
#include <string_view>

namespace pellar {
namespace {

constexpr std::uint64_t sectorBytes = 512;  // the unit of libblkid's partitions

struct FreeProbe {
    void operator()(blkid_probe probe) const { blkid_free_probe(probe); }
};
using Probe = std::unique_ptr<std::remove_pointer_t<blkid_probe>, FreeProbe>;

Probe probeOf(int descriptor, ByteRange range)
{
    Probe probe(blkid_new_probe());
    if (probe &&
        blkid_probe_set_device(probe.get(), descriptor, static_cast<blkid_loff_t>(range.offset),
                               static_cast<blkid_loff_t>(range.length)) != 0)
        probe.reset();
    return probe;
}

std::string valueOf(const Probe& probe, const char* name)
{
    const char* data = nullptr;
    std::size_t size = 0;
    if (blkid_probe_lookup_value(probe.get(), name, &data, &size) != 0 || data == nullptr)
        return {};
    // The size counts the terminating zero of text.
    std::string value(data, size);
    while (value.ends_with('\0'))
        value.pop_back();
    return value;
}

std::string textOrNothing(const char* text)
{
    return text != nullptr ? text : "";
}

std::string hexadecimal(int number)
{
    std::array<char, 16> text;
    const auto [end, error] = std::to_chars(text.begin(), text.end(), number, 16);
    return "0x" + std::string(text.begin(), end);
}

Partition read(blkid_partition entry, const std::set<blkid_partition>& containers)
{
    Partition partition;
    partition.number = blkid_partition_get_partno(entry);
    partition.range = {static_cast<std::uint64_t>(blkid_partition_get_start(entry)) * sectorBytes,
                       static_cast<std::uint64_t>(blkid_partition_get_size(entry)) * sectorBytes};
    partition.isContainer = blkid_partition_is_extended(entry) != 0 || containers.contains(entry);
    const char* const guid = blkid_partition_get_type_string(entry);
    partition.type = guid != nullptr ? guid : hexadecimal(blkid_partition_get_type(entry));
    partition.name = textOrNothing(blkid_partition_get_name(entry));
    return partition;
}

// Tables may be nested: a BSD disklabel lies inside a partition of an MBR.
std::set<blkid_partition> containersIn(blkid_partlist list)
{
    std::set<blkid_partition> containers;
    for (int i = 0; i < blkid_partlist_numof_partitions(list); ++i) {
        blkid_partition entry = blkid_partlist_get_partition(list, i);
        if (blkid_parttable table = blkid_partition_get_table(entry))
            if (blkid_partition parent = blkid_parttable_get_parent(table))
                containers.insert(parent);
    }
    return containers;
}

}  // namespace

Superblock readSuperblock(int descriptor, ByteRange range)
{
    const Probe probe = range.length > 0 ? probeOf(descriptor, range) : nullptr;
    if (!probe)
        return {};
    blkid_probe_enable_superblocks(probe.get(), 1);
    blkid_probe_set_superblocks_flags(probe.get(), BLKID_SUBLKS_TYPE | BLKID_SUBLKS_USAGE |
                                                       BLKID_SUBLKS_LABEL | BLKID_SUBLKS_UUID |
                                                       BLKID_SUBLKS_VERSION);
    constexpr int ambivalent = -2;
    const int result = blkid_do_safeprobe(probe.get());
    if (result != 0)
        return {{}, {}, {}, {}, {}, result == ambivalent};
    return {valueOf(probe, "USAGE"), valueOf(probe, "TYPE"),    valueOf(probe, "LABEL"),
            valueOf(probe, "UUID"),  valueOf(probe, "VERSION"), false};
}

std::optional<PartitionTable> readPartitionTable(int descriptor)
{
    const Probe probe = probeOf(descriptor, {});
    if (!probe)
        return std::nullopt;
    blkid_probe_enable_superblocks(probe.get(), 0);
    blkid_probe_enable_partitions(probe.get(), 1);
    blkid_partlist list = blkid_probe_get_partitions(probe.get());
    blkid_parttable table = list != nullptr ? blkid_partlist_get_table(list) : nullptr;
    if (table == nullptr)
        return std::nullopt;

    PartitionTable result{textOrNothing(blkid_parttable_get_type(table)), {}};
    const std::set<blkid_partition> containers = containersIn(list);
    for (int i = 0; i < blkid_partlist_numof_partitions(list); ++i)
        result.partitions.push_back(read(blkid_partlist_get_partition(list, i), containers));
    return result;
}

}  // namespace pellar
