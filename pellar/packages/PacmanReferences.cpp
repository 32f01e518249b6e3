// SPDX-License-Identifier: Apache-2.0
#include "pellar/packages/PacmanReferences.h"

#include "pellar/packages/PackagedFile.h"
#include "pellar/packages/Reference.h"
#include "pellar/packages/ScriptMentions.h"
#include "pellar/packages/TemporaryFileRules.h"
#include "pellar/packages/TextLines.h"

#include <utility>

namespace pellar {
namespace {

const std::string localDirectory = "var/lib/pacman/local";
constexpr std::size_t largestFile = 32U << 20U;

/// ".PKGINFO", ".BUILDINFO", ".INSTALL", ".CHANGELOG": the archive's own, never unpacked.
bool isOfArchive(const std::string& path)
{
    return path.empty() || (path.front() == '.' && path.find('/') == std::string::npos);
}

/// One reading of a pacman database.
class PacmanReading {
public:
    explicit PacmanReading(const RootFiles& root)
        : root_(root), temporaryFiles_(temporaryFileRulesOf(root))
    {
    }

    std::optional<References> read(const ReadingProgress& progress)
    {
        const std::vector<std::string> names = root_.names(localDirectory);
        for (const std::string& name : names)
            foreign_.addForeign(scriptsOf(name).value_or(ScriptMentions()));
        double done = 0;
        for (const std::string& name : names) {
            if (!progress(100 * done++ / static_cast<double>(names.size())))
                return std::nullopt;
            if (root_.openFile(localDirectory + '/' + name + "/desc"))
                add(name);
        }
        return std::move(collector_).take();
    }

private:
    std::string text(const std::string& package, const char* file) const
    {
        return root_.read(localDirectory + '/' + package + '/' + file, largestFile).value_or("");
    }

    /// None where there is one that cannot be read: it may concern any file.
    std::optional<ScriptMentions> scriptsOf(const std::string& package) const
    {
        ScriptMentions mentions;
        const FileDescriptor file = root_.openFile(localDirectory + '/' + package + "/install");
        const auto script = file ? contentsOf(file.get(), largestFile) : std::string();
        if (!script)
            return std::nullopt;
        mentions.add(*script, root_.aliases());
        return mentions;
    }

    void add(const std::string& package)
    {
        const FileDescriptor mtree = root_.openFile(localDirectory + '/' + package + "/mtree");
        const auto scripts = scriptsOf(package);
        const PackagedFiles said = !scripts ? PackageFault::BeyondBounds
                                   : mtree  ? readMtree(mtree.get())
                                            : PackageFault::Malformed;
        const auto* const files = said ? &*said : nullptr;
        const bool hasSource = files && !files->empty();
        collector_.countPackage(hasSource);
        if (!hasSource) {
            if (!files && said.error() == PackageFault::BeyondBounds)
                collector_.countBeyondBounds();
            addWithoutSource(text(package, "files"));
            return;
        }
        for (const PackagedFile& file : *files)
            if (!isOfArchive(file.path))
                collector_.add(referenceFor(file, *scripts));
    }

    // %FILES% stands before the paths, and another heading behind them.
    void addWithoutSource(std::string_view list)
    {
        forEachLine(list, [this](std::string_view line) {
            if (!line.empty() && line.front() != '%' && line.back() != '/')
                collector_.addWithoutSource(root_.aliases().canonical(takeField(line, '\t')));
        });
    }

    // The mtree does not tell capabilities; the archive had them, or the script sets them.
    Reference referenceFor(const PackagedFile& file, const ScriptMentions& scripts) const
    {
        Reference reference;
        const bool isLink = file.kind == FileKind::SymbolicLink;
        reference.path = isLink && root_.aliases().isAlias(file.path)
                             ? file.path
                             : root_.aliases().canonical(file.path);
        reference.kind = file.kind;
        reference.mode = file.mode;
        reference.user = file.user.number;
        reference.group = file.group.number;
        reference.digest = file.digest;
        if (scripts.mayConcernOwn(reference.path, file.kind) ||
            foreign_.mayConcernForeign(reference.path))
            reference.doubt = Doubt::Script;
        else if (temporaryFiles_.concern(reference.path))
            reference.doubt = Doubt::TemporaryFiles;
        return reference;
    }

    const RootFiles& root_;
    TemporaryFileRules temporaryFiles_;
    ScriptMentions foreign_;
    ReferenceCollector collector_;
};

}  // namespace

std::optional<References> readPacmanReferences(const RootFiles& root,
                                               const ReadingProgress& progress)
{
    return PacmanReading(root).read(progress);
}

}  // namespace pellar
