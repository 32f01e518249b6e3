// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/modules/ModuleLoader.h"

#include "contract/foundation/UTF8.h"
#include "orvane/support/files/FileDescriptor.h"
#include "orvane/support/files/WholeFile.h"
#include "orvane/support/settings/ValueJSON.h"
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
Outcome<FileDescriptor> openFile(const FileDescriptor& directory, const std::string& name,
                                 const std::filesystem::path& shown)
{
    FileDescriptor file(::openat(directory.get(), name.c_str(),
                                 O_RDONLY | O_NOFOLLOW | O_NONBLOCK | O_NOCTTY | O_CLOEXEC));
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
std::filesystem::path pathOf(const FileDescriptor& directory)
{
    return std::filesystem::read_symlink(pellar::pathOfDescriptor(directory.get()));
}

bool isPlainFileName(const std::filesystem::path& name)
{
    return !name.empty() && name == name.filename() && name != "." && name != "..";
}

Outcome<Description> readDescription(const FileDescriptor& file, const std::filesystem::path& shown)
{
    const auto contents = readWholeFile(pellar::pathOfDescriptor(file.get()), 64U << 10U);
    if (const int* const error = std::get_if<int>(&contents))
        return cannot(attempt, shown.native(), *error);
    const auto json = parsedJSON(std::get<std::string>(contents));
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

Outcome<const contract::ModuleEntry*> openLibrary(FileDescriptor file,
                                                 const std::filesystem::path& shown)
{
    void* const code =
        ::dlopen(pellar::pathOfDescriptor(file.get()).c_str(), RTLD_NOW | RTLD_LOCAL);
    if (code == nullptr)
        return linkerFailure(shown);
    // The linker knows a library by its name. With this one given back, the next to be loaded could
    // have it, and would be taken for the one that is there.
    static std::vector<FileDescriptor> loaded;
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

Outcome<LoadedModule> loadModule(const std::filesystem::path& bundle)
{
    const auto opened = pellar::openTrusted(bundle);
    if (!opened)
        return cannot(attempt, bundle.native(), opened.error());
    const FileDescriptor& directory = *opened;
    const auto json = openFile(directory, "module.json", bundle / "module.json");
    if (failed(json))
        return std::get<Failure>(json);
    const auto described = readDescription(std::get<FileDescriptor>(json), bundle / "module.json");
    if (failed(described))
        return std::get<Failure>(described);
    const auto& description = std::get<Description>(described);
    const auto shown = bundle / description.library;
    auto library = openFile(directory, description.library, shown);
    if (failed(library))
        return std::get<Failure>(library);
    const auto entry = openLibrary(std::get<FileDescriptor>(std::move(library)), shown);
    if (failed(entry))
        return std::get<Failure>(entry);
    return LoadedModule{description.name,
                        std::make_unique<ModuleBundle>(pathOf(directory), description.defaultTable),
                        std::get<const contract::ModuleEntry*>(entry)};
}

bool shouldRun(const LoadedModule& module, contract::HostServices& host)
{
    return module.entry->shouldRunOnThisConfig(host, *module.bundle);
}

Outcome<std::unique_ptr<contract::OVModule>> makeModule(const LoadedModule& module,
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
