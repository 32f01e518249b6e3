// SPDX-License-Identifier: Apache-2.0
#include "tests/pellar/partitions/DiskMaker.h"

#include "pellar/bytes/Checksums.h"

#include <map>

namespace pellar::test {
Bytes fileBytes(const std::filesystem::path& path)
{
    const std::string bytes = orvane::test::contentsOf(path);
    return {bytes.begin(), bytes.end()};
}

// sfdisk waits a quarter of a second after every change, so each disk is made once and copied.
DiskImage DiskImage::made(const TestDirectory& workshop, std::string_view name, std::uint64_t bytes,
                          const std::string& script)
{
    static std::map<std::string, Bytes> disks;
    const DiskImage image(workshop.makeFile(name, bytes));
    if (const auto known = disks.find(script); known != disks.end()) {
        image.put(0, known->second);
        return image;
    }
    orvane::test::prepareWith({"sfdisk", "-q", image.path()}, script);
    disks[script] = image.bytes();
    return image;
}

// Three partitions out of order on 16 MiB, and marks between and behind them.
DiskImage DiskImage::gpt(const TestDirectory& workshop, std::string_view name)
{
    DiskImage image = made(workshop, name, 16 * mebibyte,
                           "label: gpt\n"
                           "start=2048, size=8192, name=\"Data\"\n"
                           "start=20480, size=4096, name=\"Home\"\n"
                           "start=12288, size=4096, name=\"Ørsted\"\n");
    for (const std::uint64_t sector : {2048U, 10239U, 12288U, 18000U, 24575U, 32734U})
        image.fill(sector * 512, 512, static_cast<std::uint8_t>(sector));
    return image;
}

DiskImage DiskImage::smallGPT(const TestDirectory& workshop)
{
    DiskImage image = made(workshop, "small.img", 256U << 10U,
                           "label: gpt\nfirst-lba: 34\n"
                           "start=64, size=128, name=\"Data\"\n"
                           "start=256, size=64, name=\"Home\"\n"
                           "start=192, size=64\n");
    image.fill(64 * 512, 256 * 512, 0x5A);
    return image;
}

DiskImage DiskImage::mbr(const TestDirectory& workshop, std::string_view script,
                         std::string_view name)
{
    return made(workshop, name, 16 * mebibyte, "label: dos\n" + std::string(script));
}

const DiskImage& DiskImage::put(std::uint64_t offset, ByteView bytes) const
{
    orvane::test::patch(path_, offset, {reinterpret_cast<const char*>(bytes.data()), bytes.size()});
    return *this;
}

const DiskImage& DiskImage::flip(std::uint64_t offset) const
{
    return fill(offset, 1, part(offset, 1).front() ^ 0xFFU);
}

const DiskImage& DiskImage::resize(std::uint64_t bytes) const
{
    std::filesystem::resize_file(path_, bytes);
    return *this;
}

const DiskImage& DiskImage::set(std::uint64_t offset, std::size_t length, std::uint64_t value) const
{
    Bytes number(length);
    putLittleEndian(number, 0, length, value);
    return put(offset, number);
}

const DiskImage& DiskImage::setEntry(std::uint32_t number, std::uint64_t first,
                                     std::uint64_t last) const
{
    Bytes place(16);
    putLittleEndian(place, 0, 8, first);
    putLittleEndian(place, 8, 8, last);
    return putIntoEntries((number - 1) * 128ULL + 32, place);
}

Bytes DiskImage::part(std::uint64_t offset, std::uint64_t length) const
{
    const std::string all = orvane::test::contentsOf(path_).substr(offset, length);
    return {all.begin(), all.end()};
}

const DiskImage& DiskImage::putIntoEntries(std::uint64_t offset, ByteView bytes) const
{
    for (const std::uint64_t header : {std::uint64_t{1}, sectorCount() - 1}) {
        put(littleEndian(part(header * 512, 512), 72, 8) * 512 + offset, bytes);
        seal(header);
    }
    return *this;
}

const DiskImage& DiskImage::seal(std::uint64_t headerPlace) const
{
    Bytes header = part(headerPlace * 512, 512);
    const Bytes entries = part(littleEndian(header, 72, 8) * 512,
                               littleEndian(header, 80, 4) * littleEndian(header, 84, 4));
    putLittleEndian(header, 88, 4, crc32(entries));
    putLittleEndian(header, 16, 4, 0);
    putLittleEndian(header, 16, 4, crc32(ByteView(header).first(92)));
    return put(headerPlace * 512, header);
}

contract::DiskReferencePointer wholeDisk(const std::filesystem::path& path)
{
    auto disk = std::make_shared<contract::DiskReference>(*reference(path, ""));
    disk->isWhole = true;
    return disk;
}

}  // namespace pellar::test
