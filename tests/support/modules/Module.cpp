// SPDX-License-Identifier: Apache-2.0
#include "contract/support/ModuleEntry.h"

namespace {

// A host that called anything of a module that it refuses would crash here.
constexpr contract::ModuleEntry entry{contract::moduleContractVersion + NEWER_BY, nullptr, nullptr};

}  // namespace

extern "C" const contract::ModuleEntry* OVModuleEntry()
{
    return &entry;
}
