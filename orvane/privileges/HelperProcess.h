// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/process/FileDescriptor.h"

#include <sys/types.h>

#include <optional>
#include <string>
#include <utility>
#include <vector>

namespace orvane {

using pellar::FileDescriptor;

/// A program that runs with more rights than ours, so it cannot be signalled: it is told to end
/// through its standard input, and ends in order when that closes. It stays in our process group,
/// where it can ask for a password on the terminal.
class HelperProcess {
public:
    /// None when it cannot be started.
    [[nodiscard]] static std::optional<HelperProcess> start(
        const std::vector<std::string>& command);
    HelperProcess(HelperProcess&& other) noexcept;
    HelperProcess& operator=(HelperProcess&&) = delete;
    /// Closes its input and waits for its end.
    ~HelperProcess();

    int output() const { return output_.get(); }
    /// Nothing happens when it has gone.
    void tell(std::string_view line);
    void closeInput() { input_.reset(); }
    /// Waits; the exit status, or none when it was killed. Once.
    std::optional<int> reap();

private:
    HelperProcess(pid_t id, FileDescriptor input, FileDescriptor output)
        : id_(id), input_(std::move(input)), output_(std::move(output))
    {
    }

    pid_t id_;
    FileDescriptor input_;
    FileDescriptor output_;
};

}  // namespace orvane
