// SPDX-License-Identifier: Apache-2.0
#include "tests/pellar/JobFixture.h"

#include "contract/foundation/Array.h"
#include "pellar/process/ChildProcess.h"
#include "tests/support/VolumeStates.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <algorithm>
#include <fstream>
#include <stdexcept>

namespace pellar::test {
namespace {

constexpr std::string_view systemPath = "/usr/sbin:/usr/bin:/sbin:/bin";

/// Fails the test that cannot be prepared, loudly.
void runProgram(std::string_view name, std::vector<std::string> arguments)
{
    const FileDescriptor sink(::open("/dev/null", O_WRONLY | O_CLOEXEC));
    auto child =
        ChildProcess::start({findProgram(name, systemPath), std::move(arguments)}, {sink.get()});
    if (!child || child->reap() != Ending(Exited{0}))
        throw std::runtime_error("cannot prepare the test: " + std::string(name) + " failed");
}

}  // namespace

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
    while (waiting() > 0) {
        std::unique_lock guard(lock_);
        const Task task = std::move(tasks_.front());
        tasks_.pop_front();
        guard.unlock();
        task();
    }
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
    return std::any_of(plainLines.begin(), plainLines.end(), [part](const std::string& line) {
        return line.find(part) != std::string::npos;
    });
}

bool Listener::hasErrorWith(std::string_view part) const
{
    const auto errors = textsOf(contract::kFsckError);
    return std::any_of(errors.begin(), errors.end(), [part](const std::string& line) {
        return line.find(part) != std::string::npos;
    });
}

TestDirectory::TestDirectory()
{
    std::string pattern = (std::filesystem::temp_directory_path() / "pellar-XXXXXX").string();
    if (::mkdtemp(pattern.data()) == nullptr)
        throw std::runtime_error("cannot make a directory for the test");
    directory_ = pattern;
}

TestDirectory::~TestDirectory()
{
    std::error_code error;
    std::filesystem::remove_all(directory_, error);
}

void TestDirectory::write(std::string_view name, std::string_view bytes) const
{
    std::ofstream(path(name), std::ios::binary) << bytes;
}

std::filesystem::path TestDirectory::makeExt(std::string_view name, std::uint64_t bytes,
                                             std::vector<std::string> options) const
{
    write(name, {});
    std::filesystem::resize_file(path(name), bytes);
    options.insert(options.begin(), {"-q", "-F", "-t", "ext4"});
    options.push_back(path(name));
    runProgram("mke2fs", std::move(options));
    return path(name);
}

std::filesystem::path TestDirectory::makeVolume(std::string_view name,
                                                std::string_view filesystem) const
{
    const auto& makers = orvane::test::volumeMakers();
    const auto maker = std::find_if(makers.begin(), makers.end(), [filesystem](const auto& known) {
        return known.filesystem == filesystem;
    });
    if (findProgram(maker->command.front(), systemPath).empty())
        return {};
    write(name, {});
    std::filesystem::resize_file(path(name), maker->bytes);
    prepare(maker->command, path(name));
    return path(name);
}

void TestDirectory::prepare(std::vector<std::string> command,
                            const std::filesystem::path& image) const
{
    const std::string name = command.front();
    command.erase(command.begin());
    command.push_back(image);
    runProgram(name, std::move(command));
}

void TestDirectory::damage(const std::filesystem::path& image, std::string command) const
{
    runProgram("debugfs", {"-w", "-R", std::move(command), image});
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
