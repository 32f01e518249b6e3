// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/permissions/Reference.h"

#include <string>
#include <unordered_map>

namespace pellar {

/// Puts together what all packages say: a directory belongs to many of them.
class ReferenceCollector {
public:
    /// A package's word. Where two differ, the file is in doubt; a doubt stays.
    void add(Reference reference);
    /// A package has the file and does not say more.
    void addWithoutSource(const std::string& path);
    /// The administrator's word, which settles every doubt. The packages say of what kind the
    /// file is.
    void override(Reference reference);

    void countPackage(bool hasSource);
    /// Of a package that was counted as one without a source.
    void countBeyondBounds() { ++result_.packagesBeyondBounds; }
    /// More files than an installed system may have: what comes now is not taken.
    bool isFull() const;
    [[nodiscard]] References take() &&;

private:
    std::unordered_map<std::string, Reference> files_;
    std::unordered_map<std::string, Reference> overrides_;
    std::vector<std::string> withoutSource_;
    References result_;
};

}  // namespace pellar
