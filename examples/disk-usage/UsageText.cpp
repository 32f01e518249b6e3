// SPDX-License-Identifier: Apache-2.0
#include "UsageText.h"

#include "contract/foundation/UTF8.h"

#include <array>
#include <cmath>
#include <system_error>

namespace diskusage {
namespace {

using contract::localizable;
using contract::printable;

constexpr std::size_t sizeColumn = 12;  // characters

std::string meaningOf(int error)
{
    return std::generic_category().message(error);
}

std::string rightAligned(const std::string& text, std::size_t columns)
{
    return text.size() < columns ? std::string(columns - text.size(), ' ') + text : text;
}

}  // namespace

std::string UsageText::sentence(std::string_view key,
                                std::initializer_list<contract::FormatArgument> arguments) const
{
    return contract::format(localized(key), arguments);
}

std::string UsageText::number(std::uint64_t count) const
{
    return host_.decimalString(contract::Value(count));
}

// Powers of 1024 (IEC 80000-13), with one decimal where that says more.
std::string UsageText::bytes(std::uint64_t count) const
{
    static constexpr std::array units{"B", "KiB", "MiB", "GiB", "TiB", "PiB", "EiB"};
    auto size = static_cast<double>(count);
    std::size_t unit = 0;
    for (; size >= 1024 && unit + 1 < units.size(); ++unit)
        size /= 1024;
    const bool isWhole = unit == 0 || size >= 100 || size == std::floor(size);
    const contract::Value rounded =
        isWhole ? contract::Value(std::llround(size)) : contract::Value(std::round(size * 10) / 10);
    return host_.decimalString(rounded) + " " + units.at(unit);
}

std::string UsageText::ofDisk(const contract::OVDisk& disk) const
{
    const auto* const filesystem = disk.filesystem();
    const std::string name =
        filesystem != nullptr && !filesystem->filesystemType().empty()
            ? sentence(localizable("“%@” (%@)"),
                       {printable(disk.displayName()), printable(filesystem->filesystemType())})
            : sentence(localizable("“%@”"), {printable(disk.displayName())});
    if (!contract::hasMountPoint(disk))
        return sentence(
                   disk.isOfflineDiskImage()
                       ? localizable("%@: an image file that is not attached; how full it is "
                                     "can be seen once it is attached and mounted.")
                       : localizable("%@: not mounted; how full it is can be seen once it is."),
                   {name}) +
               "\n";
    const std::string mountPoint = *disk.mountPoint();
    std::string text =
        sentence(localizable("%@, mounted at %@"), {name, printable(mountPoint)}) + "\n";
    std::error_code error;
    const auto space = std::filesystem::space(mountPoint, error);
    if (error || space.capacity == 0)
        return text + "    " +
               sentence(localizable("How full it is cannot be told: %@."),
                        {error ? printable(error.message())
                               : localized(localizable("it does not say how large it is"))}) +
               "\n";
    const std::uint64_t used = space.capacity - space.free;
    // As df(1) has it: of what there is for users, without what is kept for root.
    const double share = static_cast<double>(used) / static_cast<double>(used + space.available);
    return text + "    " +
           sentence(localizable("%@ of %@ used (%@ %%), %@ available"),
                    {bytes(used), bytes(space.capacity),
                     used + space.available == 0 ? 100 : std::llround(std::ceil(share * 100)),
                     bytes(space.available)}) +
           "\n";
}

std::string UsageText::ofScan(const ScanResult& scan) const
{
    std::string text;
    const auto line = [&](std::uint64_t size, const std::string& name) {
        text += "    " + rightAligned(bytes(size), sizeColumn) + "  " + name + "\n";
    };
    if (!scan.largest.empty())
        text += "    " +
                localized(localizable("What took most of the room when it was measured:")) + "\n";
    for (const TopEntry& entry : scan.largest)
        line(entry.bytes, printable(entry.name) + (entry.isDirectory ? "/" : ""));
    if (scan.otherEntries > 0)
        line(scan.otherBytes,
             sentence(localizable("all the others (%@)"), {number(scan.otherEntries)}));
    return text + omissions(scan);
}

std::string UsageText::omissions(const ScanResult& scan) const
{
    std::string text;
    const auto add = [&](const std::string& sentence) {
        text += "    " + sentence + "\n";
    };
    if (scan.unreadable == 1 && scan.firstUnreadable.empty())
        add(sentence(localizable("It could not be read: %@."), {meaningOf(scan.firstError)}));
    else if (scan.unreadable > 0)
        add(sentence(localizable("Could not be read, and is not counted: %@. The first: %@ (%@)."),
                     {number(scan.unreadable), printable(scan.firstUnreadable),
                      meaningOf(scan.firstError)}));
    if (scan.otherMounts > 0)
        add(sentence(localizable("Mounted below it, and not looked at: %@."),
                     {number(scan.otherMounts)}));
    if (scan.tooDeep > 0)
        add(sentence(localizable("Folders too deep to be looked at: %@."), {number(scan.tooDeep)}));
    if (scan.end != ScanResult::End::Complete)
        add(sentence(
            scan.end == ScanResult::End::Stopped
                ? localizable("Stopped after %@ files and folders: there is more than this.")
                : localizable("Given up after %@ files and folders: there are too many to "
                              "be measured."),
            {number(scan.entries)}));
    return text;
}

std::string UsageText::ofProgress(const contract::OVDisk& disk, const ScanProgress& progress) const
{
    return sentence(localizable("Measuring “%@”: %@ files and folders so far"),
                    {printable(disk.displayName()), number(progress.entries)});
}

}  // namespace diskusage
