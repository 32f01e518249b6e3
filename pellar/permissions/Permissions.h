// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <sys/types.h>

#include <cstdint>
#include <optional>
#include <string>

namespace pellar {

enum class FileKind { Regular, Directory, SymbolicLink, Other };

/// Of a mode with its type bits, as stat(2) and cpio have it.
FileKind kindOf(mode_t mode);

/// Who may do what with a file, as the file system has it.
struct Permissions {
    FileKind kind = FileKind::Other;
    mode_t mode = 0;  ///< the lower twelve bits: setuid, setgid, sticky and rwx
    uid_t user = 0;
    gid_t group = 0;
    std::string capabilities;  ///< as cap_to_text(3) writes them; empty for none

    friend bool operator==(const Permissions&, const Permissions&) = default;
};

/// As ls(1) writes it: "-rwsr-xr-x".
std::string modeText(FileKind kind, mode_t mode);

}  // namespace pellar
