// SPDX-License-Identifier: Apache-2.0
#include "pellar/permissions/Capabilities.h"

#include "pellar/process/FileDescriptor.h"

#include <fcntl.h>
#include <sys/capability.h>
#include <sys/xattr.h>

#include <cerrno>
#include <memory>

namespace pellar {
namespace {

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
