// SPDX-License-Identifier: Apache-2.0
//
// A tool that does what the file "script" beside it says, one action per line:
//   say TEXT | progress TEXT | exit N | kill N | ignore N | wait | sleep MS
//   flood-lines | flood-bytes | hold-pipe | shrink BYTES | environment | descriptors | terminal
//   write-in-repair TEXT: at the beginning of the disk, when it was called with -a or -y
//   say-in-repair TEXT: when it was called with -a or -y
//   await NAME: until there is such a file beside it
//   await-in-repair NAME: the same, when it was called with -a or -y
//   become PROGRAM: which gets its arguments

#include <fcntl.h>
#include <sys/ioctl.h>
#include <unistd.h>

#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <string>

extern char** environ;

namespace {

void put(int descriptor, const std::string& text)
{
    if (::write(descriptor, text.data(), text.size()) < 0)
        std::exit(99);
}

[[noreturn]] void flood(const std::string& piece)
{
    std::string block;
    while (block.size() < 60'000)
        block += piece;
    for (;;)
        put(STDOUT_FILENO, block);
}

/// A grandchild that outlives the tool with its output open.
void holdPipe()
{
    if (::fork() != 0)
        return;
    ::setsid();
    ::sleep(5);
    ::_exit(0);
}

void tellDescriptors()
{
    for (int descriptor = 0; descriptor < 256; ++descriptor)
        if (::fcntl(descriptor, F_GETFD) >= 0)
            put(STDOUT_FILENO, "descriptor " + std::to_string(descriptor) + "\n");
}

/// Of the standard output, and whether the tool could be reached from a keyboard.
void tellTerminal()
{
    winsize size{};
    const bool isTerminal = ::isatty(STDOUT_FILENO) == 1;
    ::ioctl(STDOUT_FILENO, TIOCGWINSZ, &size);
    put(STDOUT_FILENO, "terminal " + std::to_string(isTerminal) + " input " +
                           std::to_string(::isatty(STDIN_FILENO)) + " columns " +
                           std::to_string(size.ws_col) + "\n");
}

/// The option by which fsck.fat or e2fsck is told to write.
bool isRepairing()
{
    std::ifstream commandLine("/proc/self/cmdline");
    for (std::string word; std::getline(commandLine, word, '\0');)
        if (word == "-a" || word == "-y")
            return true;
    return false;
}

void writeToDisk(const std::string& text)
{
    const int disk = ::open("/proc/self/fd/3", O_WRONLY | O_CLOEXEC);
    put(disk, text);
    ::close(disk);
}

void await(const std::string& name)
{
    const auto self = std::filesystem::read_symlink("/proc/self/exe");
    while (!std::filesystem::exists(self.parent_path() / name))
        ::usleep(5000);
}

[[noreturn]] void become(const std::string& program, char** arguments)
{
    ::execv(program.c_str(), arguments);
    std::exit(97);
}

void act(const std::string& action, const std::string& text, char** arguments)
{
    const int number = std::atoi(text.c_str());
    if (action == "say" || (action == "say-in-repair" && isRepairing()))
        put(STDOUT_FILENO, text + "\n");
    else if (action == "write-in-repair" && isRepairing())
        writeToDisk(text);
    else if (action == "progress")
        put(4, text + "\n");
    else if (action == "exit")
        std::exit(number);
    else if (action == "kill") {
        std::signal(number, SIG_DFL);  // a sanitizer would catch a crash
        ::kill(::getpid(), number);
    } else if (action == "ignore")
        std::signal(number, SIG_IGN);
    else if (action == "wait")
        for (;;)
            ::pause();
    else if (action == "sleep")
        ::usleep(static_cast<unsigned>(number) * 1000);
    else if (action == "flood-lines")
        flood("Inode 12 is wrong.  Fix? no\n");
    else if (action == "flood-bytes")
        flood("x");
    else if (action == "hold-pipe")
        holdPipe();
    else if (action == "shrink" && ::truncate("/proc/self/fd/3", number) != 0)
        std::exit(98);
    else if (action == "environment")
        for (char** entry = environ; *entry != nullptr; ++entry)
            put(STDOUT_FILENO, std::string("environment ") + *entry + "\n");
    else if (action == "await" || (action == "await-in-repair" && isRepairing()))
        await(text);
    else if (action == "become")
        become(text, arguments);
    else if (action == "terminal")
        tellTerminal();
    else if (action == "descriptors")
        tellDescriptors();
}

}  // namespace

int main(int, char** arguments)
{
    const auto self = std::filesystem::read_symlink("/proc/self/exe");
    std::ifstream script(self.parent_path() / "script");
    for (std::string line; std::getline(script, line);) {
        std::istringstream words(line);
        std::string action;
        std::string text;
        words >> action >> std::ws;
        std::getline(words, text);
        act(action, text, arguments);
    }
    return 0;
}
