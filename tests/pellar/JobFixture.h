// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/RunLoop.h"
#include "contract/pellar/MessageKeys.h"
#include "pellar/Manager.h"
#include "pellar/RepairDisk.h"
#include "tests/support/TestDirectory.h"

#include <chrono>
#include <condition_variable>
#include <deque>
#include <functional>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

namespace pellar::test {

using orvane::test::runTool;
using orvane::test::TestDirectory;
using orvane::test::ToolAnswer;

bool contains(std::string_view text, std::string_view part);

/// A main loop that the test's thread turns by hand.
class TestLoop final : public contract::RunLoop {
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
class Listener final : public contract::PLAsyncDelegate {
public:
    void plAsyncStartedForDisk(const contract::DiskReferencePointer&) override { ++started; }
    void plAsyncMessageForDisk(const contract::DiskReferencePointer&, std::string_view string,
                               const contract::Dictionary& dictionary) override;
    void plAsyncProgressForDisk(const contract::DiskReferencePointer&, bool, float) override {}
    void plAsyncFinishedForDisk(const contract::DiskReferencePointer&,
                                contract::ErrorCode mainError, contract::ErrorCode,
                                const contract::Dictionary& result) override;

    /// The texts of dictionaries of this type.
    std::vector<std::string> textsOf(contract::Name type) const;
    bool hasPlainLine(std::string_view part) const;
    bool hasErrorWith(std::string_view part) const;

    int started = 0;
    int finished = 0;
    int callsAfterFinished = 0;
    contract::ErrorCode error = 0;
    std::string verdict;
    std::string message;
    contract::Dictionary result;
    std::vector<std::string> plainLines;
    std::vector<contract::Dictionary> dictionaries;
    std::vector<double> progress;
    std::function<void()> onMessage;
    std::function<void()> onFinished;
};

contract::DiskReferencePointer reference(const std::filesystem::path& image,
                                         std::string filesystem = "ext4",
                                         std::string name = "Disk");

/// The usual options but for one.
template <class T>
JobOptions with(T JobOptions::*option, std::type_identity_t<T> value)
{
    JobOptions options;
    options.*option = std::move(value);
    return options;
}

/// By which repairs are tried, and kept to be undone, below this directory; by this policy, which
/// outlives them.
JobOptions tryingIn(const std::filesystem::path& directory, const RepairPolicy* policy = nullptr);

/// One library, one listener, one loop.
struct JobFixture {
    explicit JobFixture(JobOptions options = {});

    /// Runs a job to its *finished* and answers what the begin answered.
    contract::ErrorCode verify(const contract::DiskReferencePointer& disk);
    contract::ErrorCode repair(const contract::DiskReferencePointer& disk);
    /// The same of the tasks that a module does not know.
    contract::ErrorCode run(Task task, const contract::DiskReferencePointer& disk);
    contract::ErrorCode finish(contract::ErrorCode begun);

    TestLoop loop;
    EnglishTexts texts;
    Listener listener;
    std::vector<std::string> traces;
    Manager manager;
    std::unique_ptr<contract::PLRepairDisk> tool;
};

}  // namespace pellar::test
