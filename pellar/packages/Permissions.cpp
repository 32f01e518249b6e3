// SPDX-License-Identifier: Apache-2.0
#include "pellar/packages/Permissions.h"

#include "pellar/process/FileDescriptor.h"

#include <fcntl.h>
#include <sys/capability.h>
#include <sys/stat.h>
#include <sys/xattr.h>

#include <cerrno>
#include <memory>

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

struct FreeCapabilities {
    void operator()(cap_t capabilities) const { ::cap_free(capabilities); }
    void operator()(char* text) const { ::cap_free(text); }
};
using CapabilitySet = std::unique_ptr<std::remove_pointer_t<cap_t>, FreeCapabilities>;

std::optional<std::string> textOf(cap_t capabilities)
{
    const std::unique_ptr<char, FreeCapabilities> text(::cap_to_text(capabilities, nullptr));
    if (!text)
        return std::nullopt;
    const std::string result = text.get();
    return result == "=" ? std::string() : result;  // "=" is how libcap writes an empty set
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

std::optional<std::string> canonicalCapabilities(const std::string& text)
{
    if (text.empty())
        return text;
    const CapabilitySet set(::cap_from_text(text.c_str()));
    return set ? textOf(set.get()) : std::nullopt;
}

std::optional<std::string> capabilitiesOf(int object)
{
    const std::string path = pathOfDescriptor(object);
    if (::getxattr(path.c_str(), "security.capability", nullptr, 0) < 0)
        return errno == ENODATA || errno == ENOTSUP ? std::optional<std::string>("") : std::nullopt;
    const CapabilitySet set(::cap_get_file(path.c_str()));
    if (!set || ::cap_get_nsowner(set.get()) != 0)
        return std::nullopt;
    return textOf(set.get());
}

int setCapabilities(int object, const std::string& text)
{
    const std::string path = pathOfDescriptor(object);
    if (text.empty()) {
        const bool isGone = ::removexattr(path.c_str(), "security.capability") == 0;
        return isGone || errno == ENODATA ? 0 : errno;
    }
    const CapabilitySet set(::cap_from_text(text.c_str()));
    if (!set)
        return EINVAL;
    // libcap takes neither an O_PATH descriptor nor a name that is a link.
    const FileDescriptor file(::open(path.c_str(), O_RDONLY | O_NONBLOCK | O_CLOEXEC));
    return file && ::cap_set_fd(file.get(), set.get()) == 0 ? 0 : errno;
}

}  // namespace pellar
