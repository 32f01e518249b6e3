// SPDX-License-Identifier: Apache-2.0
#include "contract/support/ModuleEntry.h"

namespace {

class EmptyModule final : public contract::OVModule {
public:
    using OVModule::OVModule;
    std::string displayName() const override { return "Empty"; }
    contract::Value tabOrder() const override { return 1; }
    std::string dataType() const override { return "EMPTY"; }
};

bool shouldRun(contract::HostServices&, contract::Bundle& bundle)
{
    return bundle.localizedString("key") == "key";
}

contract::OVModule* make(contract::HostServices& host, contract::ModuleSite& site)
{
    return std::make_unique<EmptyModule>(host, site).release();
}

constexpr contract::ModuleEntry entry{contract::moduleContractVersion, shouldRun, make};

}  // namespace

extern "C" const contract::ModuleEntry* OVModuleEntry()
{
    return &entry;
}
