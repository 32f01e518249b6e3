// SPDX-License-Identifier: Apache-2.0
#include "pellar/jobs/PermissionsScript.h"

#include "contract/foundation/UTF8.h"
#include "contract/pellar/ErrorCodes.h"
#include "pellar/packages/InstalledSystem.h"
#include "pellar/permissions/InstalledReferences.h"
#include "pellar/permissions/PermissionsOutcome.h"

#include <unistd.h>

#include <utility>

namespace pellar {
namespace {

// The module takes a first report of exactly 20 per cent as the news that the database is being
// read, and what follows as running from there to 100.
constexpr double databaseIsRead = 20;
constexpr double databaseWasRead = 60;
constexpr double repairWasTried = 80;

}  // namespace

PermissionsScript::PermissionsScript(contract::DiskReferencePointer disk, Operation operation,
                                     JobContext context)
    : disk_(std::move(disk)),
      // What a repair would set is what a verification tells.
      operation_(context.policy.isPreview ? Operation::Verify : operation),
      context_(std::move(context)),
      fetchesArchives_(context_.options.archiveFetching.isAllowed &&
                       context_.options.archiveFetching.isAllowed())
{
    log_.leaveLinesOpen();
}

void PermissionsScript::run()
{
    log_.started();
    report(carryOut());
}

Outcome PermissionsScript::carryOut()
{
    if (operation_ == Operation::Repair && ::geteuid() != 0)
        return {Verdict::Failed,
                contract::kPLErrorNotAdministrator,
                0,
                {"only an administrator may set permissions", {}, {}}};
    const auto root = RootDirectory::open(disk_->mountPoint);
    if (!root)
        return {Verdict::Failed,
                contract::kPLErrorCannotOpen,
                errno,
                {"the root of the system cannot be opened", {}, {}}};
    tellDatabaseIsRead();
    accounts_ = accountsOf(*root);
    const auto read = readReferences(*root);
    if (!read)
        return outcomeWithoutReferences(read.error());
    return treat(*root, *read);
}

Outcome PermissionsScript::treat(const RootDirectory& root, const References& references)
{
    const bool isRepair = operation_ == Operation::Repair;
    log_.meter().setRange(databaseWasRead, isRepair ? repairWasTried : 100);
    step("Comparing the permissions of the installed files");
    if (isRepair)
        restoring_.emplace(disk_, root, context_);
    auto tally = look(root, references, isRepair ? Pass::Repair : Pass::Verify);
    if (isRepair)
        restoring_->finish();
    if (tally && isRepair && tally->differing > 0) {
        log_.meter().setRange(repairWasTried, 100);
        step("Comparing once more after the repair");
        tally = look(root, references, Pass::Confirm);
    }
    if (!tally)
        return {Verdict::Stopped, contract::kPLErrorCancelled, 0, {}};
    tell(*tally);
    return isRepair ? outcomeOfRepair(*tally) : outcomeOfPermissionsVerification(*tally);
}

Result<References, Sentence> PermissionsScript::readReferences(const RootDirectory& root)
{
    log_.meter().setRange(databaseIsRead, databaseWasRead);
    const ReferenceSources sources{disk_->mountPoint,
                                   context_.options.permissionReferences,
                                   context_.options.toolPath,
                                   context_.options.outputLimits,
                                   [this](std::string line) { log_.trace(std::move(line)); },
                                   [this](std::string line) { log_.remark(std::move(line)); },
                                   fetchesArchives_};
    return readInstalledReferences(root, accounts_, sources, context_.stop, [this](double percent) {
        log_.progress(percent);
        log_.flushIfDue();
        return !context_.stop.isPressed();
    });
}

/// None when it was stopped.
std::optional<Tally> PermissionsScript::look(const RootDirectory& root,
                                             const References& references, Pass pass)
{
    Tally tally;
    tally.withoutSource = references.filesWithoutSource.size();
    tally.packagesBeyondBounds = references.packagesBeyondBounds;
    double done = 0;
    for (const Reference& reference : references.files) {
        if (context_.stop.isPressed())
            return std::nullopt;
        lookAt(root, reference, pass, tally);
        log_.progress(100 * ++done / static_cast<double>(references.files.size()));
        log_.flushIfDue();
    }
    if (pass == Pass::Repair)
        restoring_->carryOut();
    log_.endOfRun();
    return tally;
}

void PermissionsScript::lookAt(const RootDirectory& root, const Reference& reference, Pass pass,
                               Tally& tally)
{
    auto found = inspect(root, reference.path);
    // The same file under another name may be as it should be by then.
    if (found && pass == Pass::Repair && restoring_->isWaiting(*found)) {
        restoring_->carryOut();
        found = inspect(root, reference.path);
    }
    if (!found) {
        tally.count(found.error());
        if (pass != Pass::Confirm)
            tellUnseen(reference, found.error());
        return;
    }
    auto& file = *found;
    const Difference difference = compare(reference, file.permissions);
    const bool isUndecided = reference.doubt != Doubt::None;
    ++(isUndecided ? tally.undecided : tally.compared);
    if (difference.isNone() || (isUndecided && pass == Pass::Confirm))
        return;
    tally.differing += isUndecided ? 0 : 1;
    tell(reference, file, difference);
    if (!isUndecided && !mayBeLentRights(reference, file, tally))
        return;
    if (pass == Pass::Repair && !isUndecided)
        repair(reference, std::move(file));
}

void PermissionsScript::tellUnseen(const Reference& reference, Unseen unseen)
{
    const std::string path = contract::printable(reference.path);
    switch (unseen) {
        case Unseen::Missing: log_.detail(Sentence{"“%1$@” is not there.", path, {}}); break;
        case Unseen::BehindLink:
            log_.detail(
                Sentence{"“%1$@” is behind a symbolic link, which is not followed.", path, {}});
            break;
        case Unseen::Unreadable: log_.detail(Sentence{"“%1$@” cannot be read.", path, {}}); break;
        case Unseen::ElsewhereMounted: break;
    }
}

void PermissionsScript::tell(const Reference& reference, const FoundFile& file,
                             const Difference& difference)
{
    for (const std::string& line :
         linesOf(difference, reference, file.permissions, accounts_, context_.texts)) {
        if (reference.doubt == Doubt::None)
            log_.problem(line);
        else
            log_.detail(Sentence{"Undecided, and never changed: %1$@", line, {}});
    }
}

/// YES also for a file that lends none.
bool PermissionsScript::mayBeLentRights(const Reference& reference, const FoundFile& file,
                                        Tally& tally)
{
    if (file.permissions.kind != FileKind::Regular || !lendsRights(reference))
        return true;
    const Contents contents = contentsOf(file, reference);
    if (contents == Contents::AsPackaged)
        return true;
    ++tally.foreign;
    log_.problem(Sentence{
        contents == Contents::NotAsPackaged
            ? "“%1$@”: its content is not the package's, so a repair does not give it these rights."
            : "“%1$@”: it is not known whether its content is the package's, so a repair does not "
              "give it these rights.",
        contract::printable(reference.path),
        {}});
    return false;
}

void PermissionsScript::repair(const Reference& reference, FoundFile file)
{
    if (!reference.kind || *reference.kind == file.permissions.kind)
        restoring_->add(reference, std::move(file));
}

Outcome PermissionsScript::outcomeOfRepair(const Tally& afterwards) const
{
    Outcome outcome = outcomeOfPermissionsRepair(afterwards, restoring_->restored());
    if (!restoring_->failure().isEmpty() && outcome.verdict == Verdict::Damaged)
        outcome.reason = restoring_->failure();
    return outcome;
}

// The meter keeps away from this very number, so that no other job says it by chance.
void PermissionsScript::tellDatabaseIsRead()
{
    step("Reading what the packages say about their files");
    log_.progressOfJob(databaseIsRead);
    log_.flush();
}

void PermissionsScript::tell(const Tally& tally)
{
    for (const Sentence& sentence : sentencesOf(tally))
        log_.remark(sentence);
    tellWhatIsMissing(tally);
    if (tally.missing > 0)
        log_.detail(
            sentenceAbout(tally.missing, "%1$@ file is not there.", "%1$@ files are not there."));
    if (restoring_ && restoring_->restored() > 0)
        log_.remark(sentenceAbout(restoring_->restored(), "%1$@ file was set right.",
                                  "%1$@ files were set right."));
}

// Only the running system's apt knows where archives come from.
void PermissionsScript::tellWhatIsMissing(const Tally& tally)
{
    const bool canBeFetched =
        disk_->mountPoint == "/" && installedSystemAt("/") == PackageDatabase::Dpkg;
    if (tally.withoutSource > 0 && canBeFetched && !fetchesArchives_ &&
        !context_.options.archiveFetching.howToAllow.empty())
        log_.remark(context_.options.archiveFetching.howToAllow);
}

void PermissionsScript::step(std::string_view key)
{
    log_.step(operation_, {key, {}, {}});
}

void PermissionsScript::report(const Outcome& outcome)
{
    const std::string message =
        permissionsMessageOf(outcome, operation_, log_.diskName(), context_.texts);
    if (outcome.code != contract::kPLNoError && outcome.verdict != Verdict::Stopped)
        log_.failure(asLine(message));
    log_.finished(outcome, message);
}

}  // namespace pellar
