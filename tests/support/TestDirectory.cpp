// SPDX-License-Identifier: Apache-2.0
#include "tests/support/TestDirectory.h"

#include "pellar/process/Command.h"
#include "pellar/process/FileDescriptor.h"
#include "tests/support/VolumeStates.h"

#include <stdlib.h>
#include <sys/mman.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <fstream>
#include <sstream>
#include <stdexcept>

namespace orvane::test {
namespace {

constexpr int notStarted = 127;
constexpr std::string_view systemPath = "/usr/sbin:/usr/bin:/sbin:/bin";

}  // namespace

ToolAnswer runTool(std::vector<std::string> arguments, std::string_view input)
{
    const pellar::FileDescriptor in(::memfd_create("input", MFD_CLOEXEC));
    const pellar::FileDescriptor out(::memfd_create("output", MFD_CLOEXEC));
    if (::pwrite(in.get(), input.data(), input.size(), 0) != std::ssize(input))
        return {};
    std::vector<char*> words;
    for (std::string& argument : arguments)
        words.push_back(argument.data());
    words.push_back(nullptr);
    std::string path = "PATH=" + std::string(systemPath);
    std::string locale = "LC_ALL=C";
    char* environment[] = {path.data(), locale.data(), nullptr};
    const std::string program = pellar::findProgram(arguments.front(), systemPath);
    const int status = statusOfChild([&] {
        ::dup2(in.get(), STDIN_FILENO);
        ::dup2(out.get(), STDOUT_FILENO);
        ::dup2(out.get(), STDERR_FILENO);
        ::execve(program.c_str(), words.data(), environment);
        return notStarted;
    });
    if (!WIFEXITED(status) || WEXITSTATUS(status) == notStarted)
        return {};
    return {WEXITSTATUS(status), contentsOf("/proc/self/fd/" + std::to_string(out.get()))};
}

void prepareWith(const std::vector<std::string>& arguments, std::string_view input)
{
    const ToolAnswer answer = runTool(arguments, input);
    if (answer.status != 0)
        throw std::runtime_error("cannot prepare the test: " + arguments[0] + answer.output);
}

int statusOfChild(const std::function<int()>& work)
{
    const pid_t child = ::fork();
    if (child == 0)
        ::_exit(work());
    int status = -1;
    ::waitpid(child, &status, 0);
    return status;
}

std::string contentsOf(const std::filesystem::path& file)
{
    std::ostringstream text;
    text << std::ifstream(file, std::ios::binary).rdbuf();
    return text.str();
}

void write(const std::filesystem::path& file, std::string_view contents)
{
    std::filesystem::create_directories(file.parent_path());
    std::ofstream(file, std::ios::binary) << contents;
}

void patch(const std::filesystem::path& file, std::uint64_t offset, std::string_view bytes)
{
    std::fstream opened(file, std::ios::binary | std::ios::in | std::ios::out);
    opened.seekp(static_cast<std::streamoff>(offset));
    if (!opened.write(bytes.data(), static_cast<std::streamsize>(bytes.size())))
        throw std::runtime_error("cannot prepare the test: " + file.string());
}

TestDirectory::TestDirectory()
{
    std::string name = std::filesystem::temp_directory_path() / "orvane-test.XXXXXX";
    if (::mkdtemp(name.data()) == nullptr)
        throw std::runtime_error("cannot make a directory for the test");
    path_ = std::filesystem::canonical(name);
}

TestDirectory::~TestDirectory()
{
    std::error_code ignored;
    std::filesystem::remove_all(path_, ignored);
}

void TestDirectory::write(std::string_view name, std::string_view bytes) const
{
    orvane::test::write(path(name), bytes);
}

std::filesystem::path TestDirectory::makeFile(std::string_view name, std::uint64_t bytes) const
{
    write(name, {});
    std::filesystem::resize_file(path(name), bytes);
    return path(name);
}

std::filesystem::path TestDirectory::makeExt(std::string_view name, std::uint64_t bytes,
                                             std::vector<std::string> options) const
{
    options.insert(options.begin(), {"mke2fs", "-q", "-F", "-t", "ext4"});
    options.push_back(makeFile(name, bytes));
    prepareWith(options);
    return path(name);
}

std::filesystem::path TestDirectory::makeVolume(std::string_view name,
                                                std::string_view filesystem) const
{
    const auto maker = std::ranges::find(volumeMakers(), filesystem, &VolumeMaker::filesystem);
    if (pellar::findProgram(maker->command.front(), systemPath).empty())
        return {};
    std::vector<std::string> command = maker->command;
    command.push_back(makeFile(name, maker->bytes));
    prepareWith(command);
    return path(name);
}

void TestDirectory::damage(const std::filesystem::path& image, std::string command) const
{
    prepareWith({"debugfs", "-w", "-R", std::move(command), image});
}

std::string TestDirectory::fakeTools(std::string_view script, std::string_view tool) const
{
    write("tools/script", script);
    std::filesystem::copy_file(FAKE_TOOL, path("tools") / tool,
                               std::filesystem::copy_options::overwrite_existing);
    return path("tools");
}

}  // namespace orvane::test
