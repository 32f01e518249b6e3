// SPDX-License-Identifier: Apache-2.0
#include "pellar/permissions/dpkg/DpkgReferences.h"

#include "pellar/permissions/Lines.h"
#include "pellar/permissions/ReferenceCollector.h"
#include "pellar/permissions/ScriptMentions.h"
#include "pellar/permissions/TemporaryFileRules.h"
#include "pellar/permissions/dpkg/DpkgExceptions.h"
#include "pellar/permissions/dpkg/DpkgStatus.h"

#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <unordered_map>
#include <unordered_set>
#include <utility>

namespace pellar {
namespace {

const std::string infoDirectory = "var/lib/dpkg/info/";
constexpr std::size_t largestFile = 256U << 20U;

// What lies in var is a program's own, and many set its owner as they start (apt does with its
// "partial" directories). An archive can only say "root" of it, because most accounts get their
// numbers on the system; where it does name another owner, that is meant.
bool isState(const Reference& reference)
{
    const std::string& path = reference.path;
    const bool isDeep = path.starts_with("var/") && path.find('/', 4) != std::string::npos;
    return isDeep && reference.user == 0 && reference.group == 0;
}

/// One reading of a dpkg database.
class DpkgReading {
public:
    DpkgReading(const RootDirectory& root, const Accounts& accounts, ReferenceStore& store,
                const FetchArchives& fetch)
        : root_(root),
          accounts_(accounts),
          store_(store),
          fetch_(fetch),
          diversions_(text("var/lib/dpkg/diversions"), root.aliases()),
          temporaryFiles_(temporaryFileRulesOf(root))
    {
        for (const std::string& name : root.names(infoDirectory))
            infoFiles_.insert(name);
    }

    std::optional<References> read(const ReadingProgress& progress)
    {
        packages_ = parseDpkgStatus(text("var/lib/dpkg/status"));
        for (const DpkgPackage& package : packages_)
            foreign_.addForeign(scriptsOf(package));
        for (std::size_t i = 0; i < packages_.size(); ++i) {
            if (!progress(100 * static_cast<double>(i) / static_cast<double>(packages_.size())))
                return std::nullopt;
            add(i);
        }
        for (Reference& override :
             parseStatOverrides(text("var/lib/dpkg/statoverride"), accounts_, root_.aliases()))
            collector_.override(std::move(override));
        return std::move(collector_).take();
    }

private:
    std::string text(const std::string& path) const
    {
        return root_.read(path, largestFile).value_or("");
    }

    /// Multi-arch packages have their architecture in the names of their files.
    std::string infoPathOf(const DpkgPackage& package, std::string_view kind) const
    {
        const std::string qualified = package.name + ':' + package.architecture + std::string(kind);
        return infoDirectory +
               (infoFiles_.count(qualified) > 0 ? qualified : package.name + std::string(kind));
    }

    ScriptMentions scriptsOf(const DpkgPackage& package) const
    {
        ScriptMentions mentions;
        for (const char* const kind : {".preinst", ".postinst", ".config", ".triggers"}) {
            const std::string path = infoPathOf(package, kind);
            if (infoFiles_.count(path.substr(infoDirectory.size())) > 0)
                mentions.add(text(path), root_.aliases());
        }
        return mentions;
    }

    std::vector<std::string> filesOf(const DpkgPackage& package) const
    {
        std::vector<std::string> files;
        const std::string list = text(infoPathOf(package, ".list"));
        forEachLine(list, [&](std::string_view line) {
            if (std::string path = withoutSlashes(line); !path.empty())
                files.push_back(std::move(path));
        });
        return files;
    }

    FileDescriptor ownArchiveOf(const DpkgPackage& package) const
    {
        return root_.openFile("var/cache/apt/archives/" + package.fileName() + ".deb");
    }

    std::optional<std::vector<PackagedFile>> archived(std::size_t index)
    {
        const std::string name = packages_[index].fileName();
        if (auto kept = store_.find(name))
            return kept;
        const FileDescriptor archive = ownArchiveOf(packages_[index]);
        auto files = archive ? readDebArchive(archive.get()) : fetched(index);
        if (files)
            store_.keep(name, *files);
        return files;
    }

    std::optional<std::vector<PackagedFile>> fetched(std::size_t index)
    {
        if (!fetch_ || store_.directory().empty())
            return std::nullopt;
        if (index >= fetchedBefore_)
            fetchFrom(index);
        const auto target = store_.directory() / (packages_[index].fileName() + ".deb");
        const FileDescriptor archive(::open(target.c_str(), O_RDONLY | O_CLOEXEC | O_NOFOLLOW));
        auto files = archive ? readDebArchive(archive.get()) : std::nullopt;
        ::unlink(target.c_str());
        return files;
    }

    // Asking apt takes a second, whether for one or for many; what has been fetched takes room.
    void fetchFrom(std::size_t index)
    {
        constexpr std::size_t mostAtATime = 50;
        std::vector<DpkgPackage> wanted;
        for (; index < packages_.size() && wanted.size() < mostAtATime; ++index) {
            const DpkgPackage& package = packages_[index];
            if (package.isConfigured && !store_.has(package.fileName()) && !ownArchiveOf(package))
                wanted.push_back(package);
        }
        fetchedBefore_ = index;
        fetch_(wanted, store_.directory());
    }

    // A package says what its archive says, for the files that dpkg knows to be its own.
    void add(std::size_t index)
    {
        const DpkgPackage& package = packages_[index];
        auto said = package.isConfigured ? archived(index) : std::nullopt;
        collector_.countPackage(said.has_value());
        std::unordered_map<std::string, PackagedFile> byPath;
        for (PackagedFile& file : said.value_or(std::vector<PackagedFile>()))
            byPath[file.path] = std::move(file);
        const ScriptMentions scripts = said ? scriptsOf(package) : ScriptMentions();
        for (const std::string& path : filesOf(package)) {
            const std::string place = diversions_.placeOf(placeOf(path, byPath), package.name);
            const auto file = byPath.find(path);
            if (file == byPath.end())
                collector_.addWithoutSource(place);
            else
                collector_.add(referenceFor(file->second, place, scripts));
        }
    }

    // A package may bring the merging link itself; that is not the directory it leads to.
    std::string placeOf(const std::string& path,
                        const std::unordered_map<std::string, PackagedFile>& said) const
    {
        const auto file = said.find(path);
        const bool isLink = file != said.end() && file->second.kind == FileKind::SymbolicLink;
        return isLink && root_.aliases().isAlias(path) ? path : root_.aliases().canonical(path);
    }

    Reference referenceFor(const PackagedFile& file, const std::string& place,
                           const ScriptMentions& scripts) const
    {
        Reference reference;
        reference.path = place;
        reference.kind = file.kind;
        reference.mode = file.mode;
        reference.user = numberFor(file.user, accounts_.users);
        reference.group = numberFor(file.group, accounts_.groups);
        reference.capabilities = "";  // dpkg sets none; scripts do
        if (scripts.mayConcernOwn(place, file.kind) || foreign_.mayConcernForeign(place))
            reference.doubt = Doubt::Script;
        else if (temporaryFiles_.concern(place))
            reference.doubt = Doubt::TemporaryFiles;
        else if (isState(reference))
            reference.doubt = Doubt::State;
        return reference;
    }

    const RootDirectory& root_;
    const Accounts& accounts_;
    ReferenceStore& store_;
    const FetchArchives& fetch_;
    Diversions diversions_;
    TemporaryFileRules temporaryFiles_;
    std::unordered_set<std::string> infoFiles_;
    std::vector<DpkgPackage> packages_;
    std::size_t fetchedBefore_ = 0;  ///< the packages before this one have been asked for
    ScriptMentions foreign_;
    ReferenceCollector collector_;
};

}  // namespace

std::optional<References> readDpkgReferences(const RootDirectory& root, const Accounts& accounts,
                                             ReferenceStore& store, const FetchArchives& fetch,
                                             const ReadingProgress& progress)
{
    return DpkgReading(root, accounts, store, fetch).read(progress);
}

}  // namespace pellar
