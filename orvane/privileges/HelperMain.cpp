// SPDX-License-Identifier: Apache-2.0

// pellar-helper: one job on one block device, with the rights of root, for a user whom the system's
// policy has let (pkexec(1)). It takes a fixed set of operations, checks every argument itself,
// runs no program but the checking tools, and takes nothing from the environment. What happens goes
// to standard output, a line of JSON for each event; "stop" on standard input stops the job, and
// the end of standard input ends it.

#include "orvane/jobs/LibraryTexts.h"
#include "orvane/privileges/EventWire.h"
#include "orvane/privileges/HelperRequest.h"
#include "orvane/privileges/HomeDirectory.h"
#include "orvane/support/loop/MainLoop.h"
#include "orvane/support/modules/ModuleSearch.h"
#include "orvane/support/texts/Language.h"
#include "pellar/Manager.h"

#include <fcntl.h>
#include <poll.h>
#include <sys/prctl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <charconv>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <string>

namespace orvane {
namespace {

constexpr int exitWrongUsage = 2;
constexpr int exitRefused = 3;

/// Where sectors are kept that the repair of a partition map overwrites.
constexpr const char* stateDirectory = "/var/lib/orvane/partition-maps";

bool isBlockDevice(const std::filesystem::path& path)
{
    struct stat status = {};
    std::error_code error;
    return std::filesystem::canonical(path, error) == path && ::lstat(path.c_str(), &status) == 0 &&
           S_ISBLK(status.st_mode);
}

bool write(const std::string& line)
{
    const std::string text = line + "\n";
    for (std::size_t done = 0; done < text.size();) {
        const ssize_t count = ::write(STDOUT_FILENO, text.data() + done, text.size() - done);
        if (count <= 0 && errno != EINTR)
            return false;
        done += count > 0 ? static_cast<std::size_t>(count) : 0;
    }
    return true;
}

/// Hands everything on, and knows the end.
class Teller final : public fixwell::PLAsyncDelegate {
public:
    void plAsyncStartedForDisk(const fixwell::DiskReferencePointer&) override
    {
        tell(pellar::Started{});
    }
    void plAsyncMessageForDisk(const fixwell::DiskReferencePointer&, std::string_view string,
                               const fixwell::Dictionary& dictionary) override
    {
        tell(pellar::Message{std::string(string), dictionary});
    }
    void plAsyncProgressForDisk(const fixwell::DiskReferencePointer&, bool, float) override {}
    void plAsyncFinishedForDisk(const fixwell::DiskReferencePointer&, fixwell::ErrorCode mainError,
                                fixwell::ErrorCode detailError,
                                const fixwell::Dictionary& result) override
    {
        isOver_ = true;
        tell(pellar::Finished{mainError, detailError, result});
    }

    void tell(const pellar::Event& event) { isHeard_ = isHeard_ && write(lineFromEvent(event)); }
    bool isOver() const { return isOver_; }

private:
    bool isOver_ = false;
    bool isHeard_ = true;
};

/// Each "stop" presses once; the end of the input means that nobody is there any more.
class StopLine {
public:
    StopLine(MainLoop& loop, fixwell::PLRepairDisk& tool) : loop_(loop), tool_(tool)
    {
        loop_.watch(STDIN_FILENO, POLLIN, [this](short) { read(); });
    }
    StopLine(const StopLine&) = delete;
    StopLine& operator=(const StopLine&) = delete;
    ~StopLine() { loop_.unwatch(STDIN_FILENO); }

private:
    void read()
    {
        char buffer[64];
        const ssize_t count = ::read(STDIN_FILENO, buffer, sizeof buffer);
        if (count <= 0)
            loop_.unwatch(STDIN_FILENO);
        if (count == 0)
            tool_.cancelCurrentOperation();
        for (ssize_t i = 0; i < count; ++i)
            if (buffer[i] == '\n')
                tool_.cancelCurrentOperation();
    }

    MainLoop& loop_;
    fixwell::PLRepairDisk& tool_;
};

fixwell::ErrorCode begin(fixwell::PLRepairDisk& tool, const HelperRequest& request)
{
    const auto disk = std::make_shared<const fixwell::DiskReference>(request.disk);
    const bool isRepair = request.operation == pellar::Operation::Repair;
    if (disk->isWhole)
        return isRepair ? tool.beginPartitionMapRepairForDisk(disk)
                        : tool.beginPartitionMapVerifyForDisk(disk);
    return isRepair ? tool.beginStoragesystemFilesystemRepairForDisk(disk)
                    : tool.beginStoragesystemFilesystemVerifyForDisk(disk);
}

// A refusal to begin has no events of its own.
void tellRefusal(Teller& teller, fixwell::ErrorCode error)
{
    teller.tell(pellar::Started{});
    teller.tell(pellar::Finished{error, 0, {}});
}

// From the user's own terminal a Ctrl-C comes here as well; what it means is told by the program
// that asked. Nothing is inherited that a tool could trip over.
void settle()
{
    for (const int signal : {SIGINT, SIGHUP, SIGPIPE, SIGQUIT, SIGTSTP})
        std::signal(signal, SIG_IGN);
    ::clearenv();
    ::setenv("PATH", "/usr/sbin:/usr/bin:/sbin:/bin", 1);
    ::umask(077);
}

/// Of the user who asked, as pkexec(1) tells who that is.
std::filesystem::path homeOfAskingUser()
{
    const char* const variable = std::getenv("PKEXEC_UID");
    const std::string_view text = variable != nullptr ? variable : "";
    uid_t user = 0;
    const auto [rest, error] = std::from_chars(text.data(), text.data() + text.size(), user);
    const bool isNumber = error == std::errc() && rest == text.data() + text.size();
    return isNumber ? homeDirectoryOf(user) : std::filesystem::path();
}

int run(const std::vector<std::string>& arguments)
{
    const std::filesystem::path home = homeOfAskingUser();
    settle();
    const auto read = readHelperArguments(arguments, isBlockDevice);
    if (const auto* const refusal = std::get_if<std::string>(&read)) {
        std::fprintf(stderr, "pellar-helper: %s\n", refusal->c_str());
        return exitWrongUsage;
    }
    const auto& request = std::get<HelperRequest>(read);
    adoptUserLocale();
    setLanguage(request.languages);

    // As if it lay beside the programs, where texts and modules are looked for.
    const auto program =
        runningExecutable().parent_path().parent_path().parent_path() / "bin/orvane";
    const Catalogue hostTexts(hostBundleDirectory(program) / "locale");
    LibraryTexts texts(hostTexts);
    std::optional<Catalogue> moduleTexts;
    const auto noEnvironment = [](std::string_view) {
        return std::optional<std::string>();
    };
    if (const auto bundles = findModuleBundles(moduleDirectories(noEnvironment, program));
        !bundles.empty())
        texts.setResultTexts(moduleTexts.emplace(bundles.front() / "locale"));

    MainLoop loop;
    Teller teller;
    pellar::ManagerOptions options;
    options.savedSectorsDirectory = stateDirectory;
    options.homeDirectory = home;
    pellar::Manager manager(loop, texts, options);
    manager.setDelegate(&teller);
    const auto tool = manager.makeRepairDisk();
    if (const fixwell::ErrorCode error = begin(*tool, request)) {
        tellRefusal(teller, error);
        return exitRefused;
    }
    const StopLine stop(loop, *tool);
    loop.runUntil([&teller] { return teller.isOver(); });
    return 0;
}

}  // namespace
}  // namespace orvane

int main(int argc, char** argv)
{
    return orvane::run({argv + 1, argv + argc});
}
