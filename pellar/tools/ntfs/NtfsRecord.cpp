// SPDX-License-Identifier: Apache-2.0
#include "pellar/tools/ntfs/NtfsRecord.h"

namespace pellar {
namespace {

constexpr std::size_t protectedBytes = 512;

/// The value lies within the attribute, or is empty.
Bytes valueOf(Bytes attribute)
{
    const std::uint64_t length = littleEndian(attribute, 16, 4);
    const std::uint64_t start = littleEndian(attribute, 20, 2);
    return start + length <= attribute.size() ? attribute.subspan(start, length) : Bytes();
}

}  // namespace

bool undoNtfsProtection(std::vector<std::uint8_t>& block)
{
    const std::size_t array = littleEndian(block, 4, 2);
    const std::size_t count = littleEndian(block, 6, 2);
    if (count != block.size() / protectedBytes + 1 || array + count * 2 > protectedBytes)
        return false;
    for (std::size_t i = 1; i < count; ++i) {
        const std::size_t end = i * protectedBytes - 2;
        if (block[end] != block[array] || block[end + 1] != block[array + 1])
            return false;
        block[end] = block[array + 2 * i];
        block[end + 1] = block[array + 2 * i + 1];
    }
    return true;
}

std::optional<std::vector<std::uint8_t>> readNtfsRecord(int descriptor, std::uint64_t offset,
                                                        const NtfsBootSector& sector,
                                                        std::uint64_t number)
{
    if (sector.fileTablePlace > sector.volumeBytes)
        return std::nullopt;
    auto record =
        readDisk(descriptor, offset + sector.fileTablePlace + number * sector.fileRecordBytes,
                 sector.fileRecordBytes);
    if (!record || !holdsText(*record, 0, "FILE") || !undoNtfsProtection(*record))
        return std::nullopt;
    return record;
}

std::optional<NtfsAttribute> findNtfsAttribute(Bytes record, std::uint32_t type)
{
    constexpr std::uint32_t endOfAttributes = 0xFFFFFFFF;
    constexpr std::size_t headBytes = 24;
    std::size_t at = littleEndian(record, 20, 2);
    while (at + headBytes <= record.size()) {
        const std::uint64_t found = littleEndian(record, at, 4);
        const std::uint64_t length = littleEndian(record, at + 4, 4);
        if (found == endOfAttributes || length < headBytes || length > record.size() - at)
            return std::nullopt;
        const Bytes bytes = record.subspan(at, length);
        const bool isResident = bytes[8] == 0;
        if (found == type)
            return NtfsAttribute{isResident, bytes, isResident ? valueOf(bytes) : Bytes()};
        at += length;
    }
    return std::nullopt;
}

}  // namespace pellar
