// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/modules/ModuleLoader.h"

#include "contract/foundation/UTF8.h"
#include "orvane/support/files/WholeFile.h"
#include "orvane/support/settings/ValueJSON.h"
#include "pellar/process/FileDescriptor.h"
#include "pellar/process/TrustedPath.h"

#include <dlfcn.h>
#include <fcntl.h>
#include <sys/stat.h>

#include <fmt/format.h>
#include <cerrno>
#include <utility>
#include <vector>

namespace orvane {
namespace {

constexpr const char* attempt = "load the module";

struct Description {
    std::string name;
    std::string library;  ///< the name of a file in the bundle
    std::string defaultTable;
};

Failure linkerFailure(const std::filesystem::path& library)
{
    const char* const reason = ::dlerror();
    return cannot(attempt, library.native(),
                  contract::printable(reason != nullptr ? reason : "unknown reason"));
}

/// A file in the open directory, which others cannot change. `shown`: its path, for messages.
Result<pellar::FileDescriptor, Failure> openFile(const pellar::FileDescriptor& directory,
                                                 const std::string& name,
                                                 const std::filesystem::path& shown)
{
    pellar::FileDescriptor file(::openat(
        directory.get(), name.c_str(), O_RDONLY | O_NOFOLLOW | O_NONBLOCK | O_NOCTTY | O_CLOEXEC));
    struct stat status = {};
    if (!file || ::fstat(file.get(), &status) != 0)
        return cannot(attempt, shown.native(), errno);
    if (!S_ISREG(status.st_mode))
        return cannot(attempt, shown.native(), "it is no file");
    if (const std::string reason = pellar::whyOthersCanChange(status); !reason.empty())
        return cannot(attempt, shown.native(), reason);
    return file;
}

/// Where it really is; the path to the bundle may be led elsewhere by a link.
std::filesystem::path pathOf(const pellar::FileDescriptor& directory)
{
    return std::filesystem::read_symlink(pellar::pathOfDescriptor(directory.get()));
}

bool isPlainFileName(const std::filesystem::path& name)
{
    return !name.empty() && name == name.filename() && name != "." && name != "..";
}

Result<Description, Failure> readDescription(const pellar::FileDescriptor& file,
                                             const std::filesystem::path& shown)
{
    const auto contents = readWholeFile(pellar::pathOfDescriptor(file.get()), 64U << 10U);
    if (!contents)
        return cannot(attempt, shown.native(), contents.error());
    const auto json = parsedJSON(*contents);
    const auto text = [&json](const char* key, const char* otherwise) -> std::string {
        const auto found = json.find(key);
        return found != json.end() && found->is_string() ? found->get<std::string>() : otherwise;
    };
    if (!json.is_object() || text("name", "").empty())
        return cannot(attempt, shown.native(), "it does not name the module");
    if (!isPlainFileName(text("library", "")))
        return cannot(attempt, shown.native(), "it names no library inside the bundle");
    return Description{text("name", ""), text("library", ""), text("table", "FXW")};
}

Result<const contract::ModuleEntry*, Failure> openLibrary(pellar::FileDescriptor file,
                                                          const std::filesystem::path& shown)
{
    void* const code =
        ::dlopen(pellar::pathOfDescriptor(file.get()).c_str(), RTLD_NOW | RTLD_LOCAL);
    if (code == nullptr)
        return linkerFailure(shown);
    // The linker knows a library by its name. With this one given back, the next to be loaded could
    // have it, and would be taken for the one that is there.
    static std::vector<pellar::FileDescriptor> loaded;
    loaded.push_back(std::move(file));
    const auto entryFunction =
        reinterpret_cast<contract::ModuleEntryFunction>(::dlsym(code, contract::moduleEntryName));
    if (entryFunction == nullptr)
        return linkerFailure(shown);
    const contract::ModuleEntry* const entry = entryFunction();
    if (entry == nullptr)
        return cannot(attempt, shown.native(), "it gives no module entry");
    if (entry->contractVersion != contract::moduleContractVersion)
        return cannot(attempt, shown.native(),
                      fmt::format("it was built for version {} of the module contract, and this "
                                  "program has version {}",
                                  entry->contractVersion, contract::moduleContractVersion));
    return entry;
}

}  // namespace

Result<LoadedModule, Failure> loadModule(const std::filesystem::path& bundle)
{
    const auto opened = pellar::openTrusted(bundle);
    if (!opened)
        return cannot(attempt, bundle.native(), opened.error());
    const pellar::FileDescriptor& directory = *opened;
    const auto json = openFile(directory, "module.json", bundle / "module.json");
    if (!json)
        return json.error();
    const auto description = readDescription(*json, bundle / "module.json");
    if (!description)
        return description.error();
    const auto shown = bundle / description->library;
    auto library = openFile(directory, description->library, shown);
    if (!library)
        return library.error();
    const auto entry = openLibrary(*std::move(library), shown);
    if (!entry)
        return entry.error();
    return LoadedModule{
        description->name,
        std::make_unique<ModuleBundle>(pathOf(directory), description->defaultTable), *entry};
}

bool shouldRun(const LoadedModule& module, contract::HostServices& host)
{
    return module.entry->shouldRunOnThisConfig(host, *module.bundle);
}

Result<std::unique_ptr<contract::OVModule>, Failure> makeModule(const LoadedModule& module,
                                                                contract::HostServices& host,
                                                                contract::ModuleSite& site)
{
    std::unique_ptr<contract::OVModule> made(module.entry->make(host, site));
    if (!made)
        return cannot("start the module", module.name, "it could not be made");
    // It has been initialised: an entry gives no module that cannot be used.
    made->registerForNotifications();
    return made;
}

}  // namespace orvane
