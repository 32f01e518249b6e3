// SPDX-License-Identifier: Apache-2.0
#include "pellar/packages/dpkg/DpkgReferences.h"

#include "pellar/bytes/Digest.h"
#include "pellar/packages/PackagedFile.h"
#include "pellar/packages/Reference.h"
#include "pellar/packages/ScriptMentions.h"
#include "pellar/packages/TemporaryFileRules.h"
#include "pellar/packages/TextLines.h"
#include "pellar/packages/dpkg/AptArchives.h"
#include "pellar/packages/dpkg/DpkgDatabase.h"

#include <algorithm>
#include <unordered_map>
#include <unordered_set>
#include <utility>

namespace pellar {
namespace {

const std::string infoDirectory = "var/lib/dpkg/info/";
constexpr std::size_t largestFile = 64U << 20U;
constexpr std::size_t largestScript = 16U << 20U;

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
    DpkgReading(const RootFiles& root, const Accounts& accounts, const DpkgSources& sources)
        : root_(root),
          accounts_(accounts),
          sources_(sources),
          diversions_(text("var/lib/dpkg/diversions"), root.aliases()),
          overrides_(
              parseStatOverrides(text("var/lib/dpkg/statoverride"), accounts, root.aliases())),
          temporaryFiles_(temporaryFileRulesOf(root))
    {
        for (const std::string& name : root.names(infoDirectory))
            infoFiles_.insert(name);
        for (const Reference& override : overrides_)
            overridden_.insert(override.path);
    }

    std::optional<References> read(const ReadingProgress& progress)
    {
        packages_ = parseDpkgStatus(text("var/lib/dpkg/status"));
        index_ = ArchiveIndex(root_, packages_);
        for (const DpkgPackage& package : packages_)
            foreign_.addForeign(scriptsOf(package).value_or(ScriptMentions()));
        for (std::size_t i = 0; i < packages_.size(); ++i) {
            if (!progress(100 * static_cast<double>(i) / static_cast<double>(packages_.size())))
                return std::nullopt;
            add(i);
        }
        for (Reference& override : overrides_)
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

    /// None where one is there that cannot be read: it may concern any file.
    std::optional<ScriptMentions> scriptsOf(const DpkgPackage& package) const
    {
        ScriptMentions mentions;
        for (const char* const kind : {".preinst", ".postinst", ".config", ".triggers"}) {
            const std::string path = infoPathOf(package, kind);
            if (infoFiles_.count(path.substr(infoDirectory.size())) == 0)
                continue;
            const auto script = root_.read(path, largestScript);
            if (!script)
                return std::nullopt;
            mentions.add(*script, root_.aliases());
        }
        return mentions;
    }

    // 0cc175b9c0f1b6a831c399e269772661  usr/bin/x
    std::unordered_map<std::string, std::string> digestsOf(const DpkgPackage& package) const
    {
        std::unordered_map<std::string, std::string> digests;
        const std::string list = text(infoPathOf(package, ".md5sums"));
        forEachLine(list, [&](std::string_view line) {
            const std::string digest(takeWord(line));
            line.remove_prefix(std::min<std::size_t>(line.find_first_not_of(' '), line.size()));
            if (kindOfDigest(digest) == DigestKind::MD5)
                digests[withoutSlashes(line)] = digest;
        });
        return digests;
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

    PackagedFiles archived(std::size_t index)
    {
        const std::vector<std::string>& digests = index_.digestsOf(packages_[index]);
        for (const std::string& digest : digests)
            if (const auto kept = sources_.kept ? sources_.kept->open(digest) : FileDescriptor())
                if (PackagedFiles files = readMtree(kept.get()))
                    return files;
        FileDescriptor archive = ownArchiveOf(packages_[index]);
        if (!archive)
            archive = fetched(index);
        return archive ? read(archive.get(), digests) : PackageFault::Malformed;
    }

    // An archive of this name that apt knows by another digest is not the package's. One of a
    // version that no source has any more is taken at its word, and never kept.
    PackagedFiles read(int archive, const std::vector<std::string>& digests) const
    {
        if (digests.empty())
            return readDebArchive(archive);
        const auto digest = digestOfFile(archive, DigestKind::SHA256, mostBytesOfPackage);
        if (!digest || std::find(digests.begin(), digests.end(), *digest) == digests.end())
            return PackageFault::Malformed;
        PackagedFiles files = readDebArchive(archive);
        if (sources_.kept && files)
            sources_.kept->keep(*digest, writeMtree(*files));
        return files;
    }

    FileDescriptor fetched(std::size_t index)
    {
        if (!sources_.fetch)
            return {};
        if (index >= fetchedBefore_)
            fetchFrom(index);
        const auto found = fetched_.find(index);
        return found != fetched_.end() ? std::move(found->second) : FileDescriptor();
    }

    bool isKept(const DpkgPackage& package) const
    {
        const std::vector<std::string>& digests = index_.digestsOf(package);
        return sources_.kept &&
               std::any_of(digests.begin(), digests.end(), [this](const std::string& digest) {
                   return bool(sources_.kept->open(digest));
               });
    }

    // Asking apt takes a second, whether for one or for many; what has been fetched takes room.
    void fetchFrom(std::size_t index)
    {
        constexpr std::size_t mostAtATime = 50;
        std::vector<DpkgPackage> wanted;
        std::vector<std::size_t> places;
        for (; index < packages_.size() && wanted.size() < mostAtATime; ++index) {
            const DpkgPackage& package = packages_[index];
            if (!package.isConfigured || isKept(package) || ownArchiveOf(package))
                continue;
            wanted.push_back(package);
            places.push_back(index);
        }
        fetchedBefore_ = index;
        fetched_.clear();
        std::vector<FileDescriptor> archives = sources_.fetch(wanted);
        for (std::size_t i = 0; i < std::min(archives.size(), places.size()); ++i)
            fetched_[places[i]] = std::move(archives[i]);
    }

    // A package says what its archive says, for the files that dpkg knows to be its own.
    void add(std::size_t index)
    {
        const DpkgPackage& package = packages_[index];
        const auto scripts = scriptsOf(package);
        PackagedFiles said = PackageFault::Malformed;
        if (package.isConfigured)
            said = scripts ? archived(index) : PackageFault::BeyondBounds;
        collector_.countPackage(bool(said));
        if (!said) {
            if (said.error() == PackageFault::BeyondBounds)
                collector_.countBeyondBounds();
            said = std::vector<PackagedFile>();
        }
        addFiles(package, *said, scripts.value_or(ScriptMentions()));
    }

    void addFiles(const DpkgPackage& package, std::vector<PackagedFile>& said,
                  const ScriptMentions& scripts)
    {
        std::unordered_map<std::string, PackagedFile> byPath;
        for (PackagedFile& file : said)
            byPath[file.path] = std::move(file);
        std::optional<std::unordered_map<std::string, std::string>> digests;
        for (const std::string& path : filesOf(package)) {
            const std::string place = diversions_.placeOf(placeOf(path, byPath), package.name);
            const auto file = byPath.find(path);
            if (file == byPath.end()) {
                collector_.addWithoutSource(place);
                continue;
            }
            Reference reference = referenceFor(file->second, place, scripts);
            if (overridden_.count(place) > 0 && reference.digest.empty()) {
                digests = digests ? std::move(digests) : digestsOf(package);
                reference.digest = (*digests)[path];
            }
            collector_.add(std::move(reference));
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
        reference.digest = file.digest;
        if (scripts.mayConcernOwn(place, file.kind) || foreign_.mayConcernForeign(place))
            reference.doubt = Doubt::Script;
        else if (temporaryFiles_.concern(place))
            reference.doubt = Doubt::TemporaryFiles;
        else if (isState(reference))
            reference.doubt = Doubt::State;
        return reference;
    }

    const RootFiles& root_;
    const Accounts& accounts_;
    const DpkgSources& sources_;
    Diversions diversions_;
    std::vector<Reference> overrides_;
    std::unordered_set<std::string> overridden_;  ///< their paths
    TemporaryFileRules temporaryFiles_;
    std::unordered_set<std::string> infoFiles_;
    std::vector<DpkgPackage> packages_;
    ArchiveIndex index_;
    std::size_t fetchedBefore_ = 0;  ///< the packages before this one have been asked for
    std::unordered_map<std::size_t, FileDescriptor> fetched_;  ///< by the package's index
    ScriptMentions foreign_;
    ReferenceCollector collector_;
};

}  // namespace

std::optional<References> readDpkgReferences(const RootFiles& root, const Accounts& accounts,
                                             const DpkgSources& sources,
                                             const ReadingProgress& progress)
{
    return DpkgReading(root, accounts, sources).read(progress);
}

}  // namespace pellar
