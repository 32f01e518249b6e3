// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/modules/ModuleLoader.h"

#include "fixwell/host/foundation/UTF8.h"
#include "orvane/support/modules/ModuleSearch.h"

#include <dlfcn.h>

#include <fmt/format.h>
#include <utility>

namespace orvane {
namespace {

constexpr const char* attempt = "load the module";

Failure linkerFailure(const std::filesystem::path& library)
{
    const char* const reason = ::dlerror();
    return cannot(attempt, library.native(),
                  fixwell::printable(reason != nullptr ? reason : "unknown reason"));
}

Outcome<const fixwell::ModuleEntry*> openLibrary(const std::filesystem::path& library)
{
    void* const code = ::dlopen(library.c_str(), RTLD_NOW | RTLD_LOCAL);
    if (code == nullptr)
        return linkerFailure(library);
    const auto entryFunction =
        reinterpret_cast<fixwell::ModuleEntryFunction>(::dlsym(code, fixwell::moduleEntryName));
    if (entryFunction == nullptr)
        return linkerFailure(library);
    const fixwell::ModuleEntry* const entry = entryFunction();
    if (entry == nullptr)
        return cannot(attempt, library.native(), "it gives no module entry");
    if (entry->contractVersion != fixwell::moduleContractVersion)
        return cannot(attempt, library.native(),
                      fmt::format("it was built for version {} of the module contract, and this "
                                  "program has version {}",
                                  entry->contractVersion, fixwell::moduleContractVersion));
    return entry;
}

}  // namespace

Outcome<LoadedModule> loadModule(const std::filesystem::path& bundle)
{
    if (const auto checked = checkIsTrustworthy(bundle); failed(checked))
        return std::get<Failure>(checked);
    auto described = readModuleDescription(bundle);
    if (failed(described))
        return std::get<Failure>(described);
    const auto& description = std::get<ModuleDescription>(described);
    if (const auto checked = checkIsTrustworthy(description.library); failed(checked))
        return std::get<Failure>(checked);
    const auto entry = openLibrary(description.library);
    if (failed(entry))
        return std::get<Failure>(entry);
    return LoadedModule{description.name,
                        std::make_unique<ModuleBundle>(bundle, description.defaultTable),
                        std::get<const fixwell::ModuleEntry*>(entry)};
}

bool shouldRun(const LoadedModule& module, fixwell::HostServices& host)
{
    return module.entry->shouldRunOnThisConfig(host, *module.bundle);
}

Outcome<std::unique_ptr<fixwell::OVModule>> makeModule(const LoadedModule& module,
                                                       fixwell::HostServices& host,
                                                       fixwell::ModuleSite& site)
{
    std::unique_ptr<fixwell::OVModule> made(module.entry->make(host, site));
    if (!made)
        return cannot("start the module", module.name, "it could not be made");
    // It has been initialised: an entry gives no module that cannot be used.
    made->registerForNotifications();
    return made;
}

}  // namespace orvane
