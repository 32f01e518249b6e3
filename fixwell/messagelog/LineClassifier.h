// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Bundle.h"
#include "contract/foundation/PhraseMatcher.h"
#include "fixwell/Contract.h"

#include <cstdint>
#include <optional>
#include <string_view>

namespace fixwell {

/// What a plain text line of the checking tool says.
enum FXWLineClass : int {
    FXWLineOther = 0,
    FXWLineFailure = 1,    ///< a problem
    FXWLineSuccess = 2,    ///< the volume is fine, or was repaired
    FXWLineRepairing = 3,  ///< a repair under way
};

/// Classifies a line by the result phrases of the user's language. The first phrase in their
/// order decides, so a line that is both OK and in need of repair is a success.
///
/// The phrases are looked up again whenever the bundle's string tables may have changed, so an
/// answer is always the one that a look-up per line would give.
class LineClassifier {
public:
    /// `bundle` must outlive the classifier.
    explicit LineClassifier(const Bundle& bundle) : bundle_(bundle) {}

    FXWLineClass classOf(std::string_view line);

private:
    const PhraseMatcher& phrases();

    const Bundle& bundle_;
    std::optional<PhraseMatcher> phrases_;
    std::uint64_t revision_ = 0;
};

/// Whether the tool marked the line red ("[31m" anywhere, without its escape byte).
bool scanForSpecialChars(std::string_view line);

/// The text between "[31m" and the first "[0m" (or, where there is none, "[30m") of the line.
/// An escape byte before the end marker stays. A line without both markers, or with the end
/// before the start, comes back whole.
std::string_view removeSpecialChars(std::string_view line);

}  // namespace fixwell
