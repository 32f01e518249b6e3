// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <optional>
#include <string>
#include <utility>

namespace pellar {

/// Owns an open descriptor, or none, and closes it.
class FileDescriptor {
public:
    FileDescriptor() noexcept = default;
    explicit FileDescriptor(int descriptor) noexcept : descriptor_(descriptor) {}
    FileDescriptor(FileDescriptor&& other) noexcept
        : descriptor_(std::exchange(other.descriptor_, -1))
    {
    }
    FileDescriptor& operator=(FileDescriptor&& other) noexcept
    {
        std::swap(descriptor_, other.descriptor_);
        return *this;
    }
    ~FileDescriptor() { reset(); }

    int get() const noexcept { return descriptor_; }
    explicit operator bool() const noexcept { return descriptor_ >= 0; }
    void reset() noexcept;
    /// The caller closes it from now on.
    [[nodiscard]] int release() noexcept { return std::exchange(descriptor_, -1); }

private:
    int descriptor_ = -1;
};

/// The name by which a call that takes no O_PATH descriptor reaches the object itself
/// (proc(5), /proc/pid/fd).
[[nodiscard]] std::string pathOfDescriptor(int descriptor);

/// Both ends are closed on exec; the read end does not block.
struct Pipe {
    FileDescriptor readEnd;
    FileDescriptor writeEnd;
};

/// None when the process or the system has no descriptors left; errno says which.
[[nodiscard]] std::optional<Pipe> makePipe();

/// A pseudo-terminal for a program that holds its output back unless it sees one (pty(7)): raw, so
/// that nothing is added to what is written, without echo, and so wide that no line is wrapped.
/// It becomes no process's controlling terminal. The read end does not block; it answers EIO when
/// every writer is gone. None when the system has no pseudo-terminals, as in a bare rescue shell.
[[nodiscard]] std::optional<Pipe> makePseudoTerminal();

}  // namespace pellar
