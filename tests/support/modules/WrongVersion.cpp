// SPDX-License-Identifier: Apache-2.0
#include "fixwell/host/support/ModuleEntry.h"

namespace {

// A host that called anything of a module of another version would crash here.
constexpr fixwell::ModuleEntry entry{fixwell::moduleContractVersion + 41, nullptr, nullptr};

}  // namespace

extern "C" const fixwell::ModuleEntry* OVModuleEntry()
{
    return &entry;
}
