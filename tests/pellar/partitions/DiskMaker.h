// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/partitions/PartitionMap.h"
#include "tests/pellar/JobFixture.h"

#include <filesystem>
#include <string>
#include <string_view>

namespace pellar::test {

inline constexpr std::uint64_t mebibyte = 1U << 20U;

Bytes fileBytes(const std::filesystem::path& path);

/// A disk image that real tools have partitioned, and the ways in which it gets damaged. Sectors
/// have 512 bytes.
class DiskImage {
public:
    /// Throws when the tools cannot make it.
    static DiskImage gpt(const TestDirectory& workshop, std::string_view name = "disk.img");
    /// The same on 256 KiB: partitions at the sectors 64 to 319, nothing else between the copies.
    static DiskImage smallGPT(const TestDirectory& workshop);
    static DiskImage mbr(const TestDirectory& workshop, std::string_view script,
                         std::string_view name = "disk.img");

    const std::filesystem::path& path() const { return path_; }
    Bytes bytes() const { return fileBytes(path_); }
    Bytes part(std::uint64_t offset, std::uint64_t length) const;
    std::uint64_t sectorCount() const { return std::filesystem::file_size(path_) / 512; }

    // Each returns the disk itself.
    const DiskImage& put(std::uint64_t offset, ByteView bytes) const;
    const DiskImage& fill(std::uint64_t offset, std::uint64_t length, std::uint8_t value) const
    {
        return put(offset, Bytes(length, value));
    }
    const DiskImage& flip(std::uint64_t offset) const;
    const DiskImage& resize(std::uint64_t bytes) const;
    /// A number, least significant byte first.
    const DiskImage& set(std::uint64_t offset, std::size_t length, std::uint64_t value) const;

    /// Changes entry `number` (from 1) of both lists and gives both copies right checksums again.
    const DiskImage& setEntry(std::uint32_t number, std::uint64_t first, std::uint64_t last) const;
    /// Puts bytes into the same place of both lists, and seals them.
    const DiskImage& putIntoEntries(std::uint64_t offset, ByteView bytes) const;
    /// Gives the copy whose header is at this sector right checksums for what stands there.
    const DiskImage& seal(std::uint64_t headerPlace) const;

private:
    static DiskImage made(const TestDirectory& workshop, std::string_view name, std::uint64_t bytes,
                          const std::string& script);
    explicit DiskImage(std::filesystem::path path) : path_(std::move(path)) {}

    std::filesystem::path path_;
};

/// The reference to a whole disk.
contract::DiskReferencePointer wholeDisk(const std::filesystem::path& path);

}  // namespace pellar::test
