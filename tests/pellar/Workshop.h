// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "fixwell/host/foundation/RunLoop.h"
#include "fixwell/host/pellar/MessageKeys.h"
#include "pellar/Manager.h"

#include <chrono>
#include <condition_variable>
#include <deque>
#include <filesystem>
#include <functional>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

namespace pellar::test {

/// A main loop that the test's thread turns by hand.
class TestLoop final : public fixwell::RunLoop {
public:
    bool isMainThread() const override { return std::this_thread::get_id() == main_; }
    void performOnMainThread(Task task, Wait wait) override;
    void scheduleTimer(std::chrono::duration<double>, Task) override {}

    /// Runs tasks until `isDone`; NO when that takes longer than a minute.
    [[nodiscard]] bool runUntil(const std::function<bool()>& isDone);
    /// Runs what is there.
    void drain();
    std::size_t waiting();

private:
    const std::thread::id main_ = std::this_thread::get_id();
    std::mutex lock_;
    std::condition_variable arrived_;
    std::deque<Task> tasks_;
};

/// English.
class EnglishTexts final : public Texts {
public:
    std::string text(std::string_view key) const override { return std::string(key); }
    std::string resultText(std::string_view key) const override { return std::string(key); }
};

/// Writes down what a module would hear.
class Listener final : public fixwell::PLAsyncDelegate {
public:
    void plAsyncStartedForDisk(const fixwell::DiskReferencePointer&) override { ++started; }
    void plAsyncMessageForDisk(const fixwell::DiskReferencePointer&, std::string_view string,
                               const fixwell::Dictionary& dictionary) override;
    void plAsyncProgressForDisk(const fixwell::DiskReferencePointer&, bool, float) override {}
    void plAsyncFinishedForDisk(const fixwell::DiskReferencePointer&, fixwell::ErrorCode mainError,
                                fixwell::ErrorCode, const fixwell::Dictionary& result) override;

    /// The texts of dictionaries of this type.
    std::vector<std::string> textsOf(fixwell::Name type) const;
    bool hasPlainLine(std::string_view part) const;
    bool hasErrorWith(std::string_view part) const;

    int started = 0;
    int finished = 0;
    int callsAfterFinished = 0;
    fixwell::ErrorCode error = 0;
    std::string verdict;
    std::string message;
    std::vector<std::string> plainLines;
    std::vector<fixwell::Dictionary> dictionaries;
    std::vector<double> progress;
    std::function<void()> onMessage;
    std::function<void()> onFinished;
};

/// A directory of one test, and what tests do with disks in it.
class Workshop {
public:
    Workshop();
    Workshop(const Workshop&) = delete;
    Workshop& operator=(const Workshop&) = delete;
    ~Workshop();

    std::filesystem::path path(std::string_view name) const { return directory_ / name; }
    void write(std::string_view name, std::string_view bytes) const;

    /// A sparse file with a file system of e2fsprogs' own making.
    std::filesystem::path makeExt(std::string_view name, std::uint64_t bytes,
                                  std::vector<std::string> options = {}) const;
    /// Runs a program with the image as its last argument; a failure fails the test.
    void prepare(std::vector<std::string> command, const std::filesystem::path& image) const;
    /// debugfs(8), writing.
    void damage(const std::filesystem::path& image, std::string command) const;
    /// A directory to be searched for tools, in which `tool` does what `script` says.
    std::string fakeTools(std::string_view script, std::string_view tool = "e2fsck") const;

private:
    std::filesystem::path directory_;
};

fixwell::DiskReferencePointer reference(const std::filesystem::path& image,
                                        std::string filesystem = "ext4", std::string name = "Disk");

/// One library, one listener, one loop.
struct Bench {
    explicit Bench(ManagerOptions options = {});

    /// Runs a job to its *finished* and answers what the begin answered.
    fixwell::ErrorCode verify(const fixwell::DiskReferencePointer& disk);
    fixwell::ErrorCode repair(const fixwell::DiskReferencePointer& disk);
    fixwell::ErrorCode finish(fixwell::ErrorCode begun);

    TestLoop loop;
    EnglishTexts texts;
    Listener listener;
    std::vector<std::string> traces;
    Manager manager;
    std::unique_ptr<fixwell::PLRepairDisk> tool;
};

}  // namespace pellar::test
