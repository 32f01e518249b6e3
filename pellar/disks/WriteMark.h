// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

namespace pellar {

/// By which it is seen that somebody has written to a disk in between: the marks that were taken
/// of it before and after then differ. Of a file its length and times (statx(2)); of a device how
/// much was written to it (iostats.rst of the kernel). Reading changes neither.
class WriteMark {
public:
    /// What others have written by then is on the medium.
    [[nodiscard]] static WriteMark of(int disk);

    friend bool operator==(const WriteMark&, const WriteMark&) = default;

private:
    std::string text_;
};

}  // namespace pellar
