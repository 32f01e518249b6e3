// SPDX-License-Identifier: Apache-2.0
#include "orvane/privileges/DiskIdentity.h"

#include "orvane/support/disks/BlockProbe.h"
#include "orvane/support/disks/UdevDatabase.h"
#include "orvane/support/files/WholeFile.h"

#include <sys/stat.h>
#include <sys/sysmacros.h>
#include <unistd.h>

#include <fmt/format.h>
#include <algorithm>
#include <charconv>

namespace orvane {
namespace {

constexpr std::size_t longestUUID = 64;

bool isUUID(std::string_view text)
{
    return text.size() <= longestUUID && std::all_of(text.begin(), text.end(), [](char character) {
               return (character >= '0' && character <= '9') ||
                      (character >= 'a' && character <= 'z') ||
                      (character >= 'A' && character <= 'Z') || character == '-';
           });
}

std::string numberOf(dev_t device)
{
    return fmt::format("{}:{}", major(device), minor(device));
}

/// A partition has its disk's, which is the directory above (since Linux 5.15).
std::uint64_t sequenceOf(dev_t device)
{
    std::error_code error;
    const auto entry = std::filesystem::canonical("/sys/dev/block/" + numberOf(device), error);
    for (const auto& directory : {entry, entry.parent_path()}) {
        const auto text = readWholeFile(directory / "diskseq", 64);
        std::uint64_t number = 0;
        if (!error && text &&
            std::from_chars(text->data(), text->data() + text->size(), number).ec == std::errc())
            return number;
    }
    return 0;
}

std::string uuidFromUdev(dev_t device)
{
    const std::string uuid = udevProperties(numberOf(device))["ID_FS_UUID"];
    return isUUID(uuid) ? uuid : std::string();
}

/// Up to the next colon, which is taken away with it.
std::string_view takePart(std::string_view& text)
{
    const std::string_view part = text.substr(0, text.find(':'));
    text.remove_prefix(std::min(part.size() + 1, text.size()));
    return part;
}

template <class Number>
bool readNumber(std::string_view text, Number& number)
{
    const char* const end = text.data() + text.size();
    const auto [rest, error] = std::from_chars(text.data(), end, number);
    return error == std::errc() && rest == end;
}

}  // namespace

std::string DiskIdentity::text() const
{
    return fmt::format("{}:{}:{}", numberOf(device), sequence, uuid);
}

std::optional<DiskIdentity> DiskIdentity::fromText(std::string_view text)
{
    constexpr int separators = 3;
    if (std::count(text.begin(), text.end(), ':') != separators)
        return std::nullopt;
    unsigned majorNumber = 0;
    unsigned minorNumber = 0;
    DiskIdentity identity;
    if (!readNumber(takePart(text), majorNumber) || !readNumber(takePart(text), minorNumber) ||
        !readNumber(takePart(text), identity.sequence) || !isUUID(text))
        return std::nullopt;
    identity.device = makedev(majorNumber, minorNumber);
    identity.uuid = text;
    return identity;
}

bool DiskIdentity::isStill(const DiskIdentity& now) const
{
    const bool isOther = sequence != 0 && now.sequence != 0 && sequence != now.sequence;
    const bool holdsOther = !uuid.empty() && !now.uuid.empty() && uuid != now.uuid;
    return device != 0 && device == now.device && !isOther && !holdsOther;
}

DiskIdentity identityOf(const std::filesystem::path& node)
{
    struct stat status = {};
    if (::stat(node.c_str(), &status) != 0 || !S_ISBLK(status.st_mode))
        return {};
    return {status.st_rdev, sequenceOf(status.st_rdev), uuidFromUdev(status.st_rdev)};
}

DiskIdentity identityOf(const FileDescriptor& device)
{
    struct stat status = {};
    if (::fstat(device.get(), &status) != 0 || !S_ISBLK(status.st_mode))
        return {};
    const off_t end = ::lseek(device.get(), 0, SEEK_END);
    const ByteRange all{0, end > 0 ? static_cast<std::uint64_t>(end) : 0};
    const std::string uuid = readSuperblock(device.get(), all).uuid;
    return {status.st_rdev, sequenceOf(status.st_rdev), isUUID(uuid) ? uuid : std::string()};
}

}  // namespace orvane
