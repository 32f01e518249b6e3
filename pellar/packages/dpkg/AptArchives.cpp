// SPDX-License-Identifier: Apache-2.0
#include "pellar/packages/dpkg/AptArchives.h"

#include "contract/foundation/UTF8.h"
#include "pellar/bytes/Digest.h"
#include "pellar/packages/PackagedFile.h"
#include "pellar/packages/TemporaryDirectory.h"
#include "pellar/packages/TextLines.h"

#include <fcntl.h>
#include <pwd.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cstdint>
#include <cstdlib>
#include <unordered_set>
#include <utility>

namespace pellar {
namespace {

const std::string listDirectory = "var/lib/apt/lists";
constexpr std::uint64_t mostBytesOfList = 1U << 30U;  ///< Debian's whole "main" has 50 million
constexpr std::size_t mostLists = 500;

bool isRootsAlone(int file)
{
    struct stat status = {};
    return ::fstat(file, &status) == 0 && status.st_uid == 0 &&
           (status.st_mode & (S_IWGRP | S_IWOTH)) == 0;
}

bool isPackageList(const std::string& name)
{
    const std::size_t mark = name.rfind("_Packages");
    return mark != std::string::npos && (mark + 9 == name.size() || name[mark + 9] == '.');
}

/// Takes a list line by line, as its pieces come.
class ListReader {
public:
    explicit ListReader(std::unordered_map<std::string, std::vector<std::string>>& digests)
        : digests_(digests)
    {
    }

    bool take(std::string_view bytes)
    {
        constexpr std::size_t longestLine = 1U << 20U;
        size_ += bytes.size();
        rest_ += bytes;
        std::string_view lines = rest_;
        for (std::size_t end = 0; (end = lines.find('\n')) != std::string_view::npos;) {
            line(lines.substr(0, end));
            lines.remove_prefix(end + 1);
        }
        rest_.erase(0, rest_.size() - lines.size());
        return size_ <= mostBytesOfList && rest_.size() <= longestLine;
    }

    void endParagraph()
    {
        const DpkgPackage ended = std::exchange(package_, {});
        const std::string digest = std::exchange(digest_, {});
        const auto wanted = digests_.find(ended.name.empty() ? std::string() : ended.fileName());
        if (wanted != digests_.end() && kindOfDigest(digest) == DigestKind::SHA256)
            wanted->second.push_back(digest);
    }

private:
    void line(std::string_view text)
    {
        if (text.empty())
            return endParagraph();
        const char first = text.front();
        if (first != 'P' && first != 'V' && first != 'A' && first != 'S')
            return;
        const std::string_view field = takeField(text, ':');
        text.remove_prefix(std::min(text.find_first_not_of(' '), text.size()));
        if (field == "Package")
            package_.name = text;
        else if (field == "Version")
            package_.version = text;
        else if (field == "Architecture")
            package_.architecture = text;
        else if (field == "SHA256")
            digest_ = text;
    }

    std::unordered_map<std::string, std::vector<std::string>>& digests_;
    std::string rest_;
    std::uint64_t size_ = 0;
    DpkgPackage package_;
    std::string digest_;
};

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

ArchiveIndex::ArchiveIndex(const RootFiles& root, std::span<const DpkgPackage> packages)
{
    for (const DpkgPackage& package : packages)
        digests_[package.fileName()];
    std::size_t lists = 0;
    for (const std::string& name : root.names(listDirectory)) {
        if (!isPackageList(name) || ++lists > mostLists)
            continue;
        if (const FileDescriptor list = root.openFile(listDirectory + '/' + name);
            list && isRootsAlone(list.get()))
            add(list.get());
    }
}

// Package: bash
// Architecture: amd64
// Version: 5.2.15-2+b8
// SHA256: 40f5f1ba8ef2f2b5… (apt 2.6.1)
void ArchiveIndex::add(int list)
{
    ListReader reader(digests_);
    if (unpack(list, [&reader](std::string_view bytes) { return reader.take(bytes); }))
        reader.endParagraph();
}

const std::vector<std::string>& ArchiveIndex::digestsOf(const DpkgPackage& package) const
{
    static const std::vector<std::string> none;
    const auto found = digests_.find(package.fileName());
    return found != digests_.end() ? found->second : none;
}

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
