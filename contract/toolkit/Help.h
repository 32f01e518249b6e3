// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string_view>

namespace contract {

class HelpManager {
public:
    virtual ~HelpManager() = default;

    /// Opens the host's help book at the anchor.
    virtual void openHelpAnchor(std::string_view anchor) = 0;
};

}  // namespace contract
