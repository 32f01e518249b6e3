// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/toolkit/OutlineView.h"

namespace contract {

enum class Pagination { Auto = 0, Fit = 1, Clip = 2 };

/// The application's shared print settings.
struct PrintInfo {
    Pagination horizontalPagination = Pagination::Auto;
    bool isHorizontallyCentered = true;
    bool isVerticallyCentered = true;
};

class Printing {
public:
    virtual ~Printing() = default;

    virtual PrintInfo& sharedPrintInfo() = 0;
    /// Prints the view with these settings, on a sheet of `window` that first shows the print
    /// panel when `showsPanel`.
    virtual void runPrintOperation(OutlineView& view, const PrintInfo& info, bool showsPanel,
                                   Window* window) = 0;
};

}  // namespace contract
