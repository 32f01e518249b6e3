// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <seccomp.h>

#include <memory>
#include <optional>

namespace pellar {

/// What a process may do that reads what strangers wrote: compute, use memory, and use the
/// descriptors that it has or is given. It can open no file, start no program, make no connection
/// and signal nobody. Made before the fork.
class ReaderRights {
public:
    /// None where the kernel or the library has no filter to give.
    [[nodiscard]] static std::optional<ReaderRights> prepare();

    /// To be called in the process that is to have no more than these, which has one thread. As
    /// root it becomes nobody. NO when any of it fails: then nothing may be read.
    [[nodiscard]] bool take() const noexcept;

private:
    struct ReleaseFilter {
        void operator()(void* filter) const { ::seccomp_release(filter); }
    };

    std::unique_ptr<void, ReleaseFilter> filter_;
    unsigned long addressSpace_ = 0;  ///< bytes
};

}  // namespace pellar
