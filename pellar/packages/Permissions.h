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

/// Any way of writing capabilities in the one of cap_to_text(3); none when it is no such text.
[[nodiscard]] std::optional<std::string> canonicalCapabilities(const std::string& text);

/// Of an object opened with O_PATH; empty when it has none. None when they cannot be read, or
/// belong to another user namespace.
[[nodiscard]] std::optional<std::string> capabilitiesOf(int object);

/// Sets them, or takes them away when `text` is empty. Answers 0 or errno.
[[nodiscard]] int setCapabilities(int object, const std::string& text);

}  // namespace pellar
