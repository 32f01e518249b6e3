// SPDX-License-Identifier: Apache-2.0
#include "pellar/jobs/ProblemLimiter.h"

#include <algorithm>
#include <utility>

namespace pellar {
namespace {

constexpr std::size_t longestKind = 200;

bool isDigit(char c)
{
    return c >= '0' && c <= '9';
}

/// The question that e2fsck puts behind a problem says nothing about its kind.
std::string_view withoutQuestion(std::string_view problem)
{
    const bool isQuestion = problem.ends_with("? no") || problem.ends_with("? yes");
    const std::size_t sentence = problem.rfind(". ");
    return isQuestion && sentence != std::string_view::npos ? problem.substr(0, sentence + 1)
                                                            : problem;
}

/// A name may hold quotes itself, so everything from the first to the last is the name.
std::string withoutQuoted(std::string_view text)
{
    const std::size_t first = text.find('\'');
    const std::size_t last = text.rfind('\'');
    if (first == last)
        return std::string(text);
    return std::string(text.substr(0, first + 1)) + "…" + std::string(text.substr(last));
}

}  // namespace

std::string kindOfProblem(std::string_view problem)
{
    std::string kind;
    for (const char c : withoutQuoted(withoutQuestion(problem)).substr(0, longestKind)) {
        if (!isDigit(c))
            kind += c;
        else if (kind.empty() || kind.back() != '#')
            kind += '#';
    }
    return kind;
}

bool ProblemLimiter::admits(std::string_view problem)
{
    const std::string kind = kindOfProblem(problem);
    const auto known = kinds_.find(kind);
    const bool isKindFull = known != kinds_.end() && known->second.shown >= shownOfKind;
    if (shown_ < shownInAll && !isKindFull) {
        ++shown_;
        ++kinds_[kind].shown;
        return true;
    }
    ++(known != kinds_.end() ? known->second.hidden : hiddenOfVariousKinds_);
    return false;
}

std::vector<ProblemLimiter::Remainder> ProblemLimiter::takeRemainders()
{
    std::vector<Remainder> remainders;
    for (auto& [kind, count] : std::exchange(kinds_, {}))
        if (count.hidden > 0)
            remainders.push_back({count.hidden, kind});
    if (hiddenOfVariousKinds_ > 0)
        remainders.push_back({hiddenOfVariousKinds_, {}});
    shown_ = 0;
    hiddenOfVariousKinds_ = 0;
    return remainders;
}

}  // namespace pellar
