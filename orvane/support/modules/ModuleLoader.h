// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/support/ModuleEntry.h"
#include "orvane/support/files/Failure.h"
#include "orvane/support/texts/Catalogue.h"

#include <filesystem>
#include <memory>
#include <string>

namespace orvane {

/// A module whose code is in the process. It is never taken out again: names and texts of the
/// module live on in records and in the log.
struct LoadedModule {
    std::string name;
    std::unique_ptr<ModuleBundle> bundle;
    const contract::ModuleEntry* entry = nullptr;
};

/// Loads the bundle's library: {"name": "Fixwell", "library": "fixwell.so"} in its `module.json`
/// names it, and "table" the default string table, where it is another one than "FXW". Refuses what
/// other users could change (for root, on the way there as well), and a module that was built for
/// another version of the contract, of which nothing but the version is looked at. All that is
/// looked at is opened once, and that is what is loaded. Loading runs the library's initializers.
/// Main thread.
[[nodiscard]] Result<LoadedModule, Failure> loadModule(const std::filesystem::path& bundle);

/// Whether the module may run here; it says NO where its own switch in the settings is off.
[[nodiscard]] bool shouldRun(const LoadedModule& module, contract::HostServices& host);

/// A module, made and initialized, with its notifications registered. Host and site must outlive
/// it.
[[nodiscard]] Result<std::unique_ptr<contract::OVModule>, Failure> makeModule(
    const LoadedModule& module, contract::HostServices& host, contract::ModuleSite& site);

}  // namespace orvane
