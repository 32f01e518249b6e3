// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/outcome/Result.h"
#include "pellar/process/FileDescriptor.h"

#include <sys/file.h>

#include <cerrno>
#include <chrono>
#include <filesystem>
#include <functional>
#include <memory>
#include <string>
#include <string_view>
#include <thread>
#include <vector>

namespace pellar {

/// How a file or a directory reaches the medium: like fsync(2), whose result and errno it has.
using SyncFunction = std::function<int(int descriptor)>;

/// All of an open file; EFBIG when it has more bytes than `most`, or another errno.
[[nodiscard]] Result<std::string, int> readWhole(const FileDescriptor& file, std::uint64_t most);

/// Keeps other processes that take it from working in an open directory until it is destroyed;
/// waits for those that do (flock(2)).
class DirectoryLock {
public:
    /// The descriptor stays open as long as the lock.
    explicit DirectoryLock(int directory) : directory_(directory) { ::flock(directory_, LOCK_EX); }
    DirectoryLock(const DirectoryLock&) = delete;
    DirectoryLock& operator=(const DirectoryLock&) = delete;
    ~DirectoryLock() { ::flock(directory_, LOCK_UN); }

private:
    const int directory_;
};

/// What `attempt`, which answers a Result with an errno, comes to: made again while another has the
/// lock (EWOULDBLOCK), for a fifth of a second at most, as a listing takes it for a moment.
template <class Attempt>
[[nodiscard]] auto waitingForLock(const Attempt& attempt)
{
    constexpr int tries = 11;
    auto result = attempt();
    for (int i = 1; i < tries && !result && result.error() == EWOULDBLOCK; ++i) {
        std::this_thread::sleep_for(std::chrono::milliseconds(20));
        result = attempt();
    }
    return result;
}

/// The directory that holds the records' directories. It is opened once, and everything is reached
/// through its descriptor, so nobody can lead a name elsewhere in between.
class StoreDirectory {
public:
    /// Makes it when it is missing, for this user alone. In English why not, also when others than
    /// this user and root could change it.
    [[nodiscard]] static Result<StoreDirectory, std::string> open(const std::filesystem::path& path,
                                                                  SyncFunction sync);

    /// None is made, nor need it be this user's: it only may not be others' to change than this
    /// user's and root's. EPERM where it is, else an errno.
    [[nodiscard]] static Result<StoreDirectory, int> openExisting(
        const std::filesystem::path& path);

    int descriptor() const { return directory_.get(); }
    /// 0, or errno.
    [[nodiscard]] int sync(int descriptor) const;
    [[nodiscard]] int sync() const { return sync(directory_.get()); }
    /// Of everything that is in it and does not begin with a dot; in no order.
    [[nodiscard]] std::vector<std::string> names() const;

private:
    StoreDirectory(FileDescriptor directory, SyncFunction sync)
        : directory_(std::move(directory)), sync_(std::move(sync))
    {
    }

    FileDescriptor directory_;
    SyncFunction sync_;
};

/// The directory of one record. Whoever works on a record holds its lock (flock(2) on the directory
/// itself), so that a running repair is not taken for an interrupted one; the kernel gives the lock
/// back when the process ends, however it ends. All numbers answered are 0 or errno.
class RecordDirectory {
public:
    /// Files of a record. One without facts was never committed.
    static constexpr const char* factsName = "facts";
    static constexpr const char* rangesName = "ranges";
    static constexpr const char* beforeName = "before";
    static constexpr const char* afterName = "after";

    /// Makes the first that is free of NAME-001, NAME-002, ..., and locks it.
    [[nodiscard]] static Result<RecordDirectory, int> make(
        std::shared_ptr<const StoreDirectory> store, const std::string& name);
    /// Does not lock it. ENOENT for a name that no record can have.
    [[nodiscard]] static Result<RecordDirectory, int> open(
        std::shared_ptr<const StoreDirectory> store, const std::string& name);

    const std::string& name() const { return name_; }

    /// EWOULDBLOCK when another has it; ENOENT when it was removed in the meantime.
    [[nodiscard]] int lock() const;
    /// Keeps others from working on the record until this object is gone, and lets them read it.
    [[nodiscard]] int lockForReading() const;

    /// A new file for writing.
    [[nodiscard]] Result<FileDescriptor, int> makeFile(const char* name) const;
    [[nodiscard]] Result<FileDescriptor, int> openFile(const char* name) const;
    [[nodiscard]] bool hasFile(const char* name, std::uint64_t size) const;
    /// EFBIG when it has more bytes than `most`.
    [[nodiscard]] Result<std::string, int> readFile(const char* name, std::uint64_t most) const;
    /// A new file of these bytes, on the medium.
    [[nodiscard]] int writeFile(const char* name, std::string_view text) const;
    /// New facts in place of the old ones, if any: at every moment one of the two is there, whole.
    /// After an error it may be either.
    [[nodiscard]] int replaceFacts(std::string_view text) const;
    /// 0 as well when it is not there.
    [[nodiscard]] int removeFile(const char* name) const;

    [[nodiscard]] int sync(const FileDescriptor& file) const { return store_->sync(file.get()); }
    /// The names of its files, and its own.
    [[nodiscard]] int syncNames() const;

    /// All of it. The facts go first: what is left after an interruption was never committed.
    [[nodiscard]] int remove() const;

private:
    RecordDirectory(std::shared_ptr<const StoreDirectory> store, std::string name,
                    FileDescriptor directory)
        : store_(std::move(store)), name_(std::move(name)), directory_(std::move(directory))
    {
    }

    int lockAs(int kind) const;
    bool isStillInPlace() const;

    std::shared_ptr<const StoreDirectory> store_;
    std::string name_;
    FileDescriptor directory_;
};

}  // namespace pellar
