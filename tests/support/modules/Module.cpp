// SPDX-License-Identifier: Apache-2.0
#include "contract/support/ModuleEntry.h"

namespace {

constexpr std::uint32_t version = contract::moduleContractVersion;
#ifdef WRONG_VERSION
// A host that called anything of a module of another version would crash here.
constexpr contract::ModuleEntry entry{version + 41, nullptr, nullptr};
#else
bool shouldRun(contract::HostServices&, contract::Bundle&)
{
    return true;
}

contract::OVModule* make(contract::HostServices&, contract::ModuleSite&)
{
    return nullptr;
}

constexpr contract::ModuleEntry entry{version, shouldRun, make};
#endif

}  // namespace

extern "C" const contract::ModuleEntry* OVModuleEntry()
{
    return &entry;
}
