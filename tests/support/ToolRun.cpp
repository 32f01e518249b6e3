// SPDX-License-Identifier: Apache-2.0
#include "ToolRun.h"

#include "orvane/support/files/WholeFile.h"
#include "pellar/process/FileDescriptor.h"

#include <fcntl.h>
#include <spawn.h>
#include <sys/mman.h>
#include <sys/wait.h>

namespace orvane::test {

int runTool(const std::vector<std::string>& arguments, std::string_view input)
{
    const pellar::FileDescriptor standardInput(::memfd_create("input", 0));
    if (writeAll(standardInput.get(), input) != 0 || ::lseek(standardInput.get(), 0, SEEK_SET) != 0)
        return -1;
    posix_spawn_file_actions_t actions;
    ::posix_spawn_file_actions_init(&actions);
    ::posix_spawn_file_actions_adddup2(&actions, standardInput.get(), 0);
    ::posix_spawn_file_actions_addopen(&actions, 1, "/dev/null", O_WRONLY, 0);
    ::posix_spawn_file_actions_addopen(&actions, 2, "/dev/null", O_WRONLY, 0);

    std::vector<char*> words;
    for (const std::string& argument : arguments)
        words.push_back(const_cast<char*>(argument.c_str()));
    words.push_back(nullptr);
    std::string path = "PATH=/usr/sbin:/usr/bin:/sbin:/bin";
    std::string locale = "LC_ALL=C";
    char* environment[] = {path.data(), locale.data(), nullptr};
    pid_t child = 0;
    const std::string program = "/usr/sbin/" + arguments.front();
    const int error =
        ::posix_spawn(&child, program.c_str(), &actions, nullptr, words.data(), environment);
    ::posix_spawn_file_actions_destroy(&actions);
    int status = 0;
    if (error != 0 || ::waitpid(child, &status, 0) != child || !WIFEXITED(status))
        return -1;
    return WEXITSTATUS(status);
}

}  // namespace orvane::test
