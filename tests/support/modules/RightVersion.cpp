// SPDX-License-Identifier: Apache-2.0
#include "fixwell/host/support/ModuleEntry.h"

namespace {

class EmptyModule final : public fixwell::OVModule {
public:
    using OVModule::OVModule;
    std::string displayName() const override { return "Empty"; }
    fixwell::Value tabOrder() const override { return 1; }
    std::string dataType() const override { return "EMPTY"; }
};

bool shouldRun(fixwell::HostServices&, fixwell::Bundle& bundle)
{
    return bundle.localizedString("key") == "key";
}

fixwell::OVModule* make(fixwell::HostServices& host, fixwell::ModuleSite& site)
{
    return std::make_unique<EmptyModule>(host, site).release();
}

constexpr fixwell::ModuleEntry entry{fixwell::moduleContractVersion, shouldRun, make};

}  // namespace

extern "C" const fixwell::ModuleEntry* OVModuleEntry()
{
    return &entry;
}
