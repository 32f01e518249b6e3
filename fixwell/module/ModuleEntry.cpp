// SPDX-License-Identifier: Apache-2.0
#include "contract/support/ModuleEntry.h"

#include "fixwell/module/OVFXW.h"

#include <exception>

namespace {

fixwell::OVModule* makeModule(fixwell::HostServices& host, fixwell::ModuleSite& site)
{
    try {
        auto module = std::make_unique<fixwell::OVFXW>(host, site);
        return module->init() ? module.release() : nullptr;
    } catch (const std::exception& error) {
        host.log().ov_log(fixwell::OVLog::error, 0,
                          std::string("cannot make the module Fixwell: ") + error.what());
        return nullptr;
    }
}

}  // namespace

extern "C" [[gnu::visibility("default")]] const fixwell::ModuleEntry* OVModuleEntry()
{
    static const fixwell::ModuleEntry entry{fixwell::moduleContractVersion,
                                            &fixwell::OVFXW::shouldRunOnThisConfig, &makeModule};
    return &entry;
}
