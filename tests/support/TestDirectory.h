// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <filesystem>
#include <functional>
#include <string>
#include <string_view>
#include <vector>

namespace orvane::test {

struct ToolAnswer {
    int status = -1;  ///< -1 when the tool is not installed or was killed
    std::string output;
};

/// Runs a system tool to its end.
ToolAnswer runTool(std::vector<std::string> arguments, std::string_view input = {});
/// The same, for what a test needs to begin with: throws unless the tool answers 0.
void prepareWith(const std::vector<std::string>& arguments, std::string_view input = {});

/// Runs in a process of its own, which ends with what `work` answers; its wait status (wait(2)).
int statusOfChild(const std::function<int()>& work);

std::string contentsOf(const std::filesystem::path& file);
/// Makes the directories above it, too.
void write(const std::filesystem::path& file, std::string_view contents);
/// Replaces bytes of a file.
void patch(const std::filesystem::path& file, std::uint64_t offset, std::string_view bytes);

/// A new directory that goes with its contents when the test ends, and what tests do with disks in
/// it. All throw what keeps the test from being prepared.
class TestDirectory {
public:
    TestDirectory();
    TestDirectory(const TestDirectory&) = delete;
    TestDirectory& operator=(const TestDirectory&) = delete;
    ~TestDirectory();

    std::filesystem::path path() const { return path_; }
    std::filesystem::path path(std::string_view name) const { return path_ / name; }
    std::filesystem::path operator/(std::string_view name) const { return path_ / name; }

    void write(std::string_view name, std::string_view bytes) const;
    /// A sparse file.
    std::filesystem::path makeFile(std::string_view name, std::uint64_t bytes) const;
    /// A sparse file with a file system of e2fsprogs' own making.
    std::filesystem::path makeExt(std::string_view name, std::uint64_t bytes,
                                  std::vector<std::string> options = {}) const;
    /// The same with another kind of file system; empty where the program that makes it is not
    /// installed.
    std::filesystem::path makeVolume(std::string_view name, std::string_view filesystem) const;
    /// debugfs(8), writing.
    void damage(const std::filesystem::path& image, std::string command) const;
    /// A directory to be searched for tools, in which `tool` does what `script` says; the fake
    /// tool's source describes it.
    std::string fakeTools(std::string_view script, std::string_view tool = "e2fsck") const;

private:
    std::filesystem::path path_;
};

}  // namespace orvane::test
