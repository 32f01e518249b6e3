// SPDX-License-Identifier: Apache-2.0
#include "pellar/permissions/dpkg/ArchiveFetch.h"

#include "contract/foundation/UTF8.h"
#include "pellar/permissions/Lines.h"
#include "pellar/permissions/PackagedFile.h"
#include "pellar/permissions/TemporaryDirectory.h"

#include <fcntl.h>
#include <pwd.h>
#include <unistd.h>

#include <cstdlib>
#include <unordered_set>
#include <utility>

namespace pellar {
namespace {

/// apt-helper(8) is no command for users and lies in no search path.
constexpr const char* aptHelper = "/usr/lib/apt/apt-helper";

/// Keeps the addresses among what apt-get says. For a package that it has no source for, it says
/// that on its standard error, goes on with the others and exits with 100 (apt 2.6.1).
class AddressReader final : public RunListener {
public:
    void line(std::string_view line, bool isCut) override
    {
        if (auto found = isCut ? std::nullopt : parseArchiveAddress(line))
            addresses.push_back(*std::move(found));
    }
    void progressLine(std::string_view) override {}
    void lineLimitReached() override {}
    void pause() override {}
    void tick() override {}

    std::vector<ArchiveAddress> addresses;
};

/// Passes on what apt complains of: a warning begins with "W:", an error with "E:". The first few
/// say what the others do.
class ComplaintReader final : public RunListener {
public:
    explicit ComplaintReader(const std::function<void(std::string)>& tell) : tell_(tell) {}

    void line(std::string_view line, bool) override
    {
        constexpr int mostComplaints = 10;
        const bool isComplaint = line.starts_with("W: ") || line.starts_with("E: ");
        if (isComplaint && tell_ && told_++ < mostComplaints)
            tell_("apt: " + contract::printable(std::string(line)));
    }
    void progressLine(std::string_view) override {}
    void lineLimitReached() override {}
    void pause() override {}
    void tick() override {}

private:
    const std::function<void(std::string)>& tell_;
    int told_ = 0;
};

/// apt's own user for what comes from the network; nobody where root does not fetch.
const passwd* userOfApt()
{
    return ::geteuid() == 0 ? ::getpwnam("_apt") : nullptr;
}

}  // namespace

// 'http://deb.debian.org/debian/pool/main/h/hello/hello_2.10-3_amd64.deb' hello_2.10-3_amd64.deb
// 53080 SHA256:2e6e2f1a0007dc43bc91c273fd36e91e40a4f1c2765a03eca68b70a42103878a
// (apt 2.6.1, on one line)
std::optional<ArchiveAddress> parseArchiveAddress(std::string_view line)
{
    if (!line.starts_with('\''))
        return std::nullopt;
    line.remove_prefix(1);
    const std::string_view address = takeField(line, '\'');
    const std::string_view name = takeWord(line);
    takeWord(line);
    const std::string_view hash = takeWord(line);
    const bool isWeb = address.starts_with("http://") || address.starts_with("https://");
    if (!isWeb || !hash.starts_with("SHA256:"))
        return std::nullopt;
    return ArchiveAddress{std::string(address), std::string(name), std::string(hash)};
}

ArchiveFetch::ArchiveFetch(const std::string& toolPath, StopSwitch& stop, FetchListener listener)
    : aptGet_(findProgram("apt-get", toolPath)), stop_(stop), listener_(std::move(listener))
{
}

std::vector<FileDescriptor> ArchiveFetch::fetch(std::span<const DpkgPackage> packages) const
{
    const auto directory = TemporaryDirectory::make("archives");
    const passwd* const user = userOfApt();
    if (!directory || (user != nullptr && !directory->giveTo(user->pw_uid, 0)))
        return {};
    fetch(packages, directory->path());
    std::vector<FileDescriptor> archives;
    for (const DpkgPackage& package : packages)
        archives.push_back(privateCopy(directory->path() / (package.fileName() + ".deb")));
    return archives;
}

// apt's user could still write to the file itself while it is checked and read.
FileDescriptor ArchiveFetch::privateCopy(const std::filesystem::path& archive) const
{
    const FileDescriptor from(
        ::open(archive.c_str(), O_RDONLY | O_CLOEXEC | O_NOFOLLOW | O_NONBLOCK));
    std::error_code error;
    std::string name = std::filesystem::temp_directory_path(error).native() + "/orvane-deb.XXXXXX";
    FileDescriptor copy(from && !error ? ::mkostemp(name.data(), O_CLOEXEC) : -1);
    if (!copy)
        return {};
    ::unlink(name.c_str());
    CopyBounds bounds{mostBytesOfPackage, mostBytesOfPackage};
    const bool isCopied = copyFile(from.get(), copy.get(), bounds, stop_) == Copying::Done;
    ::unlink(archive.c_str());
    return isCopied ? std::move(copy) : FileDescriptor();
}

void ArchiveFetch::fetch(std::span<const DpkgPackage> packages,
                         const std::filesystem::path& directory) const
{
    const std::vector<Download> downloads = downloadsOf(packages, directory);
    if (downloads.empty() || download(downloads))
        return;
    // One of them went wrong, and which is not told.
    for (const Download& single : downloads)
        if (!download({&single, 1}))
            ::unlink(single.target.c_str());
}

std::vector<ArchiveFetch::Download> ArchiveFetch::downloadsOf(
    std::span<const DpkgPackage> packages, const std::filesystem::path& directory) const
{
    std::unordered_set<std::string> names;
    Command command{aptGet_, {"--print-uris", "download"}};
    for (const DpkgPackage& package : packages) {
        names.insert(package.fileName() + ".deb");
        command.arguments.push_back(package.name + ':' + package.architecture + '=' +
                                    package.version);
    }
    AddressReader reader;
    static_cast<void>(!aptGet_.empty() && run(std::move(command), reader));
    std::vector<Download> downloads;
    for (ArchiveAddress& archive : reader.addresses)
        if (names.erase(archive.name) > 0)
            downloads.push_back({archive, directory / archive.name});
    return downloads;
}

bool ArchiveFetch::download(std::span<const Download> downloads) const
{
    Command command{aptHelper, {"download-file"}};
    for (const Download& one : downloads)
        command.arguments.insert(command.arguments.end(),
                                 {one.archive.address, one.target.native(), one.archive.hash});
    ComplaintReader complaints(listener_.remark);
    return run(std::move(command), complaints);
}

bool ArchiveFetch::run(Command command, RunListener& listener) const
{
    if (stop_.isPressed())
        return false;
    RunRequest request;
    request.command = std::move(command);
    request.graceTimes = graceTimesFor(Access::ReadOnly);
    if (listener_.trace)
        listener_.trace(shown(request.command));
    return runTool(request, stop_, listener).ending == Ending(Exited{0});
}

}  // namespace pellar
