// SPDX-License-Identifier: Apache-2.0
#include "orvane/privileges/HelperRequest.h"

#include <algorithm>
#include <array>
#include <string_view>

namespace orvane {
namespace {

using pellar::Operation;

struct Task {
    std::string_view word;
    Operation operation;
    bool isWhole;
};

constexpr std::array tasks{
    Task{"verify", Operation::Verify, false}, Task{"repair", Operation::Repair, false},
    Task{"verify-map", Operation::Verify, true}, Task{"repair-map", Operation::Repair, true}};

// The task, the device, and four texts.
constexpr std::size_t argumentCount = 6;
constexpr std::size_t longestName = 1024;

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

}  // namespace

std::vector<std::string> argumentsOf(const HelperRequest& request)
{
    const auto task = std::find_if(tasks.begin(), tasks.end(), [&](const Task& candidate) {
        return candidate.operation == request.operation &&
               candidate.isWhole == request.disk.isWhole;
    });
    return {std::string(task->word), request.disk.path.native(),
            request.disk.identifier, request.disk.name.substr(0, longestName),
            request.disk.filesystem, request.languages};
}

std::variant<HelperRequest, std::string> readHelperArguments(
    const std::vector<std::string>& arguments,
    const std::function<bool(const std::filesystem::path&)>& isBlockDevice)
{
    if (arguments.size() != argumentCount)
        return "wrong number of arguments";
    const auto task = std::find_if(tasks.begin(), tasks.end(), [&](const Task& candidate) {
        return candidate.word == arguments[0];
    });
    if (task == tasks.end())
        return "unknown operation";
    if (!isCanonicalDevice(arguments[1]) || !isBlockDevice(arguments[1]))
        return "not a block device below /dev";
    if (arguments[2].size() > longestName || arguments[3].size() > longestName)
        return "a name is too long";
    if (!consistsOf(arguments[4], "_-+.", 64) || !consistsOf(arguments[5], "_-@.:", 64))
        return "a name of a file system or language holds what none does";
    HelperRequest request;
    request.operation = task->operation;
    request.disk.path = arguments[1];
    request.disk.identifier = arguments[2];
    request.disk.name = arguments[3];
    request.disk.filesystem = arguments[4];
    request.disk.isWhole = task->isWhole;
    request.languages = arguments[5];
    return request;
}

}  // namespace orvane
