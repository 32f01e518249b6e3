// SPDX-License-Identifier: Apache-2.0
#include "orvane/jobs/PublishedChecks.h"

#include "contract/pellar/MessageKeys.h"
#include "orvane/support/files/WholeFile.h"
#include "pellar/outcome/Task.h"
#include "pellar/process/TrustedPath.h"
#include "pellar/undo/RecordDirectory.h"

#include <nlohmann/json.hpp>

#include <fcntl.h>
#include <unistd.h>

#include <array>
#include <chrono>
#include <cstring>
#include <system_error>
#include <utility>

namespace orvane {
namespace {

using nlohmann::json;
using pellar::FileDescriptor;
using Milliseconds = std::chrono::milliseconds;

constexpr const char* fileName = "last.json";
constexpr const char* lockName = ".lock";
constexpr std::uint64_t largestFile = 4U << 20U;
constexpr std::chrono::hours longestKept{24 * 366};

const std::array verdicts{contract::kPLVerdictSound, contract::kPLVerdictDamaged,
                          contract::kPLVerdictInconclusive, contract::kPLVerdictFailed,
                          contract::kPLVerdictStopped};

// Names of devices may hold any bytes, and JSON holds UTF-8 alone: each byte is a character.
std::string encoded(std::string_view bytes)
{
    std::string text;
    for (const char byte : bytes)
        contract::appendUTF8(text, static_cast<unsigned char>(byte));
    return text;
}

std::string decoded(std::string_view text)
{
    std::string bytes;
    contract::forEachCharacter(text, [&bytes](char32_t character) {
        bytes += static_cast<char>(character <= 0xFF ? character : '?');
    });
    return bytes;
}

std::int64_t numberOf(Run::Time time)
{
    return std::chrono::duration_cast<Milliseconds>(time.time_since_epoch()).count();
}

std::string textIn(const json& object, const char* name)
{
    const auto found = object.find(name);
    return found != object.end() && found->is_string() ? decoded(found->get<std::string>()) : "";
}

std::optional<std::int64_t> numberIn(const json& object, const char* name)
{
    const auto found = object.find(name);
    const bool isNumber = found != object.end() && found->is_number_integer();
    return isNumber && *found >= 0 ? std::optional(found->get<std::int64_t>()) : std::nullopt;
}

// Until the year 9999: what lies beyond does not fit into a time of the system.
std::optional<Run::Time> timeIn(const json& object, const char* name)
{
    constexpr std::int64_t latest = 253402300799000;
    const auto number = numberIn(object, name);
    return number && *number <= latest ? std::optional(Run::Time(Milliseconds(*number)))
                                       : std::nullopt;
}

std::optional<Run> runIn(const json& object)
{
    const std::string verdict = textIn(object, "verdict");
    const auto started = timeIn(object, "started");
    const auto isVerdict = [&](const contract::Name& name) {
        return name.text() == verdict;
    };
    if (!started || std::ranges::none_of(verdicts, isVerdict))
        return std::nullopt;
    Run run;
    run.action = nameOf(pellar::Task{pellar::Subject::Filesystem, pellar::Operation::Verify});
    run.started = *started;
    run.finished = timeIn(object, "finished");
    run.end.emplace();
    run.end->verdict = verdict;
    run.end->problems = numberIn(object, "problems").value_or(0);
    return run;
}

PublishedChecks decodeChecks(const std::string& text)
{
    const json file = json::parse(text, nullptr, false);
    PublishedChecks checks;
    if (!file.is_object())
        return checks;
    for (const auto& [key, value] : file.items())
        if (value.is_object())
            checks[decoded(key)] = {textIn(value, "device"), textIn(value, "uuid"), runIn(value),
                                    timeIn(value, "skipped")};
    return checks;
}

std::string encodeChecks(const PublishedChecks& checks)
{
    json file = json::object();
    for (const auto& [key, check] : checks) {
        json& value = file[encoded(key)];
        value = {{"device", encoded(check.device)}, {"uuid", encoded(check.uuid)}};
        if (const auto& run = check.run; run && run->end) {
            value["verdict"] = run->end->verdict;
            value["problems"] = run->end->problems;
            value["started"] = numberOf(run->started);
            if (run->finished)
                value["finished"] = numberOf(*run->finished);
        }
        if (check.skipped)
            value["skipped"] = numberOf(*check.skipped);
    }
    return file.dump(1) + "\n";
}

Run::Time newestTimeOf(const PublishedCheck& check)
{
    const auto run = check.run ? check.run->started : Run::Time();
    return std::max(run, check.skipped.value_or(Run::Time()));
}

/// Whatever mask files are made with: everybody may search the system's, and look into this one.
Result<void, Failure> makeDirectory(const std::filesystem::path& directory)
{
    namespace fs = std::filesystem;
    constexpr fs::perms searched =
        fs::perms::owner_exec | fs::perms::group_exec | fs::perms::others_exec;
    std::error_code error;
    fs::create_directories(directory, error);
    if (!error && directory == systemChecks)
        fs::permissions(directory.parent_path(), searched, fs::perm_options::add, error);
    if (!error)
        fs::permissions(directory, fs::perms(0755), error);
    if (error)
        return cannot("create the directory", directory.native(), error.value());
    return {};
}

}  // namespace

bool operator==(const PublishedCheck& a, const PublishedCheck& b)
{
    return encodeChecks({{"", a}}) == encodeChecks({{"", b}});
}

PublishedChecks readPublishedChecks(const std::filesystem::path& directory)
{
    const auto opened = pellar::StoreDirectory::openExisting(directory);
    if (!opened)
        return {};
    const FileDescriptor file(
        ::openat(opened->descriptor(), fileName, O_RDONLY | O_NOFOLLOW | O_NONBLOCK | O_CLOEXEC));
    struct stat status = {};
    if (!file || ::fstat(file.get(), &status) != 0 || !S_ISREG(status.st_mode) ||
        !pellar::whyOthersCanChange(status).empty())
        return {};
    const auto text = pellar::readWhole(file, largestFile);
    return text ? decodeChecks(*text) : PublishedChecks();
}

PublishedChecks newestOf(PublishedChecks one, const PublishedChecks& other)
{
    for (const auto& [key, check] : other) {
        const auto known = one.find(key);
        if (known == one.end() || newestTimeOf(known->second) < newestTimeOf(check))
            one[key] = check;
    }
    return one;
}

// Which of two copies of a volume was which device, nobody knows later: where they differ, either
// may be this one.
const Run* publishedRun(const PublishedChecks& checks, std::string_view key)
{
    const auto found = checks.find(key);
    if (found == checks.end() || !found->second.run)
        return nullptr;
    const PublishedCheck& check = found->second;
    const auto isOtherAnswer = [&check](const auto& entry) {
        const PublishedCheck& other = entry.second;
        return !check.uuid.empty() && other.uuid == check.uuid && other.run &&
               other.run->verdict() != check.run->verdict();
    };
    return std::ranges::any_of(checks, isOtherAnswer) ? nullptr : &*check.run;
}

// The lock's file is its owner's alone: what others may open, they may lock.
Result<void, Failure> publishCheck(const std::filesystem::path& directory, const std::string& key,
                                   PublishedCheck check)
{
    if (const auto made = makeDirectory(directory); !made)
        return made.error();
    const FileDescriptor lock(
        ::open((directory / lockName).c_str(), O_RDWR | O_CREAT | O_NOFOLLOW | O_CLOEXEC, 0600));
    if (!lock)
        return cannot("lock", directory.native(), errno);
    const pellar::DirectoryLock guard(lock.get());
    PublishedChecks checks = readPublishedChecks(directory);
    PublishedCheck& kept = checks[key];
    if (!check.run)
        check.run = std::move(kept.run);
    kept = std::move(check);
    const auto oldest = std::chrono::system_clock::now() - longestKept;
    std::erase_if(checks, [&](const auto& entry) { return newestTimeOf(entry.second) < oldest; });
    return replacePublicFile(directory / fileName, encodeChecks(checks));
}

}  // namespace orvane
