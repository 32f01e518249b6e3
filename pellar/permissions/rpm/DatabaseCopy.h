// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/permissions/RootDirectory.h"

#include <filesystem>
#include <optional>
#include <string>

namespace pellar {

/// A copy of rpm's database in a directory of its own, which goes with this object. rpm writes
/// beside the database even when it is only asked (a lock, SQLite's shared memory), which a
/// verification must not, and on a read-only volume cannot.
class DatabaseCopy {
public:
    /// Copies the files of this directory below the root; none when that fails.
    [[nodiscard]] static std::optional<DatabaseCopy> make(const RootDirectory& root,
                                                          const std::string& database);

    DatabaseCopy(DatabaseCopy&& other) noexcept;
    DatabaseCopy& operator=(DatabaseCopy&&) = delete;
    ~DatabaseCopy();

    const std::filesystem::path& path() const { return path_; }

private:
    explicit DatabaseCopy(std::filesystem::path path) : path_(std::move(path)) {}

    std::filesystem::path path_;  ///< empty when it was moved from
};

}  // namespace pellar
