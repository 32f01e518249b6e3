// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace contract {

enum class PasteboardType { PlainString, TabularText, RTF, RTFD };

/// Where copied and dragged data goes. Main thread only.
class Pasteboard {
public:
    virtual ~Pasteboard() = default;

    /// Empties the pasteboard and announces what follows. `owner` is only an identity.
    virtual void declareTypes(const std::vector<PasteboardType>& types, const void* owner) = 0;
    virtual void setData(std::string_view data, PasteboardType type) = 0;
};

}  // namespace contract
