// SPDX-License-Identifier: Apache-2.0
#include "pellar/partitions/SavedSectors.h"

#include "contract/foundation/UTF8.h"
#include "pellar/process/FileDescriptor.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>

#include <array>
#include <cerrno>
#include <ctime>
#include <system_error>

namespace pellar {
namespace {

namespace fs = std::filesystem;

std::string dateText(std::chrono::system_clock::time_point time, const char* form)
{
    const std::time_t seconds = std::chrono::system_clock::to_time_t(time);
    std::tm parts{};
    std::array<char, 64> text{};
    if (::gmtime_r(&seconds, &parts) == nullptr)
        return {};
    return {text.data(), std::strftime(text.data(), text.size(), form, &parts)};
}

std::string fileNameOf(const SectorWrite& write)
{
    return "sector-" + std::to_string(write.first) + ".bin";
}

/// For a POSIX shell, and fit to be shown: a name with control characters cannot be copied from
/// there, but does no harm either.
std::string quoted(const fs::path& path)
{
    std::string text = "'";
    for (const char character : contract::printable(path.native()))
        text += character == '\'' ? std::string("'\\''") : std::string(1, character);
    return text + "'";
}

int syncDirectory(const fs::path& directory)
{
    const FileDescriptor opened(::open(directory.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    return opened && ::fsync(opened.get()) == 0 ? 0 : errno;
}

int writeFile(const fs::path& path, ByteView bytes)
{
    const FileDescriptor file(
        ::open(path.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_NOFOLLOW | O_CLOEXEC, 0600));
    if (!file)
        return errno;
    while (!bytes.empty()) {
        const ssize_t count = ::write(file.get(), bytes.data(), bytes.size());
        if (count < 0 && errno != EINTR)
            return errno;
        bytes = bytes.subspan(static_cast<std::size_t>(std::max<ssize_t>(count, 0)));
    }
    return ::fsync(file.get()) == 0 ? 0 : errno;
}

/// The first free of DATE, DATE-2, DATE-3, ...; empty, and errno, when it cannot be made.
fs::path makeDirectory(const fs::path& parent, std::chrono::system_clock::time_point now)
{
    constexpr int mostTries = 100;
    const std::string date = dateText(now, "%Y%m%dT%H%M%SZ");
    for (int i = 1; i <= mostTries; ++i) {
        const fs::path directory = parent / (i == 1 ? date : date + "-" + std::to_string(i));
        if (::mkdir(directory.c_str(), 0700) == 0)
            return directory;
        if (errno != EEXIST)
            return {};
    }
    return {};
}

int fill(const fs::path& directory, const RepairPlan& plan, const SavedDisk& disk)
{
    for (const SectorWrite& write : plan.writes)
        if (const int error = writeFile(directory / fileNameOf(write), write.before))
            return error;
    const std::string text = instructionsFor(plan, disk, directory);
    const auto* const bytes = reinterpret_cast<const std::uint8_t*>(text.data());
    if (const int error = writeFile(directory / "README.txt", ByteView(bytes, text.size())))
        return error;
    if (const int error = syncDirectory(directory))
        return error;
    return syncDirectory(directory.parent_path());
}

Sentence cannotSave(int error)
{
    return {"the sectors that it would overwrite cannot be kept first: %1$@",
            std::generic_category().message(error),
            {}};
}

}  // namespace

std::string instructionsFor(const RepairPlan& plan, const SavedDisk& disk, const fs::path& saved)
{
    std::string text =
        "Sectors of a partition map, as they were before it was repaired.\n\nDisk:  " +
        contract::printable(disk.path.native()) +
        "\nDate:  " + dateText(disk.now, "%Y-%m-%d %H:%M:%S UTC") +
        "\nSector size:  " + std::to_string(disk.sectorBytes) + " bytes\n\n";
    for (const SectorWrite& write : plan.writes)
        text += fileNameOf(write) + "  " + std::to_string(write.before.size()) +
                " bytes from byte " + std::to_string(disk.offset + write.first * disk.sectorBytes) +
                "\n";
    text += "\nTo put them back, with no partition of the disk in use:\n\n";
    for (const SectorWrite& write : plan.writes)
        text += "dd if=" + quoted(saved / fileNameOf(write)) + " of=" + quoted(disk.path) +
                " bs=" + std::to_string(disk.sectorBytes) +
                " seek=" + std::to_string(disk.offset / disk.sectorBytes + write.first) +
                " conv=notrunc,fsync\n";
    return text;
}

Result<fs::path, Sentence> saveSectors(const RepairPlan& plan, const SavedDisk& disk,
                                       const fs::path& directory)
{
    if (!directory.is_absolute())
        return Sentence{
            "there is no directory to keep the sectors in that it would overwrite", {}, {}};
    std::error_code error;
    fs::create_directories(directory, error);
    if (error)
        return cannotSave(error.value());
    fs::path saved = makeDirectory(directory, disk.now);
    if (saved.empty())
        return cannotSave(errno);
    if (const int failure = fill(saved, plan, disk))
        return cannotSave(failure);
    return saved;
}

}  // namespace pellar
