// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <optional>
#include <string>

namespace pellar {

/// A file, or a name of one, that a repair takes away, or a file to which it gives another size.
struct FileChange {
    std::uint64_t inode = 0;              ///< where the name is not known
    std::string name;                     ///< any bytes, with its path where that is known
    std::optional<std::uint64_t> before;  ///< bytes; none: not known
    std::optional<std::uint64_t> after;   ///< bytes; none: it is gone

    friend bool operator==(const FileChange&, const FileChange&) = default;
};

}  // namespace pellar
