// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/permissions/PathAliases.h"
#include "pellar/process/FileDescriptor.h"

#include <cstddef>
#include <optional>
#include <string>
#include <vector>

namespace pellar {

/// What can be read of an installed system: regular files and the names in directories below its
/// root. A process without rights of its own asks another for them.
class RootFiles {
public:
    virtual ~RootFiles() = default;

    /// A regular file for reading; links stay inside the root.
    [[nodiscard]] virtual FileDescriptor openFile(const std::string& path) const = 0;
    /// What a directory holds, sorted, without "." and ".."; empty when it cannot be read.
    [[nodiscard]] virtual std::vector<std::string> names(const std::string& directory) const = 0;
    virtual const PathAliases& aliases() const = 0;

    /// The contents of a regular file of at most `largest` bytes.
    [[nodiscard]] std::optional<std::string> read(const std::string& path,
                                                  std::size_t largest) const;
};

/// The bytes of an open file from its beginning on; none when there are more than `largest`, or
/// when they cannot be read.
[[nodiscard]] std::optional<std::string> contentsOf(int file, std::size_t largest);

}  // namespace pellar
