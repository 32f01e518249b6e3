// SPDX-License-Identifier: Apache-2.0
#include "orvane/terminal/TextReporter.h"

#include "contract/foundation/UTF8.h"
#include "contract/pellar/MessageKeys.h"
#include "orvane/terminal/ByteCount.h"
#include "orvane/terminal/TerminalText.h"

#include <fmt/format.h>

#include <sys/ioctl.h>
#include <unistd.h>

namespace orvane {
namespace {

constexpr std::chrono::milliseconds redrawInterval{100};

/// A heading that is neither good nor bad and says what it is about: a job's first line.
bool isStartOfRun(const contract::Dictionary& record)
{
    return record.integer(contract::kFsckVerbosity) < 0 && !record.has(contract::kFsckMessageType) &&
           record.has(contract::kFsckMessageString);
}

std::size_t terminalColumns()
{
    winsize size{};
    if (::ioctl(STDOUT_FILENO, TIOCGWINSZ, &size) == 0 && size.ws_col > 1)
        return size.ws_col - 1U;  // the last column stays free: some terminals wrap there
    return 79;
}

}  // namespace

void TextReporter::write(std::string_view text)
{
    if (text.empty())
        return;
    hideProgress();
    std::fwrite(text.data(), 1, text.size(), stdout);
    isAtLineStart_ = text.back() == '\n';
}

void TextReporter::endLine()
{
    if (!isAtLineStart_)
        write("\n");
}

std::string TextReporter::sentence(std::string_view key,
                                   std::initializer_list<contract::FormatArgument> arguments) const
{
    return contract::format(options_.translate(key), arguments);
}

std::string TextReporter::verdictText(std::string_view verdict) const
{
    return options_.translate(verdict.empty() ? "cut off" : verdict);
}

std::string TextReporter::bold(std::string_view text) const
{
    const std::string safe = safeLines(text);
    return options_.colors ? "\x1b[1m" + safe + "\x1b[0m" : safe;
}

void TextReporter::started(const std::string& /*disk*/, std::string_view /*action*/,
                           const std::string& title)
{
    progress_.status = title;
    progress_.percent.reset();
    began_ = Clock::now();
    endLine();
}

void TextReporter::record(const std::string& /*disk*/, const contract::Dictionary& record,
                          const contract::StyledText& text)
{
    if (hasWrittenRows_ && isStartOfRun(record)) {
        endLine();
        write("\n");
    }
    hasWrittenRows_ = true;
    write(terminalText(text, options_.colors));
}

void TextReporter::rowsWritten()
{
    drawProgress();
    flush();
}

void TextReporter::progress(const std::string& /*disk*/, std::optional<double> percent,
                            const std::string& status)
{
    progress_.percent = percent;
    progress_.status = status;
    drawProgress();
}

void TextReporter::drawProgress()
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

void TextReporter::hideProgress()
{
    if (!isProgressShown_)
        return;
    std::fputs("\r\x1b[K", stdout);
    isProgressShown_ = false;
}

// What a person needs to know of these three stands in the log's rows and in the alert.
void TextReporter::finished(const std::string& /*disk*/, std::string_view /*verdict*/,
                            contract::ErrorCode /*error*/, std::string_view /*message*/)
{
    progress_.status.clear();
    hideProgress();
    endLine();
    flush();
}

void TextReporter::report(const std::string& /*disk*/, const contract::Dictionary& /*report*/) {}

void TextReporter::prompt(Prompt state)
{
    if (state == Prompt::Left && isHeldBack_ && options_.showsProgress)
        write("\n");
    isHeldBack_ = state == Prompt::Open;
    hideProgress();
    endLine();
    flush();
}

void TextReporter::alert(const std::string& title, const std::string& message)
{
    endLine();
    write("\n" + bold(title) + "\n" + safeLines(message) + "\n");
}

void TextReporter::failure(const std::string& /*disk*/, const std::string& sentence)
{
    warning(sentence);
}

void TextReporter::warning(const std::string& sentence)
{
    hideProgress();
    endLine();
    flush();
    const std::string line = "fixwell: " + contract::printable(sentence) + "\n";
    std::fwrite(line.data(), 1, line.size(), stderr);
}

void TextReporter::listed(const DiskLine& disk)
{
    const std::string indent = disk.isVolume ? "  " : "";
    std::string facts = byteCount(disk.bytes) + "  " + disk.kind;
    if (!disk.filesystem.empty())
        facts += "  " + disk.filesystem;
    if (!disk.mountPoint.empty())
        facts += "  " + sentence("mounted at %@", {disk.mountPoint});
    write(indent + bold(disk.disk) +
          (disk.name.empty() ? "" : contract::printable("  “" + disk.name + "”")) + "  " +
          contract::printable(facts) + "\n");
    write(indent + "    " +
          (disk.lastChecked.empty()
               ? sentence("never checked", {})
               : sentence("last checked %@: %@", {disk.lastChecked, verdictText(disk.verdict)})) +
          "\n");
    if (disk.later)
        write(indent + "    " +
              sentence("after that, %@: %@",
                       {disk.later->started, verdictText(disk.later->verdict)}) +
              "\n");
    for (const ActionLine& action : disk.actions)
        write(fmt::format(
            "{}    {:<24} {}\n", indent, action.title,
            action.isAvailable ? sentence("available", {}) : contract::printable(action.reason)));
}

void TextReporter::done(const std::string& /*disk*/, std::string_view /*action*/,
                        const std::string& /*place*/, const std::string& sentence)
{
    write(contract::printable(sentence) + "\n");
    flush();
}

void TextReporter::runs(const std::string& disk, const std::vector<RunLine>& runs)
{
    endLine();
    write(bold(disk) + (runs.empty() ? ": " + sentence("never checked", {}) + "\n" : "\n"));
    for (const RunLine& run : runs)
        write(contract::printable(fmt::format("  {}  {:<8} {}", run.started, run.action,
                                             verdictText(run.verdict))) +
              "\n");
    if (!runs.empty())
        write("\n");
}

bool TextReporter::end()
{
    hideProgress();
    endLine();
    return Reporter::end();
}

}  // namespace orvane
