// SPDX-License-Identifier: Apache-2.0
#include "tests/pellar/JobFixture.h"

#include "contract/foundation/Array.h"
#include "pellar/process/Command.h"
#include "pellar/process/FileDescriptor.h"
#include "tests/support/VolumeStates.h"

#include <gtest/gtest.h>
#include <spawn.h>
#include <sys/mman.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <fstream>
#include <stdexcept>

namespace pellar::test {
namespace {

constexpr std::string_view systemPath = "/usr/sbin:/usr/bin:/sbin:/bin";

/// Fails the test that cannot be prepared, loudly.
void prepareWith(const std::vector<std::string>& arguments)
{
    const ToolAnswer answer = runTool(arguments);
    if (answer.status != 0)
        throw std::runtime_error("cannot prepare the test: " + arguments[0] + answer.output);
}

}  // namespace

ToolAnswer runTool(std::vector<std::string> arguments, std::string_view input)
{
    const FileDescriptor in(::memfd_create("input", MFD_CLOEXEC));
    const FileDescriptor out(::memfd_create("output", MFD_CLOEXEC));
    if (::pwrite(in.get(), input.data(), input.size(), 0) != std::ssize(input))
        return {};
    posix_spawn_file_actions_t actions;
    ::posix_spawn_file_actions_init(&actions);
    ::posix_spawn_file_actions_adddup2(&actions, in.get(), 0);
    ::posix_spawn_file_actions_adddup2(&actions, out.get(), 1);
    ::posix_spawn_file_actions_adddup2(&actions, out.get(), 2);
    std::vector<char*> words;
    for (std::string& argument : arguments)
        words.push_back(argument.data());
    words.push_back(nullptr);
    std::string path = "PATH=" + std::string(systemPath);
    std::string locale = "LC_ALL=C";
    char* environment[] = {path.data(), locale.data(), nullptr};
    const std::string program = findProgram(arguments.front(), systemPath);
    pid_t child = 0;
    const int error =
        ::posix_spawn(&child, program.c_str(), &actions, nullptr, words.data(), environment);
    ::posix_spawn_file_actions_destroy(&actions);
    int status = 0;
    if (error != 0 || ::waitpid(child, &status, 0) != child || !WIFEXITED(status))
        return {};
    const std::string output = "/proc/self/fd/" + std::to_string(out.get());
    return {WEXITSTATUS(status), orvane::test::contentsOf(output)};
}

bool contains(std::string_view text, std::string_view part)
{
    return text.find(part) != std::string_view::npos;
}

void TestLoop::performOnMainThread(Task task, Wait)
{
    const std::lock_guard guard(lock_);
    tasks_.push_back(std::move(task));
    arrived_.notify_one();
}

bool TestLoop::runUntil(const std::function<bool()>& isDone)
{
    const auto deadline = std::chrono::steady_clock::now() + std::chrono::minutes(1);
    while (!isDone()) {
        std::unique_lock guard(lock_);
        if (!arrived_.wait_until(guard, deadline, [this] { return !tasks_.empty(); }))
            return false;
        const Task task = std::move(tasks_.front());
        tasks_.pop_front();
        guard.unlock();
        task();
    }
    return true;
}

void TestLoop::drain()
{
    static_cast<void>(runUntil([this] { return waiting() == 0; }));
}

std::size_t TestLoop::waiting()
{
    const std::lock_guard guard(lock_);
    return tasks_.size();
}

void Listener::plAsyncMessageForDisk(const contract::DiskReferencePointer&, std::string_view string,
                                     const contract::Dictionary& dictionary)
{
    callsAfterFinished += finished > 0 ? 1 : 0;
    if (!dictionary)
        plainLines.emplace_back(string);
    else if (dictionary.string(contract::kFsckMessageType) == contract::kFsckProgress.text())
        progress.push_back(dictionary[contract::kFsckParameters].array().front().real());
    else
        dictionaries.push_back(dictionary);
    if (onMessage)
        onMessage();
}

void Listener::plAsyncFinishedForDisk(const contract::DiskReferencePointer&,
                                      contract::ErrorCode mainError, contract::ErrorCode,
                                      const contract::Dictionary& result)
{
    ++finished;
    error = mainError;
    verdict = result.string(contract::kPLVerdict);
    message = result.string(contract::kPLMessage);
    if (onFinished)
        onFinished();
}

std::vector<std::string> Listener::textsOf(contract::Name type) const
{
    std::vector<std::string> texts;
    for (const contract::Dictionary& dictionary : dictionaries)
        if (dictionary.string(contract::kFsckMessageType) == type.text())
            texts.emplace_back(dictionary.string(contract::kFsckMessageString));
    return texts;
}

bool Listener::hasPlainLine(std::string_view part) const
{
    return std::ranges::any_of(plainLines,
                               [part](const auto& line) { return contains(line, part); });
}

bool Listener::hasErrorWith(std::string_view part) const
{
    const auto errors = textsOf(contract::kFsckError);
    return std::ranges::any_of(errors, [part](const auto& line) { return contains(line, part); });
}

void TestDirectory::write(std::string_view name, std::string_view bytes) const
{
    std::ofstream(path(name), std::ios::binary) << bytes;
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
    prepare(std::move(options), makeFile(name, bytes));
    return path(name);
}

std::filesystem::path TestDirectory::makeVolume(std::string_view name,
                                                std::string_view filesystem) const
{
    const auto maker = std::ranges::find(orvane::test::volumeMakers(), filesystem,
                                         &orvane::test::VolumeMaker::filesystem);
    if (findProgram(maker->command.front(), systemPath).empty())
        return {};
    prepare(maker->command, makeFile(name, maker->bytes));
    return path(name);
}

void TestDirectory::prepare(std::vector<std::string> command,
                            const std::filesystem::path& image) const
{
    command.push_back(image);
    prepareWith(command);
}

void TestDirectory::damage(const std::filesystem::path& image, std::string command) const
{
    prepareWith({"debugfs", "-w", "-R", std::move(command), image});
}

std::string TestDirectory::fakeTools(std::string_view script, std::string_view tool) const
{
    const std::filesystem::path tools = path("tools");
    std::filesystem::create_directories(tools);
    std::filesystem::copy_file(PELLAR_FAKE_TOOL, tools / tool,
                               std::filesystem::copy_options::overwrite_existing);
    std::ofstream(tools / "script") << script;
    return tools;
}

contract::DiskReferencePointer reference(const std::filesystem::path& image, std::string filesystem,
                                         std::string name)
{
    auto disk = std::make_shared<contract::DiskReference>();
    disk->storage = contract::DiskReference::Storage::FileRegion;
    disk->path = image;
    std::error_code error;
    disk->length = std::filesystem::file_size(image, error);
    disk->identifier = image;
    disk->filesystem = std::move(filesystem);
    disk->name = std::move(name);
    return disk;
}

JobFixture::JobFixture(JobOptions options)
    : manager(loop, texts, [this, &options] {
          options.commandTrace = [this](std::string_view line) {
              traces.emplace_back(line);
          };
          return options;
      }())
{
    manager.setDelegate(&listener);
    tool = manager.makeRepairDisk();
}

contract::ErrorCode JobFixture::verify(const contract::DiskReferencePointer& disk)
{
    return finish(tool->beginStoragesystemFilesystemVerifyForDisk(disk));
}

contract::ErrorCode JobFixture::repair(const contract::DiskReferencePointer& disk)
{
    return finish(tool->beginStoragesystemFilesystemRepairForDisk(disk));
}

contract::ErrorCode JobFixture::finish(contract::ErrorCode begun)
{
    const int before = listener.finished;
    if (begun != contract::kPLNoError)
        return begun;
    EXPECT_EQ(listener.finished, before) << "called back from inside the begin";
    EXPECT_TRUE(loop.runUntil([&] { return listener.finished > before; })) << "never finished";
    return begun;
}

}  // namespace pellar::test
