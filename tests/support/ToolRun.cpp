// SPDX-License-Identifier: Apache-2.0
#include "ToolRun.h"

#include "orvane/support/files/WholeFile.h"
#include "pellar/process/FileDescriptor.h"

#include <fcntl.h>
#include <sys/mman.h>
#include <sys/wait.h>
#include <unistd.h>

namespace orvane::test {

int runTool(const std::vector<std::string>& arguments, std::string_view input)
{
    const pellar::FileDescriptor standardInput(::memfd_create("input", MFD_CLOEXEC));
    if (writeAll(standardInput.get(), input) != 0 || ::lseek(standardInput.get(), 0, SEEK_SET) != 0)
        return -1;
    std::vector<char*> words;
    for (const std::string& argument : arguments)
        words.push_back(const_cast<char*>(argument.c_str()));
    words.push_back(nullptr);
    const std::string program = "/usr/sbin/" + arguments.front();
    const char* const environment[] = {"PATH=/usr/sbin:/usr/bin:/sbin:/bin", "LC_ALL=C", nullptr};
    const pid_t child = ::fork();
    if (child == 0) {
        ::dup2(standardInput.get(), STDIN_FILENO);
        ::dup2(::open("/dev/null", O_WRONLY | O_CLOEXEC), STDOUT_FILENO);
        ::dup2(STDOUT_FILENO, STDERR_FILENO);
        ::execve(program.c_str(), words.data(), const_cast<char* const*>(environment));
        ::_exit(127);
    }
    int status = 0;
    return ::waitpid(child, &status, 0) == child && WIFEXITED(status) ? WEXITSTATUS(status) : -1;
}

}  // namespace orvane::test
