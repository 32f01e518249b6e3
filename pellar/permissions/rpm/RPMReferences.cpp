// SPDX-License-Identifier: Apache-2.0
#include "pellar/permissions/rpm/RPMReferences.h"

#include "pellar/permissions/ReferenceCollector.h"
#include "pellar/permissions/TemporaryFileRules.h"
#include "pellar/permissions/rpm/RPMFiles.h"

#include <cstring>
#include <utility>

namespace pellar {
namespace {

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

std::variant<References, Sentence> readRPMReferences(const RootDirectory& root,
                                                     const Accounts& accounts,
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
