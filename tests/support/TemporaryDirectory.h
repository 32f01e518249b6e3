// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <stdlib.h>

#include <cstdint>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <stdexcept>
#include <string>
#include <string_view>

namespace orvane::test {

/// A new directory that goes with its contents when the test ends.
class TemporaryDirectory {
public:
    TemporaryDirectory()
    {
        std::string name = std::filesystem::temp_directory_path() / "support-test.XXXXXX";
        if (::mkdtemp(name.data()) == nullptr)
            throw std::runtime_error("cannot make a directory for the test");
        path = std::filesystem::canonical(name);
    }
    TemporaryDirectory(const TemporaryDirectory&) = delete;
    TemporaryDirectory& operator=(const TemporaryDirectory&) = delete;
    ~TemporaryDirectory()
    {
        std::error_code ignored;
        std::filesystem::remove_all(path, ignored);
    }

    std::filesystem::path operator/(std::string_view name) const { return path / name; }

    std::filesystem::path path;
};

inline std::string contentsOf(const std::filesystem::path& file)
{
    std::ostringstream text;
    text << std::ifstream(file, std::ios::binary).rdbuf();
    return text.str();
}

inline void write(const std::filesystem::path& file, std::string_view contents)
{
    std::filesystem::create_directories(file.parent_path());
    std::ofstream(file, std::ios::binary) << contents;
}

/// Replaces bytes of a file.
inline void patch(const std::filesystem::path& file, std::uint64_t offset, std::string_view bytes)
{
    std::fstream opened(file, std::ios::binary | std::ios::in | std::ios::out);
    opened.seekp(static_cast<std::streamoff>(offset));
    if (!opened.write(bytes.data(), static_cast<std::streamsize>(bytes.size())))
        throw std::runtime_error("cannot prepare the test: " + file.string());
}

}  // namespace orvane::test
