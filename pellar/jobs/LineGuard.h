// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/PhraseMatcher.h"
#include "contract/pellar/ResultPhrases.h"
#include "pellar/texts/Texts.h"

#include <optional>
#include <string_view>

namespace pellar {

/// Knows the phrases by which the module takes a plain line for a verdict, in English and in the
/// user's language, so that nothing that comes off a disk can pass for one.
class LineGuard {
public:
    explicit LineGuard(const Texts& texts);

    /// The line holds a result phrase or the marker of an error, whatever the case.
    bool isSuspicious(std::string_view line) const;
    /// What the module will take the line for; none for an ordinary line.
    std::optional<contract::LinePhrase> meaningOf(std::string_view line) const;

private:
    contract::PhraseMatcher
        localized_;  ///< in the module's order, so it answers what the module does
    contract::PhraseMatcher everything_;
};

}  // namespace pellar
