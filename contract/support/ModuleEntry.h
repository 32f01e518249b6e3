// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/support/OVModule.h"

#include <cstdint>

namespace contract {

/// Grows by one whenever anything in `contract/` changes its shape or meaning. A host loads
/// only modules of its own version, because they share classes, not merely functions.
inline constexpr std::uint32_t moduleContractVersion = 3;

/// What a module's shared object exports. The contract version is read first, and nothing else
/// when it is another one than the host's.
struct ModuleEntry {
    std::uint32_t contractVersion;
    /// Asked before a module is made; `bundle` is the module's own.
    bool (*shouldRunOnThisConfig)(HostServices& host, Bundle& bundle);
    /// A new module, for the caller to destroy; none on failure. No exception leaves it.
    OVModule* (*make)(HostServices& host, ModuleSite& site);
};

/// The type and name of the one exported function:
/// `extern "C" const contract::ModuleEntry* OVModuleEntry();`
using ModuleEntryFunction = const ModuleEntry* (*)();
inline constexpr const char* moduleEntryName = "OVModuleEntry";

}  // namespace contract
