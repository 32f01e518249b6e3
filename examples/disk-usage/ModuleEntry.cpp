// SPDX-License-Identifier: Apache-2.0
#include "contract/support/ModuleEntry.h"

#include "DiskUsage.h"

#include <exception>

namespace {

using namespace contract;

bool shouldRun(HostServices&, Bundle&)
{
    return true;
}

// No exception leaves a module.
OVModule* makeModule(HostServices& host, ModuleSite& site)
{
    try {
        auto module = std::make_unique<diskusage::DiskUsage>(host, site);
        return module->init() ? module.release() : nullptr;
    } catch (const std::exception& error) {
        host.log().ov_log(OVLog::error, 0,
                          std::string("cannot make the module Disk Usage: ") + error.what());
        return nullptr;
    }
}

}  // namespace

extern "C" [[gnu::visibility("default")]] const contract::ModuleEntry* OVModuleEntry()
{
    static const ModuleEntry entry{moduleContractVersion, &shouldRun, &makeModule};
    return &entry;
}
