// SPDX-License-Identifier: Apache-2.0
#include "pellar/outcome/Damage.h"

#include <array>

namespace pellar {

namespace {

/// What a kind of damage means where a repair follows, and where none is to be had.
struct Meaning {
    Damage::Kind kind;
    std::string_view beforeRepair;
    std::string_view forGood;
};

constexpr std::array meanings{
    Meaning{Damage::SharedBlocks,
            "Some files lay claim to the same place on the disk, and may hold each other's "
            "contents. Copy what matters before a repair.",
            "Some files lay claim to the same place on the disk, and may hold each other's "
            "contents."},
    Meaning{Damage::Structure,
            "Structures that the file system is built on are damaged; a repair restores them from "
            "copies and from what it finds.",
            "Structures that the file system is built on are damaged."},
    Meaning{Damage::Contents,
            "Some files or directories are damaged; a repair may have to cut or clear them. Copy "
            "what matters before it.",
            "Some files or directories are damaged."},
    Meaning{Damage::Unfinished,
            "The volume was not properly unmounted; what was being written then may be "
            "incomplete.",
            "The volume was not properly unmounted; what was being written then may be "
            "incomplete."},
    Meaning{Damage::LostPlaces,
            "Files or directories have lost their names or places; a repair collects what is left "
            "of them under new names, in the folder lost+found where there is one.",
            "Files or directories have lost their names or places."},
    Meaning{Damage::Unsurveyed,
            "The check could not go on, so nobody knows how much is damaged; a repair may lose "
            "files, even all of them. Copy what matters before it.",
            "The check could not go on, so nobody knows how much is damaged."},
};

}  // namespace

std::vector<std::string_view> meaningOf(Damage damage, bool canBeRepaired)
{
    if (damage.isOnly(Damage::Bookkeeping))
        return {"Only the bookkeeping of free space and links is wrong; no file is affected."};
    std::vector<std::string_view> sentences;
    for (const Meaning& meaning : meanings)
        if (damage.has(meaning.kind))
            sentences.push_back(canBeRepaired ? meaning.beforeRepair : meaning.forGood);
    return sentences;
}

}  // namespace pellar
