// SPDX-License-Identifier: Apache-2.0
#include "pellar/tools/ExfatBootSector.h"

namespace pellar {

std::optional<ExfatBootSector> parseExfatBootSector(Bytes bytes)
{
    constexpr std::uint64_t volumeDirty = 2;
    if (bytes.size() < ExfatBootSector::size || !holdsText(bytes, 3, "EXFAT   ") ||
        littleEndian(bytes, 510, 2) != 0xAA55)
        return std::nullopt;
    const unsigned sectorShift = bytes[108];
    const std::uint64_t sectors = littleEndian(bytes, 72, 8);
    if (sectorShift < 9 || sectorShift > 12 || sectors == 0)
        return std::nullopt;
    ExfatBootSector sector;
    sector.sectorBytes = 1U << sectorShift;
    sector.volumeBytes = productOrGreatest(sectors, sector.sectorBytes);
    sector.isMarkedDirty = (littleEndian(bytes, 106, 2) & volumeDirty) != 0;
    return sector;
}

std::optional<ExfatBootSector> readExfatBootSector(int descriptor, std::uint64_t offset,
                                                   std::uint64_t availableBytes)
{
    if (availableBytes < ExfatBootSector::size)
        return std::nullopt;
    if (const auto bytes = readDisk(descriptor, offset, ExfatBootSector::size))
        if (const auto sector = parseExfatBootSector(*bytes))
            return sector;
    for (const std::uint32_t sectorBytes : {512U, 1024U, 2048U, 4096U}) {
        const auto bytes =
            readDisk(descriptor, offset + 12ULL * sectorBytes, ExfatBootSector::size);
        auto backup = bytes ? parseExfatBootSector(*bytes) : std::nullopt;
        if (backup && backup->sectorBytes == sectorBytes) {
            backup->isBackup = true;
            return backup;
        }
    }
    return std::nullopt;
}

}  // namespace pellar
