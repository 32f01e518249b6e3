// SPDX-License-Identifier: Apache-2.0
#include "pellar/packages/RPMReferences.h"

#include "pellar/bytes/Digest.h"
#include "pellar/packages/Permissions.h"
#include "pellar/packages/Reference.h"
#include "pellar/packages/TemporaryFileRules.h"
#include "pellar/packages/TextLines.h"
#include "pellar/process/ReducedRights.h"

#include <fcntl.h>
#include <unistd.h>

#include <charconv>
#include <cstring>
#include <utility>

namespace pellar {
namespace {

template <class Number>
std::optional<Number> numberIn(std::string_view text, int base)
{
    Number number = 0;
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number, base);
    if (text.empty() || error != std::errc() || end != text.data() + text.size())
        return std::nullopt;
    return number;
}

// rpm's rpmvf.h and rpmfi.h: the bits of FILEVERIFYFLAGS that ask for the owner, the group, the
// mode and the capabilities to be verified, and that of FILEFLAGS for a file that the package
// names without bringing it.
constexpr std::uint32_t verifiesAll = 1U << 3U | 1U << 4U | 1U << 6U;
constexpr std::uint32_t isGhost = 1U << 6U;

bool setOwners(Reference& reference, const std::string& user, const std::string& group,
               const Accounts& accounts)
{
    const auto userNumber = accounts.users.numberOf(user);
    const auto groupNumber = accounts.groups.numberOf(group);
    reference.user = userNumber.value_or(0);
    reference.group = groupNumber.value_or(0);
    return userNumber && groupNumber;
}

// The largest known have 400 million bytes.
constexpr CopyBounds boundsOfDatabase{2ULL << 30U, 8ULL << 30U};

// SQLite makes its shared memory anew, and a lock is of no use in a copy.
bool isCopied(const std::string& name)
{
    return !name.starts_with('.') && !name.ends_with("-shm") && !name.starts_with("__db.");
}

Sentence sentenceFor(Copying copying)
{
    switch (copying) {
        case Copying::Stopped: return {};
        case Copying::BeyondBounds:
            return {"the package database is larger than any system's is; it was not read", {}, {}};
        case Copying::Failed:
        case Copying::Done: break;
    }
    return {"the package database cannot be copied to be read", {}, {}};
}

/// Marks the line with which each package begins; no line about a file looks like it.
constexpr std::string_view packageLine = "package\t";

Command commandFor(const RPMQuery& query)
{
    return {query.program,
            {"--dbpath", query.database.native(), "--nosignature", "--nodigest", "-qa",
             "--queryformat", std::string(packageLine) + "%{NAME}\n" + std::string(rpmFileFormat)},
            true,
            query.database};
}

/// Takes rpm's answer as it comes.
class AnswerReader final : public RunListener {
public:
    AnswerReader(const RootDirectory& root, const Accounts& accounts)
        : aliases_(root.aliases()), accounts_(accounts), temporaryFiles_(temporaryFileRulesOf(root))
    {
    }

    void line(std::string_view line, bool isCut) override
    {
        if (line.starts_with(packageLine)) {
            collector_.countPackage(true);
            return;
        }
        RPMFile file = isCut ? RPMFile() : parseRPMFile(line, accounts_, aliases_);
        constexpr std::uint64_t mostMalformed = 1'000'000;
        if (file.line == RPMLine::Malformed && malformed_ < mostMalformed)
            ++malformed_;
        if (file.line != RPMLine::File)
            return;
        if (file.reference.doubt == Doubt::None && temporaryFiles_.concern(file.reference.path))
            file.reference.doubt = Doubt::TemporaryFiles;
        collector_.add(std::move(file.reference));
    }
    void progressLine(std::string_view) override {}
    void lineLimitReached() override {}
    void pause() override {}
    void tick() override {}

    std::uint64_t malformed() const { return malformed_; }
    References take() { return std::move(collector_).take(); }

private:
    const PathAliases& aliases_;
    const Accounts& accounts_;
    TemporaryFileRules temporaryFiles_;
    ReferenceCollector collector_;
    std::uint64_t malformed_ = 0;
};

// Half an answer would pass for a whole one, so anything but a good end is a failure.
std::optional<Sentence> objection(const RunResult& result)
{
    if (result.cause == StopCause::User)
        return Sentence{};
    if (const auto* const failure = std::get_if<NotStarted>(&result.ending))
        return Sentence{"%1$@ could not be started: %2$@", "rpm", std::strerror(failure->error)};
    if (const auto* const killed = std::get_if<Killed>(&result.ending))
        return Sentence{"%1$@ crashed (signal %2$@)", "rpm", std::to_string(killed->signal)};
    const int status = std::get<Exited>(result.ending).status;
    if (status != 0)
        return Sentence{"%1$@ could not do its work (exit status %2$@)", "rpm",
                        std::to_string(status)};
    return std::nullopt;
}

}  // namespace

// 100755\t0\t4294967295\t0\troot\troot\tcap_net_raw=ep\t9b1f…\t/usr/bin/ping
RPMFile parseRPMFile(std::string_view line, const Accounts& accounts, const PathAliases& aliases)
{
    const auto mode = numberIn<std::uint32_t>(takeField(line, '\t'), 8);
    const auto state = numberIn<std::int32_t>(takeField(line, '\t'), 10);
    const auto verified = numberIn<std::uint32_t>(takeField(line, '\t'), 10);
    const auto flags = numberIn<std::uint32_t>(takeField(line, '\t'), 10);
    const std::string user(takeField(line, '\t'));
    const std::string group(takeField(line, '\t'));
    const std::string capabilities(takeField(line, '\t'));
    const std::string digest(takeField(line, '\t'));
    if (!mode || !state || !verified || !flags || !line.starts_with('/'))
        return {};
    if (*state != 0)  // RPMFILE_STATE_NORMAL
        return {RPMLine::NotInstalled, {}};
    Reference reference;
    const bool isLink = kindOf(*mode) == FileKind::SymbolicLink;
    const std::string path = withoutSlashes(line);
    reference.path = isLink && aliases.isAlias(path) ? path : aliases.canonical(path);
    reference.kind = kindOf(*mode);
    reference.mode = *mode & 07777U;
    reference.capabilities =
        canonicalCapabilities(capabilities == "(none)" ? std::string() : capabilities);
    if (kindOfDigest(digest))
        reference.digest = digest;
    if (!setOwners(reference, user, group, accounts))
        reference.doubt = Doubt::UnknownAccount;
    else if ((*verified & verifiesAll) != verifiesAll || (*flags & isGhost) != 0)
        reference.doubt = Doubt::NotVerified;
    return {RPMLine::File, std::move(reference)};
}

Result<TemporaryDirectory, Sentence> copyDatabase(const RootFiles& root,
                                                  const std::string& database,
                                                  const StopSwitch& stop)
{
    auto made = TemporaryDirectory::make("rpmdb");
    if (!made)
        return sentenceFor(Copying::Failed);
    CopyBounds bounds = boundsOfDatabase;
    for (const std::string& file : root.names(database)) {
        const FileDescriptor from = root.openFile(database + '/' + file);
        if (!from || !isCopied(file))
            continue;
        const FileDescriptor to(
            ::open((made->path() / file).c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0600));
        const Copying copying = to ? copyFile(from.get(), to.get(), bounds, stop) : Copying::Failed;
        if (copying != Copying::Done)
            return sentenceFor(copying);
    }
    if (::geteuid() == 0 && !made->giveTo(userOfReduced, groupOfReduced))
        return sentenceFor(Copying::Failed);
    return *std::move(made);
}

Result<References, Sentence> readRPMReferences(const RootDirectory& root, const Accounts& accounts,
                                               const RPMQuery& query, StopSwitch& stop)
{
    AnswerReader reader(root, accounts);
    RunRequest request;
    request.command = commandFor(query);
    request.limits = query.limits;
    request.graceTimes = graceTimesFor(Access::ReadOnly);
    if (query.trace)
        query.trace(shown(request.command));
    if (const auto reason = objection(runTool(request, stop, reader)))
        return *reason;
    References references = reader.take();
    for (std::uint64_t i = 0; i < reader.malformed(); ++i)
        references.filesWithoutSource.emplace_back();  // a line that names no file
    return references;
}

}  // namespace pellar
