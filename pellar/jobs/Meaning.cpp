// SPDX-License-Identifier: Apache-2.0
#include "pellar/jobs/Meaning.h"

namespace pellar {

std::vector<std::string_view> meaningOf(Damage damage)
{
    if (damage.isOnly(Damage::Bookkeeping))
        return {"Only the bookkeeping of free space and links is wrong; no file is affected."};
    std::vector<std::string_view> sentences;
    if (damage.has(Damage::SharedBlocks))
        sentences.push_back(
            "Some files lay claim to the same place on the disk, and may hold each other's "
            "contents. Copy what matters before a repair.");
    if (damage.has(Damage::Structure))
        sentences.push_back(
            "Structures that the file system is built on are damaged; a repair restores them from "
            "copies and from what it finds.");
    if (damage.has(Damage::Contents))
        sentences.push_back(
            "Some files or directories are damaged; a repair may have to cut or clear them. Copy "
            "what matters before it.");
    if (damage.has(Damage::Unfinished))
        sentences.push_back(
            "The volume was not properly unmounted; what was being written then may be "
            "incomplete.");
    if (damage.has(Damage::LostPlaces))
        sentences.push_back(
            "Files or directories have lost their names or places; a repair collects what is left "
            "of them under new names, in the folder lost+found where there is one.");
    return sentences;
}

}  // namespace pellar
