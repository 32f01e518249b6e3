// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/process/FileDescriptor.h"

#include <atomic>
#include <cstdint>
#include <filesystem>
#include <string>
#include <thread>
#include <vector>

namespace orvane::test {

/// A file that fails on demand: it shows what is in another file, but for places that answer with
/// an I/O error. Needs root and /dev/fuse. Until this object ends it is served by a thread.
class FailingDisk {
public:
    struct Bad {
        std::uint64_t start = 0;
        std::uint64_t end = 0;  ///< the first good byte behind it

        friend bool operator==(const Bad&, const Bad&) = default;
    };
    /// From when on the places are bad.
    enum class Since { Ever, FirstWrite };

    /// Mounts at `directory`, which is there and empty.
    FailingDisk(std::filesystem::path directory, const std::filesystem::path& backing,
                std::vector<Bad> bad, Since since = Since::Ever);
    FailingDisk(const FailingDisk&) = delete;
    FailingDisk& operator=(const FailingDisk&) = delete;
    ~FailingDisk();

    /// Why there can be none here; empty where there can.
    static std::string obstacle();

    std::filesystem::path path() const { return directory_ / "disk"; }
    bool wasWritten() const { return wasWritten_; }

private:
    void serve();
    void answer(const char* request, std::size_t bytes);
    void look(std::uint64_t id, std::uint64_t node, std::string_view name);
    void read(std::uint64_t id, std::uint64_t start, std::uint32_t bytes);
    void write(std::uint64_t id, std::uint64_t start, std::string_view bytes);
    void reply(std::uint64_t id, int error, std::string_view bytes = {});
    bool isBad(std::uint64_t start, std::uint64_t bytes) const;

    std::filesystem::path directory_;
    pellar::FileDescriptor backing_;
    pellar::FileDescriptor fuse_;
    std::uint64_t size_ = 0;
    std::vector<Bad> bad_;
    Since since_;
    std::atomic<bool> wasWritten_ = false;
    std::thread server_;
};

}  // namespace orvane::test
