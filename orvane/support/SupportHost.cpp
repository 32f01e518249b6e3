// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/SupportHost.h"

#include "orvane/support/files/WholeFile.h"
#include "orvane/support/texts/Language.h"
#include "orvane/support/texts/TimeEstimator.h"

#include <utility>

namespace orvane {
namespace {

constexpr const char* hostTable = "Orvane";

Translator translatorOf(const ModuleBundle& bundle)
{
    Translator translator;
    translator.text = [&bundle](std::string_view key) {
        return bundle.catalogue().translate(hostTable, key);
    };
    translator.plural = [&bundle](std::string_view one, std::string_view many, long count) {
        return bundle.catalogue().translatePlural(hostTable, one, many, count);
    };
    return translator;
}

}  // namespace

SupportHost::SupportHost(SupportOptions options, EventLoop& loop)
    : options_(std::move(options)),
      loop_(loop),
      bundle_(options_.hostBundle, hostTable),
      translator_(translatorOf(bundle_)),
      // The logs' own trouble cannot go to the log.
      log_({options_.paths.state, options_.keptLogLevel, options_.shownLogLevel, {}},
           [this](const std::string& sentence) {
               if (options_.warn)
                   options_.warn(sentence);
           }),
      settings_(fileIn(options_.paths.config, settingsFileName),
                [this](const std::string& sentence) { warn(sentence); }),
      preferences_(settings_),
      store_(options_.keepsHistory ? fileIn(options_.paths.state, "history.sqlite3") : "",
             options_.historyLimits, [this](const std::string& sentence) { warn(sentence); }),
      histories_(store_),
      disks_(center_, {options_.capabilities, &histories_}),
      images_({options_.capabilities, &histories_}, translator_),
      operations_(loop, translator_),
      threads_(loop)
{
    if (options_.historyCompleted)
        histories_.loadGradually([this] { loadHistoriesLater(); });
    histories_.askForDevices([this](const std::string& uuid) { return devicesWith(uuid); });
    connectDisks();
}

SupportHost::~SupportHost()
{
    *isThere_ = false;
    histories_.saveNew();
}

void SupportHost::connectDisks()
{
    DiskController::Hooks& hooks = disks_.hooks();
    hooks.warn = [this](const std::string& sentence) {
        warn(sentence);
    };
    hooks.mount = [this](const Disk& disk) {
        return start(DiskAction::Mount, disk);
    };
    hooks.eject = [this](const Disk& disk) {
        return start(DiskAction::Eject, disk);
    };
}

// The main thread does not wait for it, not even where a module wishes to: somewhere a user may
// be looking for the password. What fails is told later.
Result<void, Failure> SupportHost::start(DiskAction action, const Disk& disk)
{
    if (isPossible(action, disk))
        operations_.start({requestFor(action, disk)},
                          [this](const std::vector<std::string>& failures) {
                              for (const std::string& failure : failures)
                                  warn(failure);
                          });
    return {};
}

std::vector<std::string> SupportHost::devicesWith(const std::string& uuid) const
{
    std::vector<std::string> devices;
    for (const auto& root : disks_.roots())
        for (const auto& disk : withParts(root))
            if (disk->facts().uuid == uuid &&
                disk->facts().storage == contract::DiskReference::Storage::BlockDevice)
                devices.push_back(disk->facts().identifier);
    return devices;
}

void SupportHost::loadHistoriesLater()
{
    loop_.scheduleTimer(std::chrono::duration<double>(0), [this, isThere = isThere_] {
        if (*isThere)
            loadHistories();
    });
}

void SupportHost::loadHistories()
{
    const DiskHistories::Progress progress = histories_.loadMore();
    if (progress == DiskHistories::Progress::Completed)
        options_.historyCompleted();
    if (progress != DiskHistories::Progress::Nothing)
        loadHistoriesLater();
}

void SupportHost::warn(const std::string& sentence)
{
    log_.ov_log(contract::OVLog::error, 0, sentence);
    if (options_.warn)
        options_.warn(sentence);
}

std::unique_ptr<contract::OVTimeEstimator> SupportHost::makeTimeEstimator()
{
    return std::make_unique<TimeEstimator>([] { return std::chrono::system_clock::now(); },
                                           translator_);
}

std::string SupportHost::OVLocalizedErrorString(contract::ErrorCode code)
{
    std::string text = options_.errorText ? options_.errorText(code) : std::string();
    return text.empty() ? translator_.sentence("error %ld", {code}) : text;
}

std::string SupportHost::decimalString(const contract::Value& number)
{
    return decimalText(number, currentLanguage());
}

void SupportHost::refreshDisks()
{
    DiskSources sources;
    sources.homeDirectory = environmentValue("HOME").value_or("");
    disks_.synchronize(reader_.read(sources));
}

}  // namespace orvane
