// SPDX-License-Identifier: Apache-2.0
#pragma once

namespace contract {

/// In points; y grows downwards.
struct Rect {
    double x = 0;
    double y = 0;
    double width = 0;
    double height = 0;

    friend bool operator==(const Rect&, const Rect&) = default;
};

}  // namespace contract
