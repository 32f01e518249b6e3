// SPDX-License-Identifier: Apache-2.0
#include "pellar/permissions/InstalledReferences.h"

#include "pellar/packages/InstalledSystem.h"
#include "pellar/packages/PacmanReferences.h"
#include "pellar/packages/RPMReferences.h"
#include "pellar/packages/dpkg/AptArchives.h"
#include "pellar/packages/dpkg/DpkgReferences.h"
#include "pellar/packages/reader/ReaderProcess.h"
#include "pellar/process/Command.h"

#include <utility>

namespace pellar {
namespace {

using Answer = Result<References, Sentence>;

Answer askRPM(const RootDirectory& root, const Accounts& accounts, const ReferenceSources& sources,
              StopSwitch& stop)
{
    const std::filesystem::path program = findProgram("rpm", sources.toolPath);
    if (program.empty())
        return Sentence{"%1$@ is not installed (package %2$@)", "rpm", "rpm"};
    const auto database = copyDatabase(root, rpmDatabaseOf(root).native(), stop);
    if (!database)
        return database.error();
    const RPMQuery query{program, database->path(), sources.outputLimits, sources.trace};
    return readRPMReferences(root, accounts, query, stop);
}

// The running system's own package lists are root's, and so are its archives. What another system
// says of its own goes nowhere but into the answer.
Answer askDpkg(const RootDirectory& root, const Accounts& accounts, const ReferenceSources& sources,
               StopSwitch& stop, const ReadingProgress& progress)
{
    const bool isRunning = sources.root == "/";
    std::optional<ReferenceStore> store;
    const ArchiveFetch archives(sources.toolPath, stop, {sources.trace, sources.remark});
    DpkgSources own;
    if (isRunning)
        own.kept = &store.emplace(sources.store);
    if (isRunning && sources.fetchesArchives)
        own.fetch = [&archives](const auto& packages) {
            return archives.fetch(packages);
        };
    return readApart({root, own, progress}, stop,
                     [&accounts](const auto& files, const auto& from, const auto& told) {
                         return readDpkgReferences(files, accounts, from, told);
                     });
}

}  // namespace

Result<References, Sentence> readInstalledReferences(const RootDirectory& root,
                                                     const Accounts& accounts,
                                                     const ReferenceSources& sources,
                                                     StopSwitch& stop,
                                                     const ReadingProgress& progress)
{
    switch (installedSystemAt(root)) {
        case PackageDatabase::Dpkg: return askDpkg(root, accounts, sources, stop, progress);
        case PackageDatabase::RPM: return askRPM(root, accounts, sources, stop);
        case PackageDatabase::Pacman:
            return readApart({root, {}, progress}, stop,
                             [](const auto& files, const auto&, const auto& told) {
                                 return readPacmanReferences(files, told);
                             });
        case PackageDatabase::None: break;
    }
    return Sentence{"there is no package database that is known here", {}, {}};
}

}  // namespace pellar
