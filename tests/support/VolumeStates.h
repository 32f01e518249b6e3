// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>
#include <cstdint>
#include <ostream>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace orvane::test {

/// How a volume is made for a test: an empty file, and a program that is given its name last.
struct VolumeMaker {
    std::string_view filesystem;
    std::string_view package;
    std::uint64_t bytes;
    std::vector<std::string> command;
};

struct Patch {
    std::uint64_t offset;
    std::string bytes;
};

/// What is done to a new volume, and what the checks say of it then, by the names of verdicts.
struct VolumeState {
    std::string_view filesystem;
    std::string_view state;
    std::vector<Patch> patches;
    std::vector<std::string> command;  ///< is given the image's name last; may be empty
    std::string_view verified;
    std::string_view repaired;
    std::string_view afterwards;  ///< verified once more
    std::string_view because;
};

/// For the names of tests.
inline void PrintTo(const VolumeState& state, std::ostream* stream)
{
    *stream << state.filesystem << ", " << state.state;
}

inline std::string zeros(std::size_t count)
{
    return std::string(count, '\0');
}

/// The first page of an NTFS journal that a client has open; ntfs-3g.probe(8) calls a volume with
/// it unclean. The last bytes of each 512 are kept in its head.
inline std::string waitingJournalPage()
{
    std::string page = zeros(4096);
    const auto put = [&page](std::size_t at, std::uint64_t value, std::size_t bytes) {
        for (std::size_t i = 0; i < bytes; ++i)
            page[at + i] = static_cast<char>(value >> 8 * i);
    };
    page.replace(0, 4, "RSTR");
    put(4, 30, 2);  // where the kept bytes stand, and how many pairs
    put(6, 9, 2);
    put(16, 4096, 4);  // bytes of a page
    put(20, 4096, 4);
    put(24, 48, 2);    // where the restart area begins
    put(48, 1000, 8);  // its number
    put(56, 1, 2);     // one client,
    put(58, 0xFFFF, 2);
    put(60, 0, 2);  // which is in use
    put(30, 1, 2);
    for (std::size_t end = 510; end < page.size(); end += 512)
        put(end, 1, 2);
    return page;
}

inline const std::vector<VolumeMaker>& volumeMakers()
{
    static const std::vector<VolumeMaker> makers{
        {"vfat", "dosfstools", 20U << 20U, {"mkfs.fat", "-F", "16", "-n", "FAT"}},
        {"exfat", "exfatprogs", 32U << 20U, {"mkfs.exfat", "-L", "EX"}},
        {"ntfs", "ntfs-3g", 32U << 20U, {"mkntfs", "-q", "-Q", "-F", "-L", "NT"}},
        {"xfs", "xfsprogs", 300U << 20U, {"mkfs.xfs", "-q", "-L", "XFS"}},
        {"btrfs", "btrfs-progs", 120U << 20U, {"mkfs.btrfs", "-q", "-L", "BT"}},
        {"f2fs", "f2fs-tools", 64U << 20U, {"mkfs.f2fs", "-q", "-l", "F2"}},
    };
    return makers;
}

/// What is done to a new volume, and what a check, a repair and the check after it say of it.
inline VolumeState state(std::string_view filesystem, std::string_view name,
                         const std::array<std::string_view, 3>& verdicts, std::string_view because,
                         std::vector<Patch> patches = {}, std::vector<std::string> command = {})
{
    return {filesystem,  name,        std::move(patches), std::move(command),
            verdicts[0], verdicts[1], verdicts[2],        because};
}

/// The places are those of the volumes that the makers above make, on Debian 12 and 13. mkfs.exfat
/// 1.2.9 has one entry more in the root: the nonsense there hits that of the upcase table as well.
inline const std::vector<VolumeState>& volumeStates()
{
    constexpr std::uint64_t fatTable = 2048;
    constexpr std::uint64_t fatTableBytes = 40 * 512;
    constexpr std::uint64_t exfatRoot = 2109440;
    constexpr std::uint64_t ntfsFileTable = 4 * 4096;
    constexpr std::uint64_t ntfsMirror = 4095 * 4096;
    constexpr std::uint64_t ntfsMap = 1031 * 4096;
    constexpr std::uint64_t ntfsJournal = 4096 * 4096;
    constexpr std::uint64_t ntfsVolumeFlags = 3 * 1024 + 426;
    constexpr std::uint64_t ntfsBackup = (32U << 20U) - 512;
    constexpr std::uint64_t f2fsSegments = 1536 * 4096;
    static const std::string exfatNonsense =
        std::string("\x85\x02", 2) + zeros(30) + "\xC0" + zeros(31) + "\xC1" + zeros(31);
    static const std::vector<VolumeState> states{
        state("vfat", "sound", {"sound", "sound", "sound"}, "nothing is written to it"),
        state("vfat", "dirty", {"damaged", "repaired", "sound"},
              "the mark is taken off once all is checked", {{0x25, "\x01"}}),
        state("vfat", "lost chain", {"damaged", "repaired", "sound"},
              "what nothing names becomes a file",
              {{fatTable + 10, "\xFF\xFF"}, {fatTable + fatTableBytes + 10, "\xFF\xFF"}}),
        state("exfat", "sound", {"sound", "sound", "sound"}, "nothing is written to it"),
        state("exfat", "dirty", {"damaged", "repaired", "sound"},
              "fsck.exfat pays no heed to the mark, but takes it off",
              {{106, std::string("\x02\0", 2)}}),
        state("exfat", "nonsense in the root", {"damaged", "repaired", "sound"}, "deleted",
              {{exfatRoot + 96, exfatNonsense}}),
        state("exfat", "no root", {"damaged", "damaged", "damaged"},
              "fsck.exfat says \"clean\" and cannot repair it", {{exfatRoot, zeros(128)}}),
        state("exfat", "no boot sector", {"damaged", "damaged", "damaged"},
              "the backup is seen, but fsck.exfat does not use it", {{0, zeros(512)}}),
        state("ntfs", "sound", {"sound", "sound", "sound"}, "ntfsfix does not run"),
        state("ntfs", "dirty", {"inconclusive", "inconclusive", "inconclusive"},
              "taking the mark off would be no repair",
              {{ntfsFileTable + ntfsVolumeFlags, "\x01"}, {ntfsMirror + ntfsVolumeFlags, "\x01"}}),
        state("ntfs", "journal waiting", {"inconclusive", "inconclusive", "inconclusive"},
              "ntfsresize finds nothing wrong, and the journal may change all of it",
              {{ntfsJournal, waitingJournalPage()}, {ntfsJournal + 4096, waitingJournalPage()}}),
        state("ntfs", "no file table", {"damaged", "damaged", "damaged"},
              "libblkid knows it no more, and its boot sector ends like a partition map",
              {{ntfsFileTable, zeros(1024)}}),
        state("ntfs", "wrong map", {"damaged", "damaged", "damaged"},
              "ntfsfix says that all is well", {{ntfsMap, zeros(256)}}),
        state("ntfs", "no copy of the file table", {"damaged", "inconclusive", "inconclusive"},
              "mended, and marked to be checked by its own system", {{ntfsMirror, zeros(1024)}}),
        state("ntfs", "no boot sector", {"damaged", "inconclusive", "inconclusive"},
              "brought back from the backup, and marked", {{0, zeros(512)}}),
        state("ntfs", "no backup of the boot sector", {"damaged", "inconclusive", "inconclusive"},
              "ntfsresize pays no heed to it; ntfsfix writes it anew, and marks the volume",
              {{ntfsBackup, zeros(512)}}),
        state("xfs", "sound", {"sound", "sound", "sound"}, "nothing is written to it"),
        state("xfs", "wrong count", {"damaged", "repaired", "sound"}, "counted anew", {},
              {"xfs_db", "-x", "-c", "sb 0", "-c", "write -d fdblocks 5"}),
        state("xfs", "no superblock", {"damaged", "repaired", "sound"},
              "brought back from that of another group", {{0, zeros(512)}}),
        state("btrfs", "sound", {"sound", "failed", "sound"}, "it is never repaired"),
        state("btrfs", "no superblock", {"damaged", "failed", "damaged"},
              "the mirror is seen; it is never repaired", {{64U << 10U, zeros(4096)}}),
        state("f2fs", "sound", {"sound", "sound", "sound"}, "nothing is written to it"),
        state("f2fs", "wrong segment", {"damaged", "repaired", "sound"}, "counted anew",
              {{f2fsSegments + 5 * 74, std::string("\x01\0\xFF", 3)}}),
        state("f2fs", "no first superblock", {"damaged", "damaged", "damaged"},
              "the second is used, but fsck.f2fs does not bring the first one back",
              {{1024, zeros(512)}}),
    };
    return states;
}

}  // namespace orvane::test
