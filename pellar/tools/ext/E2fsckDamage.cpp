// SPDX-License-Identifier: Apache-2.0
#include "pellar/tools/ext/E2fsckDamage.h"

#include <algorithm>
#include <array>

namespace pellar {
namespace {

struct Sign {
    std::string_view text;
    Damage::Kind kind;
};

// The first that occurs in the line decides (e2fsck 1.47.0, the texts of its problem table).
constexpr std::array signs{
    Sign{"ultiply-claimed block", Damage::SharedBlocks},
    Sign{"uperblock", Damage::Structure},
    Sign{"super-block", Damage::Structure},
    Sign{"oot inode", Damage::Structure},
    Sign{"esize inode", Damage::Structure},
    Sign{"esize_inode", Damage::Structure},
    Sign{"ournal", Damage::Structure},
    Sign{"roup descriptor", Damage::Structure},
    Sign{"count wrong", Damage::Bookkeeping},
    Sign{"bitmap differences", Damage::Bookkeeping},
    Sign{"bitmap does not match checksum", Damage::Bookkeeping},
    Sign{"Padding at end of", Damage::Bookkeeping},
    Sign{", i_blocks is ", Damage::Bookkeeping},
    Sign{" ref count is ", Damage::Bookkeeping},
    Sign{"filetype", Damage::Bookkeeping},
    Sign{"Unattached", Damage::LostPlaces},
    Sign{"Unconnected directory", Damage::LostPlaces},
    Sign{"deleted/unused inode", Damage::LostPlaces},
    Sign{"lost+found", Damage::LostPlaces},
};

/// What e2fsck itself says. A file may be called "count wrong", so what stands before the number of
/// the directory is left out: "Entry 'NAME' in PATH (2) has deleted/unused inode 12."
std::string_view withoutNames(std::string_view problem)
{
    if (problem.find('\'') == std::string_view::npos)
        return problem;
    const std::size_t number = problem.rfind(") ");
    return number == std::string_view::npos ? std::string_view() : problem.substr(number);
}

}  // namespace

Damage e2fsckDamageOf(std::string_view problem)
{
    problem = withoutNames(problem);
    const auto found = std::find_if(signs.begin(), signs.end(), [problem](const Sign& sign) {
        return problem.find(sign.text) != std::string_view::npos;
    });
    return found == signs.end() ? Damage::Contents : found->kind;
}

}  // namespace pellar
