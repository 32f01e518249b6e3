// SPDX-License-Identifier: Apache-2.0
#include "pellar/permissions/Permissions.h"

#include <sys/stat.h>

namespace pellar {
namespace {

char letterOf(FileKind kind)
{
    switch (kind) {
        case FileKind::Regular: return '-';
        case FileKind::Directory: return 'd';
        case FileKind::SymbolicLink: return 'l';
        case FileKind::Other: break;
    }
    return '?';
}

}  // namespace

FileKind kindOf(mode_t mode)
{
    if (S_ISREG(mode))
        return FileKind::Regular;
    if (S_ISDIR(mode))
        return FileKind::Directory;
    return S_ISLNK(mode) ? FileKind::SymbolicLink : FileKind::Other;
}

std::string modeText(FileKind kind, mode_t mode)
{
    std::string text(1, letterOf(kind));
    for (const unsigned shift : {6U, 3U, 0U}) {
        text += (mode >> shift & 4U) != 0 ? 'r' : '-';
        text += (mode >> shift & 2U) != 0 ? 'w' : '-';
        text += (mode >> shift & 1U) != 0 ? 'x' : '-';
    }
    const auto mark = [&](mode_t bit, std::size_t place, char lower, char upper) {
        if ((mode & bit) != 0)
            text[place] = text[place] == 'x' ? lower : upper;
    };
    mark(S_ISUID, 3, 's', 'S');
    mark(S_ISGID, 6, 's', 'S');
    mark(S_ISVTX, 9, 't', 'T');
    return text;
}

}  // namespace pellar
