// SPDX-License-Identifier: Apache-2.0
#include "orvane/terminal/Reporter.h"

#include "contract/pellar/MessageKeys.h"

#include <nlohmann/json.hpp>

#include <cmath>
#include <cstdio>

namespace orvane {
namespace {

using nlohmann::ordered_json;

/// A step of this size is worth a line.
constexpr double percentStep = 0.5;

ordered_json jsonOf(const contract::Value& value)
{
    switch (value.kind()) {
        case contract::Kind::Boolean: return value.boolean();
        case contract::Kind::Integer: return value.integer();
        case contract::Kind::Real: return value.real();
        case contract::Kind::None: return nullptr;
        default: return value.description();
    }
}

ordered_json textOrNull(std::string_view text)
{
    return text.empty() ? ordered_json(nullptr) : ordered_json(std::string(text));
}

/// Speaks to other programs: one JSON object (RFC 8259) per line of standard output, each with an
/// "event". Bytes that are no UTF-8 become U+FFFD.
class JSONReporter final : public Reporter {
public:
    void started(const std::string& disk, std::string_view action,
                 const std::string& title) override
    {
        write({{"event", "started"}, {"disk", disk}, {"action", action}, {"title", title}});
        flush();
        shownPercent_.reset();
    }

    void record(const std::string& disk, const contract::Dictionary& record,
                const contract::StyledText& text) override
    {
        write({{"event", "record"},
               {"disk", disk},
               {"type", textOrNull(record.string(contract::kFsckMessageType))},
               {"verbosity", record.integer(contract::kFsckVerbosity)},
               {"text", std::string(text.characters())}});
    }

    void rowsWritten() override { flush(); }

    void progress(const std::string& disk, std::optional<double> percent,
                  const std::string& status) override
    {
        const bool hasMoved =
            percent && (!shownPercent_ || std::abs(*percent - *shownPercent_) >= percentStep);
        if (!hasMoved && status == shownStatus_)
            return;
        shownPercent_ = percent;
        shownStatus_ = status;
        write({{"event", "progress"},
               {"disk", disk},
               {"percent", percent ? ordered_json(std::round(*percent * 10) / 10) : ordered_json()},
               {"status", status}});
        flush();
    }

    void finished(const std::string& disk, std::string_view verdict, contract::ErrorCode error,
                  std::string_view message) override
    {
        write({{"event", "finished"},
               {"disk", disk},
               {"verdict", verdict},
               {"error", error},
               {"message", std::string(message)}});
        flush();
    }

    void report(const std::string& disk, const contract::Dictionary& report) override
    {
        ordered_json event{{"event", "report"}};
        for (const auto& [key, value] : report.entries())
            event[std::string(key.text())] =
                value.kind() == contract::Kind::Object ? ordered_json(disk) : jsonOf(value);
        write(event);
    }

    void alert(const std::string& title, const std::string& message) override
    {
        write({{"event", "alert"}, {"title", title}, {"message", message}});
    }

    // A disk that never came to a job is finished all the same, so that a reader waits for nothing.
    void failure(const std::string& disk, const std::string& sentence) override
    {
        finished(disk, contract::kPLVerdictFailed.text(), contract::kPLErrorCannotOpen, sentence);
    }

    // Standard output is for events.
    void warning(const std::string& sentence) override { writeError(sentence); }

    void listed(const DiskLine& disk) override
    {
        ordered_json actions = ordered_json::object();
        for (const ActionLine& action : disk.actions)
            actions[action.command] = {{"available", action.isAvailable},
                                       {"reason", textOrNull(action.reason)}};
        write({{"event", "disk"},
               {"disk", disk.disk},
               {"name", disk.name},
               {"kind", disk.kind},
               {"bytes", disk.bytes},
               {"filesystem", textOrNull(disk.filesystem)},
               {"mountPoint", textOrNull(disk.mountPoint)},
               {"lastChecked", textOrNull(disk.lastChecked)},
               {"verdict", textOrNull(disk.verdict)},
               {"laterAttempt", disk.later
                                    ? ordered_json{{"started", disk.later->started},
                                                   {"verdict", textOrNull(disk.later->verdict)}}
                                    : ordered_json(nullptr)},
               {"nextCheck", textOrNull(disk.nextCheck)},
               {"interruptedRepair", textOrNull(disk.interruptedRepair)},
               {"actions", actions}});
    }

    void done(const std::string& disk, std::string_view action, const std::string& place,
              const std::string& sentence) override
    {
        write({{"event", "done"},
               {"disk", disk},
               {"action", action},
               {"place", textOrNull(place)},
               {"message", sentence}});
        flush();
    }

    void shown(const ModuleView& view) override
    {
        ordered_json texts = ordered_json::object();
        for (const auto& [name, text] : view.texts)
            texts[name] = text;
        ordered_json buttons = ordered_json::object();
        for (const ActionLine& button : view.buttons)
            buttons[button.command] = {{"title", button.title},
                                       {"available", button.isAvailable},
                                       {"reason", textOrNull(button.reason)}};
        write(
            {{"event", "shown"}, {"module", view.module}, {"texts", texts}, {"buttons", buttons}});
        flush();
    }

    void found(const ModuleLine& module) override
    {
        write({{"event", "module"},
               {"module", module.name},
               {"path", module.path},
               {"refusal", textOrNull(module.refusal)}});
    }

    void runs(const std::string& disk, const std::vector<RunLine>& runs) override
    {
        for (const RunLine& run : runs)
            write({{"event", "run"},
                   {"disk", disk},
                   {"started", run.started},
                   {"action", run.action},
                   {"verdict", textOrNull(run.verdict)},
                   {"message", textOrNull(run.message)},
                   {"record", textOrNull(run.record)}});
    }

private:
    static void write(const ordered_json& event)
    {
        const std::string line =
            event.dump(-1, ' ', false, ordered_json::error_handler_t::replace) + "\n";
        std::fwrite(line.data(), 1, line.size(), stdout);
    }

    std::optional<double> shownPercent_;
    std::string shownStatus_;
};

}  // namespace

std::unique_ptr<Reporter> makeJSONReporter()
{
    return std::make_unique<JSONReporter>();
}

}  // namespace orvane
