// SPDX-License-Identifier: Apache-2.0

// pellar-helper: one job on one disk, with the rights of root, for a user whom the system's policy
// has let (pkexec(1)). It takes a fixed set of operations, checks every argument itself, opens no
// file of the user's by a path, runs no program but the checking tools, and takes nothing from the
// environment but for whom it works. What happens goes to standard output, a line of JSON for each
// event; "stop" on standard input stops the job, and the end of standard input ends it.

#include "orvane/jobs/LibraryTexts.h"
#include "orvane/privileges/CheckedText.h"
#include "orvane/privileges/HelperJob.h"
#include "orvane/support/ProgramStart.h"
#include "orvane/support/modules/ModuleSearch.h"
#include "orvane/support/texts/Language.h"

#include <sys/resource.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <string>

namespace orvane {
namespace {

constexpr int exitWrongUsage = 2;

bool isBlockDevice(const std::filesystem::path& path)
{
    struct stat status = {};
    std::error_code error;
    return std::filesystem::canonical(path, error) == path && ::lstat(path.c_str(), &status) == 0 &&
           S_ISBLK(status.st_mode);
}

/// As pkexec(1) tells it; none when it was not pkexec that started this.
std::optional<uid_t> userWhoAsked()
{
    const char* const variable = std::getenv("PKEXEC_UID");
    return numberIn<uid_t>(variable != nullptr ? variable : "");
}

// A limit that the user has set would end the work in the middle of a write.
void setOwnLimits()
{
    struct Limit {
        __rlimit_resource resource;
        rlim_t soft, hard;
    };
    constexpr rlim_t most = RLIM_INFINITY;
    for (const Limit& limit :
         {Limit{RLIMIT_FSIZE, most, most}, Limit{RLIMIT_CPU, most, most},
          Limit{RLIMIT_AS, most, most}, Limit{RLIMIT_DATA, most, most},
          Limit{RLIMIT_NPROC, most, most}, Limit{RLIMIT_CORE, 0, 0},
          Limit{RLIMIT_STACK, 8U << 20U, most}, Limit{RLIMIT_NOFILE, 1024, 4096}}) {
        const rlimit wanted{limit.soft, limit.hard};
        rlimit given = {};
        if (::setrlimit(limit.resource, &wanted) == 0 || ::getrlimit(limit.resource, &given) != 0)
            continue;
        // In a container root may not raise what was set for it.
        given.rlim_cur = std::min(limit.soft, given.rlim_max);
        ::setrlimit(limit.resource, &given);
    }
    ::setpriority(PRIO_PROCESS, 0, 0);
}

// From the user's own terminal a Ctrl-C comes here as well; what it means is told by the program
// that asked. Nothing is inherited that a tool could trip over.
void settle()
{
    setInheritanceRight();
    setOwnLimits();
    for (const int signal : {SIGINT, SIGHUP, SIGPIPE, SIGQUIT, SIGTSTP})
        std::signal(signal, SIG_IGN);
    ::clearenv();
    ::setenv("PATH", "/usr/sbin:/usr/bin:/sbin:/bin", 1);
    ::umask(077);
}

int run(const std::vector<std::string>& arguments)
{
    if (arguments == std::vector<std::string>{"--version"}) {
        std::printf("pellar-helper %s\n", std::string(programVersion()).c_str());
        return 0;
    }
    const auto user = userWhoAsked();
    settle();
    const auto request = readHelperArguments(arguments, isBlockDevice);
    if (!request) {
        std::fprintf(stderr, "pellar-helper: %s\n", request.error());
        return exitWrongUsage;
    }
    adoptUserLocale();
    setLanguage(request->languages);

    // As if it lay beside the programs, where texts and modules are looked for.
    const auto program =
        runningExecutable().parent_path().parent_path().parent_path() / "bin/orvane";
    const Catalogue hostTexts(hostBundleDirectory(program) / "locale");
    LibraryTexts texts(hostTexts);
    std::optional<Catalogue> moduleTexts;
    const auto noEnvironment = [](std::string_view) {
        return std::optional<std::string>();
    };
    if (const auto bundle = findModule(moduleDirectories(noEnvironment, program), checkingModule);
        !bundle.empty())
        texts.setResultTexts(moduleTexts.emplace(bundle / "locale"));
    runHelperJob(*request, user, texts);
    return 0;
}

}  // namespace
}  // namespace orvane

int main(int argc, char** argv)
{
    return orvane::run({argv + 1, argv + argc});
}
