// SPDX-License-Identifier: Apache-2.0
#include "orvane/terminal/Reporter.h"

#include "contract/foundation/Format.h"
#include "contract/foundation/UTF8.h"
#include "contract/pellar/MessageKeys.h"
#include "orvane/support/texts/Quantities.h"
#include "orvane/terminal/TerminalLook.h"
#include "orvane/terminal/TerminalText.h"

#include <fmt/format.h>

#include <chrono>
#include <cstdio>

namespace orvane {
namespace {

constexpr std::chrono::milliseconds redrawInterval{100};

/// A heading without a result, but with a text of its own: a job's first line.
bool isStartOfRun(const contract::Dictionary& record)
{
    return record.integer(contract::kFsckVerbosity) < 0 &&
           !record.has(contract::kFsckMessageType) && record.has(contract::kFsckMessageString);
}

/// On a terminal, where no mark stands beside it, a tool's line that tells of a problem is red.
contract::StyledText coloured(const contract::StyledText& text)
{
    contract::TextStyle style = text.style();
    style.color = contract::Color{1, 0, 0, 1};
    return contract::StyledText::make(text.characters(), style);
}

/// Speaks to people: rows as they come, and on a terminal one live line at the bottom.
class TextReporter final : public Reporter {
public:
    explicit TextReporter(TextReporterOptions options) : options_(std::move(options)) {}
    ~TextReporter() override { hideProgress(); }

    void started(const std::string& /*disk*/, std::string_view /*action*/,
                 const std::string& title) override
    {
        progress_.status = title;
        progress_.percent.reset();
        began_ = Clock::now();
        endLine();
    }

    void record(const std::string& /*disk*/, const contract::Dictionary& record,
                const contract::StyledText& text) override
    {
        if (hasWrittenRows_ && isStartOfRun(record)) {
            endLine();
            write("\n");
        }
        hasWrittenRows_ = true;
        const bool isProblem =
            record.string(contract::kFsckMessageType) == contract::kFsckProblem.text();
        write(terminalText(isProblem ? coloured(text) : text, options_.colors));
    }

    void rowsWritten() override
    {
        drawProgress();
        flush();
    }

    void progress(const std::string& /*disk*/, std::optional<double> percent,
                  const std::string& status) override
    {
        progress_.percent = percent;
        progress_.status = status;
        drawProgress();
    }

    // What a person needs to know of these three stands in the log's rows and in the alert.
    void finished(const std::string& /*disk*/, std::string_view /*verdict*/,
                  contract::ErrorCode /*error*/, std::string_view /*message*/) override
    {
        progress_.status.clear();
        hideProgress();
        endLine();
        flush();
    }

    void prompt(Prompt state) override
    {
        if (state == Prompt::Left && isHeldBack_ && options_.showsProgress)
            write("\n");
        isHeldBack_ = state == Prompt::Open;
        hideProgress();
        endLine();
        flush();
    }

    void alert(const std::string& title, const std::string& message) override
    {
        endLine();
        write("\n" + bold(title) + "\n" + safeLines(message) + "\n");
    }

    void failure(const std::string& /*disk*/, const std::string& sentence) override
    {
        warning(sentence);
    }

    void warning(const std::string& sentence) override
    {
        hideProgress();
        endLine();
        flush();
        writeError(sentence);
    }

    void listed(const DiskLine& disk) override
    {
        const std::string indent = disk.isVolume ? "  " : "";
        std::string facts = byteCount(disk.bytes) + "  " + disk.kind;
        if (!disk.format.empty())
            facts += "  " + disk.format;
        if (!disk.mountPoint.empty())
            facts += "  " + sentence("mounted at %@", {disk.mountPoint});
        const std::string name = disk.name.empty() ? "" : "  " + sentence("“%@”", {disk.name});
        write(indent + bold(disk.disk) + contract::printable(name + "  " + facts) + "\n");
        const auto below = [&](const std::string& text) {
            write(indent + "    " + text + "\n");
        };
        if (disk.lastChecked.empty())
            below(sentence("never checked", {}));
        else
            below(sentence("last checked %@: %@", {disk.lastChecked, verdictText(disk.verdict)}));
        if (disk.later)
            below(sentence("after that, %@: %@",
                           {disk.later->started, verdictText(disk.later->verdict)}));
        if (!disk.nextCheck.empty())
            below(sentence("next check %@", {disk.nextCheck}));
        if (!disk.interruptedRepair.empty())
            below(sentence(disk.isOthersToUndo
                               ? "repair interrupted: who asked for it, or an administrator, can "
                                 "finish or undo it"
                               : "repair interrupted: finish or undo it",
                           {}));
        for (const ActionLine& action : disk.actions)
            below(fmt::format("{:<24} {}", action.title,
                              action.isAvailable ? sentence("available", {})
                                                 : contract::printable(action.reason)));
    }

    void done(const std::string& /*disk*/, std::string_view /*action*/,
              const std::string& /*place*/, const std::string& sentence) override
    {
        write(contract::printable(sentence) + "\n");
        flush();
    }

    void shown(const ModuleView& view) override
    {
        write(bold(view.title) + "\n");
        for (const auto& [name, text] : view.texts)
            if (!text.empty())
                write("\n" + safeLines(text) + (text.ends_with('\n') ? "" : "\n"));
        write(view.buttons.empty() ? "" : "\n");
        for (const ActionLine& button : view.buttons)
            write(contract::printable(
                      fmt::format("--press {:<16} {:<24} {}", button.command, button.title,
                                  button.isAvailable ? sentence("available", {}) : button.reason)) +
                  "\n");
        flush();
    }

    void found(const ModuleLine& module) override
    {
        write(bold(module.name) + "  " + contract::printable(module.path) + "\n");
        if (!module.refusal.empty())
            write("    " + contract::printable(module.refusal) + "\n");
    }

    void runs(const std::string& disk, const std::vector<RunLine>& runs) override
    {
        endLine();
        write(bold(disk) + (runs.empty() ? ": " + sentence("never checked", {}) + "\n" : "\n"));
        for (const RunLine& run : runs)
            write(contract::printable(fmt::format("  {}  {:<8} {}{}", run.started, run.action,
                                                  verdictText(run.verdict), noteOn(run))) +
                  "\n");
        if (!runs.empty())
            write("\n");
    }

    bool end() override
    {
        hideProgress();
        endLine();
        return Reporter::end();
    }

private:
    using Clock = std::chrono::steady_clock;

    void write(std::string_view text)
    {
        if (text.empty())
            return;
        hideProgress();
        std::fwrite(text.data(), 1, text.size(), stdout);
        isAtLineStart_ = text.back() == '\n';
    }

    void endLine()
    {
        if (!isAtLineStart_)
            write("\n");
    }

    void hideProgress()
    {
        if (!isProgressShown_)
            return;
        std::fputs("\r\x1b[K", stdout);
        isProgressShown_ = false;
    }

    void drawProgress()
    {
        const Clock::time_point now = Clock::now();
        const bool isDue = !isProgressShown_ || now - drawn_ >= redrawInterval;
        if (!options_.showsProgress || isHeldBack_ || !isAtLineStart_ || progress_.status.empty() ||
            !isDue)
            return;
        progress_.elapsed = std::chrono::duration_cast<std::chrono::seconds>(now - began_);
        const std::string line = "\r\x1b[K" + progressLine(progress_, terminalColumns());
        std::fwrite(line.data(), 1, line.size(), stdout);
        flush();
        drawn_ = now;
        isProgressShown_ = true;
    }

    std::string bold(std::string_view text) const
    {
        const std::string safe = safeLines(text);
        return options_.colors ? "\x1b[1m" + safe + "\x1b[0m" : safe;
    }

    std::string sentence(std::string_view key,
                         std::initializer_list<contract::FormatArgument> arguments) const
    {
        return contract::format(options_.translate(key), arguments);
    }

    std::string verdictText(std::string_view verdict) const
    {
        return options_.translate(verdict.empty() ? "cut off" : verdict);
    }

    std::string noteOn(const RunLine& run) const
    {
        return run.record.empty() ? "" : "  (" + sentence("can be undone", {}) + ")";
    }

    const TextReporterOptions options_;
    JobProgress progress_;
    Clock::time_point began_ = Clock::now();
    Clock::time_point drawn_{};
    bool isProgressShown_ = false;
    bool isHeldBack_ = false;
    bool isAtLineStart_ = true;
    bool hasWrittenRows_ = false;
};

}  // namespace

std::unique_ptr<Reporter> makeTextReporter(TextReporterOptions options)
{
    return std::make_unique<TextReporter>(std::move(options));
}

}  // namespace orvane
