// SPDX-License-Identifier: Apache-2.0
#include "tests/pellar/JobFixture.h"

#include "contract/foundation/Array.h"

#include <gtest/gtest.h>

#include <algorithm>

namespace pellar::test {
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
                                      const contract::Dictionary& dictionary)
{
    ++finished;
    error = mainError;
    verdict = dictionary.string(contract::kPLVerdict);
    message = dictionary.string(contract::kPLMessage);
    result = dictionary;
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
    const auto isIn = [part](const auto& line) {
        return contains(line, part);
    };
    return std::ranges::any_of(textsOf(contract::kFsckError), isIn) ||
           std::ranges::any_of(textsOf(contract::kFsckFail), isIn) ||
           std::ranges::any_of(textsOf(contract::kFsckProblem), isIn);
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

JobOptions tryingIn(const std::filesystem::path& directory, const RepairPolicy* policy)
{
    JobOptions options;
    options.trials.room.directory = directory;
    if (policy != nullptr)
        options.repairPolicy = [policy] {
            return *policy;
        };
    return options;
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

contract::ErrorCode JobFixture::run(Task task, const contract::DiskReferencePointer& disk)
{
    const auto own = manager.makeTool(listener);
    return finish(own->begin(task, disk));
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
