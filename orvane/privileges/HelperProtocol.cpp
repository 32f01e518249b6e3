// SPDX-License-Identifier: Apache-2.0
#include "orvane/privileges/HelperProtocol.h"

#include "orvane/privileges/CheckedText.h"
#include "orvane/support/settings/ValueJSON.h"

#include <algorithm>
#include <array>
#include <limits>
#include <optional>
#include <span>
#include <string_view>

namespace orvane {
namespace {

using pellar::Subject;
using pellar::Task;
using Arguments = std::span<const std::string>;
using Read = pellar::Result<HelperRequest, const char*>;

// attach-OPERATION DESCRIPTOR OFFSET LENGTH, for a region of an image.
constexpr std::string_view attaching = "attach-";

// What may come after the texts, in this order.

constexpr std::string_view fetching = "--fetch-archives";

struct PolicyOption {
    std::string_view option;
    bool pellar::RepairPolicy::*isSo;
    bool value;
};

constexpr std::array policyOptions{
    PolicyOption{"--direct", &pellar::RepairPolicy::isDirect, true},
    PolicyOption{"--preview", &pellar::RepairPolicy::isPreview, true},
    PolicyOption{"--apply-unproven", &pellar::RepairPolicy::appliesUnproven, true},
    PolicyOption{"--no-undo", &pellar::RepairPolicy::keepsUndo, false},
    PolicyOption{"--thorough", &pellar::RepairPolicy::isThorough, true}};

/// Whether it means something to a task.
bool isFor(const PolicyOption& option, Task task)
{
    if (task.subject == Subject::Permissions || task.isUndo())
        return false;
    return task.isRepair() || option.isSo == &pellar::RepairPolicy::isThorough;
}

/// A preview writes nothing; what is said of writing does not go with it.
bool contradictsItself(const pellar::RepairPolicy& policy)
{
    return (policy.isPreview && (policy.isDirect || policy.appliesUnproven || !policy.keepsUndo)) ||
           (policy.isDirect && policy.appliesUnproven);
}

constexpr std::size_t longestName = 1024;
constexpr std::size_t longestLanguages = 64;
constexpr std::string_view languageSigns = "_-@.";

// Canonical, so that no link of another user's is followed as root.
bool isCanonicalDevice(const std::string& path)
{
    return path.starts_with("/dev/") && path.find("//") == std::string::npos &&
           path.find("/./") == std::string::npos && path.find("/../") == std::string::npos &&
           !path.ends_with('/') && !path.ends_with("/..") && !path.ends_with("/.");
}

/// Each option once at most, in their order.
bool readOptions(HelperRequest& request, Arguments options)
{
    const auto isNext = [&options](std::string_view option) {
        const bool isIt = !options.empty() && options.front() == option;
        options = options.subspan(isIt ? 1 : 0);
        return isIt;
    };
    request.fetchesArchives = request.task.subject == Subject::Permissions && isNext(fetching);
    for (const PolicyOption& option : policyOptions)
        if (isFor(option, request.task) && isNext(option.option))
            request.policy.*option.isSo = option.value;
    return options.empty() && !contradictsItself(request.policy);
}

/// IDENTIFIER NAME FILESYSTEM LANGUAGES OPTION...
Read withTexts(HelperRequest request, Arguments arguments)
{
    constexpr std::size_t textCount = 4;
    if (arguments.size() < textCount)
        return "wrong number of arguments";
    const Arguments texts = arguments.first(textCount);
    if (!readOptions(request, arguments.subspan(textCount)))
        return "an option that there is not, or that does not go with the others";
    if (texts[0].size() > longestName || texts[1].size() > longestName)
        return "a name is too long";
    if (!consistsOf(texts[2], "_-+.", 64) ||
        !consistsOf(texts[3], std::string(languageSigns) + ':', longestLanguages))
        return "a name of a file system or language holds what none does";
    request.disk.identifier = texts[0];
    request.disk.name = texts[1];
    request.disk.filesystem = texts[2];
    request.languages = texts[3];
    return request;
}

Read readRegion(Arguments arguments)
{
    constexpr std::uint64_t largest = std::numeric_limits<std::int64_t>::max();
    if (arguments.size() < 4)
        return "wrong number of arguments";
    const auto task = pellar::taskNamed(std::string_view(arguments[0]).substr(attaching.size()));
    if (!task || task->subject != Subject::Filesystem || task->isUndo())
        return "unknown operation";
    const auto image = numberIn<int>(arguments[1]);
    const auto offset = numberIn<std::uint64_t>(arguments[2]);
    const auto length = numberIn<std::uint64_t>(arguments[3]);
    if (!image || *image < 0 || !offset || *offset > largest || !length || *length == 0 ||
        *length > largest - *offset)
        return "no region of a file";
    HelperRequest request{.task = *task, .image = *image};
    request.disk.storage = contract::DiskReference::Storage::FileRegion;
    request.disk.offset = *offset;
    request.disk.length = *length;
    return withTexts(std::move(request), arguments.subspan(4));
}

/// Those of a list that the helper takes, as many as it takes. The rest is left out: a user's
/// LANGUAGE can hold anything.
std::string acceptedLanguages(std::string_view list)
{
    std::string accepted;
    while (!list.empty()) {
        const std::string_view language = list.substr(0, list.find(':'));
        list.remove_prefix(std::min(language.size() + 1, list.size()));
        const std::size_t room = longestLanguages - accepted.size();
        if (language.empty() || language.size() + 1 > room ||
            !consistsOf(language, languageSigns, longestLanguages))
            continue;
        if (!accepted.empty())
            accepted += ':';
        accepted += language;
    }
    return accepted;
}

using nlohmann::json;

json jsonFromText(const std::string& text)
{
    return jsonFromValue(contract::Value(std::string_view(text)));
}

json jsonFromDictionary(const contract::Dictionary& dictionary)
{
    return dictionary ? jsonFromValue(contract::Value(dictionary)) : json();
}

struct EventWriter {
    json operator()(const pellar::Started&) const { return json::array({"started"}); }
    json operator()(const pellar::Message& message) const
    {
        return json::array(
            {"message", jsonFromText(message.text), jsonFromDictionary(message.dictionary)});
    }
    json operator()(const pellar::Trace& trace) const
    {
        return json::array({"trace", jsonFromText(trace.line)});
    }
    json operator()(const pellar::Finished& finished) const
    {
        return json::array({"finished", finished.mainError, finished.detailError,
                            jsonFromDictionary(finished.result)});
    }
};

std::string textFromJSON(const json& part)
{
    return std::string(valueFromJSON(part).string());
}

std::optional<pellar::Event> eventFromJSON(const json& parts)
{
    const auto& kind = parts.at(0).get_ref<const std::string&>();
    if (kind == "started")
        return pellar::Started{};
    if (kind == "message")
        return pellar::Message{textFromJSON(parts.at(1)), valueFromJSON(parts.at(2)).dictionary()};
    if (kind == "trace")
        return pellar::Trace{textFromJSON(parts.at(1))};
    if (kind == "finished")
        return pellar::Finished{parts.at(1).get<std::int32_t>(), parts.at(2).get<std::int32_t>(),
                                valueFromJSON(parts.at(3)).dictionary()};
    return std::nullopt;
}

constexpr std::string_view adviceType = "ADVICE";

std::string_view attemptOf(const HelperRequest& request)
{
    const bool isRepair = request.task.isRepair();
    if (request.task.isUndo())
        return request.task.operation == pellar::Operation::Undo
                   ? "cannot undo the repair of “%1$@”: %2$@"
                   : "cannot finish the repair of “%1$@”: %2$@";
    if (request.task.subject == Subject::Permissions)
        return isRepair ? "cannot repair the permissions on “%1$@”: %2$@"
                        : "cannot verify the permissions on “%1$@”: %2$@";
    if (request.task.subject == Subject::PartitionMap)
        return isRepair ? "cannot repair the partition map of “%1$@”: %2$@"
                        : "cannot verify the partition map of “%1$@”: %2$@";
    return isRepair ? "cannot repair “%1$@”: %2$@" : "cannot verify “%1$@”: %2$@";
}

}  // namespace

HelperRequest requestFor(const pellar::PrivilegedJob& job, const std::string& languages)
{
    HelperRequest request{.task = job.task,
                          .disk = job.disk,
                          .languages = acceptedLanguages(languages),
                          .fetchesArchives = job.fetchesArchives,
                          .policy = job.policy};
    if (!job.image) {
        request.identity = identityOf(job.disk.path);
        return request;
    }
    request.image = job.image->descriptor();
    request.disk.path.clear();
    request.disk.offset = job.image->offset();
    request.disk.length = job.image->availableBytes();
    return request;
}

std::vector<std::string> argumentsOf(const HelperRequest& request)
{
    const contract::DiskReference& disk = request.disk;
    std::vector<std::string> arguments;
    if (request.isOnImage())
        arguments = {std::string(attaching) + std::string(nameOf(request.task)),
                     std::to_string(request.image), std::to_string(disk.offset),
                     std::to_string(disk.length)};
    else
        arguments = {std::string(nameOf(request.task)), disk.path.native(),
                     request.identity.text()};
    for (const std::string& text :
         {disk.identifier.substr(0, longestName), disk.name.substr(0, longestName), disk.filesystem,
          request.languages})
        arguments.push_back(text);
    if (request.fetchesArchives)
        arguments.emplace_back(fetching);
    for (const PolicyOption& option : policyOptions)
        if (isFor(option, request.task) && request.policy.*option.isSo == option.value)
            arguments.emplace_back(option.option);
    return arguments;
}

Read readHelperArguments(const std::vector<std::string>& arguments,
                         const std::function<bool(const std::filesystem::path&)>& isBlockDevice)
{
    if (arguments.size() < 3)
        return "wrong number of arguments";
    if (arguments[0].starts_with(attaching))
        return readRegion(arguments);
    // Permissions are verified without the helper.
    const auto task = pellar::taskNamed(arguments[0]);
    if (!task || *task == Task{Subject::Permissions, pellar::Operation::Verify})
        return "unknown operation";
    if (!isCanonicalDevice(arguments[1]) || !isBlockDevice(arguments[1]))
        return "not a block device below /dev";
    const auto identity = DiskIdentity::fromText(arguments[2]);
    if (!identity)
        return "it is not said which disk is meant";
    HelperRequest request{.task = *task, .identity = *identity};
    request.disk.path = arguments[1];
    request.disk.isWhole = task->subject == Subject::PartitionMap;
    return withTexts(std::move(request), Arguments(arguments).subspan(3));
}

std::string lineFromEvent(const pellar::Event& event)
{
    return std::visit(EventWriter{}, event).dump();
}

std::optional<pellar::Event> eventFromLine(std::string_view line)
{
    const json parts = parsedJSON(line);
    if (!parts.is_array() || parts.empty())
        return std::nullopt;
    try {
        return eventFromJSON(parts);
    } catch (const json::exception&) {
        return std::nullopt;
    }
}

pellar::Message messageOf(Advice advice)
{
    return {{},
            contract::Dictionary::of({{contract::kFsckMessageType, adviceType},
                                      {contract::kFsckVerbosity, static_cast<int>(advice)}})};
}

std::optional<Advice> adviceIn(const pellar::Event& event)
{
    const auto* const message = std::get_if<pellar::Message>(&event);
    if (message == nullptr || !message->dictionary ||
        message->dictionary.string(contract::kFsckMessageType) != adviceType)
        return std::nullopt;
    const auto number = message->dictionary.integer(contract::kFsckVerbosity);
    const bool isKnown = number >= 0 && number <= static_cast<int>(Advice::RepairDirectly);
    return isKnown ? std::optional(static_cast<Advice>(number)) : std::nullopt;
}

void reportFailure(const JobFailure& failure, const HelperRequest& request,
                   const pellar::Texts& texts, pellar::JobLog& log)
{
    const std::string message =
        pellar::Sentence{attemptOf(request), log.diskName(), failure.reason.in(texts)}.in(texts);
    log.failure(message);
    log.finished(failure.error, 0, failure.verdict, message);
}

}  // namespace orvane
