// SPDX-License-Identifier: Apache-2.0
#include "pellar/permissions/InstalledReferences.h"

#include "pellar/permissions/InstalledSystem.h"
#include "pellar/permissions/dpkg/ArchiveFetch.h"
#include "pellar/permissions/dpkg/DpkgReferences.h"
#include "pellar/permissions/pacman/PacmanReferences.h"
#include "pellar/permissions/rpm/DatabaseCopy.h"
#include "pellar/permissions/rpm/RPMReferences.h"
#include "pellar/process/Command.h"

#include <utility>

namespace pellar {
namespace {

using Answer = std::variant<References, Sentence>;

Answer orStopped(std::optional<References> references)
{
    return references ? Answer(*std::move(references)) : Answer(Sentence{});
}

Answer askRPM(const RootDirectory& root, const Accounts& accounts, const ReferenceSources& sources,
              StopSwitch& stop)
{
    const std::filesystem::path program = findProgram("rpm", sources.toolPath);
    if (program.empty())
        return Sentence{"%1$@ is not installed (package %2$@)", "rpm", "rpm"};
    const auto database = DatabaseCopy::make(root, rpmDatabaseOf(root).native());
    if (!database)
        return Sentence{"the package database cannot be copied to be read", {}, {}};
    const RPMQuery query{program, database->path(), sources.outputLimits, sources.trace};
    return readRPMReferences(root, accounts, query, stop);
}

}  // namespace

std::variant<References, Sentence> readInstalledReferences(const RootDirectory& root,
                                                           const Accounts& accounts,
                                                           const ReferenceSources& sources,
                                                           StopSwitch& stop,
                                                           const ReadingProgress& progress)
{
    switch (installedSystemAt(root)) {
        case PackageDatabase::Dpkg: {
            ReferenceStore store(sources.store);
            const ArchiveFetch archives(sources.toolPath, stop, sources.trace);
            FetchArchives fetch;
            if (sources.fetchesArchives && sources.root == "/")
                fetch = [&archives](const auto& packages, const auto& directory) {
                    archives.fetch(packages, directory);
                };
            return orStopped(readDpkgReferences(root, accounts, store, fetch, progress));
        }
        case PackageDatabase::RPM: return askRPM(root, accounts, sources, stop);
        case PackageDatabase::Pacman: return orStopped(readPacmanReferences(root, progress));
        case PackageDatabase::None: break;
    }
    return Sentence{"there is no package database that is known here", {}, {}};
}

}  // namespace pellar
