// SPDX-License-Identifier: Apache-2.0
#include "orvane/privileges/HelperRequest.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <limits>
#include <optional>
#include <span>
#include <string_view>

namespace orvane {
namespace {

using pellar::Operation;
using pellar::Subject;
using Arguments = std::span<const std::string>;
using Read = std::variant<HelperRequest, std::string>;

struct Task {
    std::string_view word;
    Subject subject;
    Operation operation;
};

// Permissions are verified without the helper.
constexpr std::array tasks{Task{"verify", Subject::Filesystem, Operation::Verify},
                           Task{"repair", Subject::Filesystem, Operation::Repair},
                           Task{"verify-map", Subject::PartitionMap, Operation::Verify},
                           Task{"repair-map", Subject::PartitionMap, Operation::Repair},
                           Task{"repair-permissions", Subject::Permissions, Operation::Repair}};

// attach-OPERATION DESCRIPTOR OFFSET LENGTH, for a region of an image.
constexpr std::string_view attaching = "attach-";

// Comes last, for permissions.
constexpr std::string_view fetching = "--fetch-archives";

constexpr std::size_t longestName = 1024;
constexpr std::size_t longestLanguages = 64;
constexpr std::string_view languageSigns = "_-@.";

const Task* taskNamed(std::string_view word)
{
    const auto* const found = std::find_if(
        tasks.begin(), tasks.end(), [&](const Task& candidate) { return candidate.word == word; });
    return found == tasks.end() ? nullptr : found;
}

const Task* taskOf(const HelperRequest& request)
{
    return std::find_if(tasks.begin(), tasks.end(), [&](const Task& candidate) {
        return candidate.subject == request.subject && candidate.operation == request.operation;
    });
}

bool consistsOf(std::string_view text, std::string_view allowed, std::size_t longest)
{
    const auto isAllowed = [allowed](char character) {
        const bool isLetter = (character >= 'a' && character <= 'z') ||
                              (character >= 'A' && character <= 'Z') ||
                              (character >= '0' && character <= '9');
        return isLetter || allowed.find(character) != std::string_view::npos;
    };
    return text.size() <= longest && std::all_of(text.begin(), text.end(), isAllowed);
}

// Canonical, so that no link of another user's is followed as root.
bool isCanonicalDevice(const std::string& path)
{
    return path.starts_with("/dev/") && path.find("//") == std::string::npos &&
           path.find("/./") == std::string::npos && path.find("/../") == std::string::npos &&
           !path.ends_with('/') && !path.ends_with("/..") && !path.ends_with("/.");
}

/// Digits and nothing else, at most `largest`.
std::optional<std::uint64_t> numberIn(const std::string& text, std::uint64_t largest)
{
    std::uint64_t number = 0;
    const char* const end = text.data() + text.size();
    const auto [rest, error] = std::from_chars(text.data(), end, number);
    const bool isNumber = error == std::errc() && rest == end;
    return isNumber && number <= largest ? std::optional(number) : std::nullopt;
}

/// IDENTIFIER NAME FILESYSTEM LANGUAGES
Read withTexts(HelperRequest request, Arguments texts)
{
    if (texts.size() != 4)
        return "wrong number of arguments";
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
    const Task* const task = taskNamed(std::string_view(arguments[0]).substr(attaching.size()));
    if (task == nullptr || task->subject != Subject::Filesystem)
        return "unknown operation";
    const auto image = numberIn(arguments[1], std::numeric_limits<int>::max());
    const auto offset = numberIn(arguments[2], largest);
    const auto length = numberIn(arguments[3], largest);
    if (!image || !offset || !length || *length == 0 || *length > largest - *offset)
        return "no region of a file";
    HelperRequest request{task->subject, task->operation, {}, {}, static_cast<int>(*image), {},
                          false};
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

}  // namespace

HelperRequest requestFor(const pellar::PrivilegedJob& job, const std::string& languages)
{
    HelperRequest request{
        job.task.subject, job.task.operation, job.disk, {}, -1, acceptedLanguages(languages),
        job.fetchesArchives};
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
        arguments = {std::string(attaching) + std::string(taskOf(request)->word),
                     std::to_string(request.image), std::to_string(disk.offset),
                     std::to_string(disk.length)};
    else
        arguments = {std::string(taskOf(request)->word), disk.path.native(),
                     request.identity.text()};
    for (const std::string& text :
         {disk.identifier.substr(0, longestName), disk.name.substr(0, longestName), disk.filesystem,
          request.languages})
        arguments.push_back(text);
    if (request.fetchesArchives)
        arguments.emplace_back(fetching);
    return arguments;
}

Read readHelperArguments(const std::vector<std::string>& arguments,
                         const std::function<bool(const std::filesystem::path&)>& isBlockDevice)
{
    if (arguments.size() < 3)
        return "wrong number of arguments";
    if (arguments[0].starts_with(attaching))
        return readRegion(arguments);
    const Task* const task = taskNamed(arguments[0]);
    if (task == nullptr)
        return "unknown operation";
    if (!isCanonicalDevice(arguments[1]) || !isBlockDevice(arguments[1]))
        return "not a block device below /dev";
    const auto identity = DiskIdentity::fromText(arguments[2]);
    if (!identity)
        return "it is not said which disk is meant";
    HelperRequest request{task->subject, task->operation, {}, *identity, -1, {}, false};
    request.disk.path = arguments[1];
    request.disk.isWhole = task->subject == Subject::PartitionMap;
    Arguments texts = Arguments(arguments).subspan(3);
    request.fetchesArchives =
        task->subject == Subject::Permissions && !texts.empty() && texts.back() == fetching;
    return withTexts(std::move(request),
                     texts.first(texts.size() - (request.fetchesArchives ? 1 : 0)));
}

}  // namespace orvane
