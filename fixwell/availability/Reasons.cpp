// SPDX-License-Identifier: Apache-2.0
#include "fixwell/availability/Reasons.h"

#include "fixwell/module/Localizable.h"

#include <array>

namespace fixwell {
namespace {

struct Sentence {
    std::string_view single;
    std::string_view multiple;
};

constexpr Sentence startupDisk{
    localizable("Not available because the startup disk is selected."),
    localizable("Not available because the startup disk is selected."),
};
constexpr Sentence general{
    localizable("Not available for the selected disk."),
    localizable("Not available for one or more of the selected disks."),
};

// By reason, from 1 on.
constexpr std::array<Sentence, 9> sentences{{
    {localizable("Not available because the selected disk is set to ignore ownership."),
     localizable("Not available because one of the selected disks is set to ignore ownership.")},
    {localizable("Not available because the selected disk isn’t a startup disk."),
     localizable("Not available because one of the selected disks isn’t a startup disk.")},
    startupDisk,
    {localizable("Not available because the selected disk contains your home directory and "
                 "can’t be unmounted."),
     localizable("Not available because one of the selected disks contains your home directory "
                 "and can’t be unmounted.")},
    general,
    general,
    general,
    {localizable("Not available because the selected disk is not mounted."),
     localizable("Not available because one of the selected disks is not mounted.")},
    {localizable("Not available because the selected disk can’t be written to."),
     localizable("Not available because one of the selected disks can’t be written to.")},
}};

}  // namespace

std::string_view reasonText(std::int32_t reason, bool isMultiple)
{
    if (reason < FXWReasonIgnoresOwnership || reason > FXWReasonNotWritable)
        return {};
    const Sentence& sentence = sentences[static_cast<std::size_t>(reason - 1)];
    return isMultiple ? sentence.multiple : sentence.single;
}

}  // namespace fixwell
