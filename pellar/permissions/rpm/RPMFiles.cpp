// SPDX-License-Identifier: Apache-2.0
#include "pellar/permissions/rpm/RPMFiles.h"

#include "pellar/permissions/Capabilities.h"
#include "pellar/permissions/Digest.h"
#include "pellar/permissions/Lines.h"

#include <charconv>

namespace pellar {
namespace {

template <class Number>
std::optional<Number> numberIn(std::string_view text, int base)
{
    Number number = 0;
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number, base);
    if (text.empty() || error != std::errc() || end != text.data() + text.size())
        return std::nullopt;
    return number;
}

// rpm's rpmvf.h and rpmfi.h: the bits of FILEVERIFYFLAGS that ask for the owner, the group, the
// mode and the capabilities to be verified, and that of FILEFLAGS for a file that the package
// names without bringing it.
constexpr std::uint32_t verifiesAll = 1U << 3U | 1U << 4U | 1U << 6U;
constexpr std::uint32_t isGhost = 1U << 6U;

bool setOwners(Reference& reference, const std::string& user, const std::string& group,
               const Accounts& accounts)
{
    const auto userNumber = accounts.users.numberOf(user);
    const auto groupNumber = accounts.groups.numberOf(group);
    reference.user = userNumber.value_or(0);
    reference.group = groupNumber.value_or(0);
    return userNumber && groupNumber;
}

}  // namespace

// 100755\t0\t4294967295\t0\troot\troot\tcap_net_raw=ep\t9b1f…\t/usr/bin/ping
RPMFile parseRPMFile(std::string_view line, const Accounts& accounts, const PathAliases& aliases)
{
    const auto mode = numberIn<std::uint32_t>(takeField(line, '\t'), 8);
    const auto state = numberIn<std::int32_t>(takeField(line, '\t'), 10);
    const auto verified = numberIn<std::uint32_t>(takeField(line, '\t'), 10);
    const auto flags = numberIn<std::uint32_t>(takeField(line, '\t'), 10);
    const std::string user(takeField(line, '\t'));
    const std::string group(takeField(line, '\t'));
    const std::string capabilities(takeField(line, '\t'));
    const std::string digest(takeField(line, '\t'));
    if (!mode || !state || !verified || !flags || !line.starts_with('/'))
        return {};
    if (*state != 0)  // RPMFILE_STATE_NORMAL
        return {RPMLine::NotInstalled, {}};
    Reference reference;
    const bool isLink = kindOf(*mode) == FileKind::SymbolicLink;
    const std::string path = withoutSlashes(line);
    reference.path = isLink && aliases.isAlias(path) ? path : aliases.canonical(path);
    reference.kind = kindOf(*mode);
    reference.mode = *mode & 07777U;
    reference.capabilities =
        canonicalCapabilities(capabilities == "(none)" ? std::string() : capabilities);
    if (kindOfDigest(digest))
        reference.digest = digest;
    if (!setOwners(reference, user, group, accounts))
        reference.doubt = Doubt::UnknownAccount;
    else if ((*verified & verifiesAll) != verifiesAll || (*flags & isGhost) != 0)
        reference.doubt = Doubt::NotVerified;
    return {RPMLine::File, std::move(reference)};
}

}  // namespace pellar
