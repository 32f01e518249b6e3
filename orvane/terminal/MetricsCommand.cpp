// SPDX-License-Identifier: Apache-2.0
#include "orvane/jobs/Metrics.h"
#include "orvane/support/ProgramStart.h"
#include "orvane/support/files/WholeFile.h"
#include "orvane/terminal/Commands.h"

#include <algorithm>
#include <cstdio>
#include <set>
#include <system_error>

namespace orvane {
namespace {

/// Puts together what this user's histories and the published checks know.
class Measuring {
public:
    explicit Measuring(Session& session) : session_(session) {}

    void add(const Disk& disk)
    {
        const DiskFacts& facts = disk.facts();
        const std::string key = session_.host().histories().keyOf(facts);
        MeasuredDisk measured{facts.identifier, facts.uuid, facts.label,
                              session_.host().historyStore().runs(key)};
        const auto published = session_.publishedChecks().find(key);
        if (published != session_.publishedChecks().end())
            add(published->second, measured);
        if (told_.insert(key).second)
            all_.push_back(std::move(measured));
    }

    // A volume that was found damaged does not get better by going away.
    void addThoseThatAreGone()
    {
        for (const auto& [key, check] : session_.publishedChecks()) {
            if (!told_.insert(key).second)
                continue;
            MeasuredDisk measured{check.device, check.uuid, {}};
            add(check, measured);
            all_.push_back(std::move(measured));
        }
    }

    const std::vector<MeasuredDisk>& all() const { return all_; }

private:
    static void add(const PublishedCheck& check, MeasuredDisk& measured)
    {
        measured.skipped = check.skipped;
        if (!check.run)
            return;
        const auto newer = std::ranges::find_if(
            measured.runs, [&](const Run& run) { return run.started >= check.run->started; });
        if (newer == measured.runs.end() || newer->started != check.run->started)
            measured.runs.insert(newer, *check.run);
    }

    Session& session_;
    std::set<std::string> told_;
    std::vector<MeasuredDisk> all_;
};

void measureNamed(const NamedDisk& named, Session& session, Measuring& measuring)
{
    const AttachedImage image(session, named.disk);
    for (const std::shared_ptr<Disk>& disk : withParts(image.top() ? image.top() : named.disk))
        measuring.add(*disk);
}

}  // namespace

int runMetrics(const Request& request, Session& session, Reporter& reporter)
{
    std::error_code error;
    if (request.needsNoDirectory &&
        !std::filesystem::is_directory(request.output.parent_path(), error))
        return exitSound;
    int status = 0;
    Measuring measuring(session);
    for (const NamedDisk& named : session.findDisks(request.disks, status))
        measureNamed(named, session, measuring);
    if (request.disks.empty()) {
        session.host().refreshDisks();
        for (const std::shared_ptr<Disk>& root : session.host().sharedDiskController().roots())
            for (const std::shared_ptr<Disk>& disk : withParts(root))
                measuring.add(*disk);
        measuring.addThoseThatAreGone();
    }
    const std::string text = expositionOf(measuring.all(), programVersion());
    if (request.output.empty()) {
        std::fwrite(text.data(), 1, text.size(), stdout);
    } else if (const auto written = replacePublicFile(request.output, text); !written) {
        reporter.failure(request.output.native(), written.error().message);
        status |= exitUnchecked;
    }
    return status;
}

}  // namespace orvane
