// SPDX-License-Identifier: Apache-2.0
#include "pellar/permissions/RecordedChange.h"

#include "pellar/bytes/Checksums.h"
#include "pellar/bytes/Digest.h"
#include "pellar/packages/TextLines.h"
#include "pellar/undo/TextFromBytes.h"

#include <fcntl.h>
#include <nlohmann/json.hpp>

#include <array>
#include <cstdio>
#include <map>

namespace pellar {
namespace {

using nlohmann::json;

constexpr int schemaVersion = 1;
constexpr std::size_t checksumLength = 8;
constexpr std::uint64_t largestContents = 256U << 20U;

std::string checksumOf(std::string_view text)
{
    std::array<char, checksumLength + 1> digits{};
    std::snprintf(digits.data(), digits.size(), "%08x",
                  crc32c({reinterpret_cast<const std::uint8_t*>(text.data()), text.size()}));
    return digits.data();
}

std::string lineOf(const json& values)
{
    const std::string text = values.dump();
    return checksumOf(text) + ' ' + text + '\n';
}

/// Discarded when the line is not whole.
json valuesOf(std::string_view line)
{
    if (line.size() <= checksumLength || line[checksumLength] != ' ' ||
        line.substr(0, checksumLength) != checksumOf(line.substr(checksumLength + 1)))
        return json(json::value_t::discarded);
    return json::parse(line.substr(checksumLength + 1), nullptr, false);
}

std::string bytesAt(const json& values, const char* key)
{
    return bytesFrom(values.at(key).get_ref<const std::string&>());
}

json jsonFrom(const Permissions& is)
{
    return {static_cast<int>(is.kind), is.mode, is.user, is.group, is.capabilities};
}

Permissions permissionsFrom(const json& values)
{
    return {static_cast<FileKind>(values.at(0).get<int>()), values.at(1).get<mode_t>(),
            values.at(2).get<uid_t>(), values.at(3).get<gid_t>(), values.at(4).get<std::string>()};
}

json jsonFrom(const FileState& state)
{
    return {{"is", jsonFrom(state.permissions)},
            {"changed", {state.changed.seconds, state.changed.nanoseconds}},
            {"modified", {state.modified.seconds, state.modified.nanoseconds}}};
}

Moment momentFrom(const json& values)
{
    return {values.at(0).get<std::int64_t>(), values.at(1).get<std::int64_t>()};
}

FileState stateFrom(const json& values)
{
    return {permissionsFrom(values.at("is")), momentFrom(values.at("changed")),
            momentFrom(values.at("modified"))};
}

RecordedChange changeFrom(const json& values)
{
    RecordedChange change;
    change.path = bytesAt(values, "path");
    change.device = values.at("device").get<std::uint64_t>();
    change.inode = values.at("inode").get<std::uint64_t>();
    change.before = stateFrom(values.at("before"));
    change.wanted = permissionsFrom(values.at("wanted"));
    change.digest = values.at("digest").get<std::string>();
    return change;
}

std::optional<PermissionsRun> runFrom(const json& values)
{
    if (values.at("version").get<int>() != schemaVersion)
        return std::nullopt;
    PermissionsRun run;
    run.repair.disk = {bytesAt(values, "path"),
                       values.at("offset").get<std::uint64_t>(),
                       values.at("length").get<std::uint64_t>(),
                       bytesAt(values, "uuid"),
                       bytesAt(values, "filesystem"),
                       bytesAt(values, "name")};
    run.repair.task = {Subject::Permissions, Operation::Repair};
    run.repair.user = values.at("user").get<uid_t>();
    run.repair.time = std::chrono::system_clock::time_point(
        std::chrono::seconds(values.at("time").get<std::int64_t>()));
    run.mountPoint = bytesAt(values, "mountPoint");
    run.rootDevice = values.at("rootDevice").get<std::uint64_t>();
    return run;
}

/// What the lines after the first say, which come in any order after a power cut.
class Lines {
public:
    void take(const json& values)
    {
        const auto number = values.at("number").get<std::uint64_t>();
        if (values.contains("before"))
            changes_.insert_or_assign(number, changeFrom(values));
        else if (const auto change = changes_.find(number); change != changes_.end())
            takeStage(values, change->second);
    }

    std::vector<RecordedChange> changes() &&
    {
        RecordedChange nothing;
        nothing.stage = ChangeStage::Settled;
        std::vector<RecordedChange> all;
        for (auto& [number, change] : changes_) {
            all.resize(number, nothing);
            all.push_back(std::move(change));
        }
        return all;
    }

private:
    static void takeStage(const json& values, RecordedChange& change)
    {
        const auto stage = static_cast<ChangeStage>(values.at("stage").get<int>());
        if (stage == ChangeStage::Changed)
            change.after = stateFrom(values.at("after"));
        change.stage = stage;
    }

    std::map<std::uint64_t, RecordedChange> changes_;
};

}  // namespace

FileState stateOf(const Permissions& permissions, const struct stat& status)
{
    return {permissions,
            {status.st_ctim.tv_sec, status.st_ctim.tv_nsec},
            {status.st_mtim.tv_sec, status.st_mtim.tv_nsec}};
}

bool lendsRights(const Permissions& permissions)
{
    return permissions.kind == FileKind::Regular &&
           ((permissions.mode & (S_ISUID | S_ISGID)) != 0 || !permissions.capabilities.empty());
}

RecordedChange changeOf(const Reference& reference, const FoundFile& file)
{
    RecordedChange change;
    change.path = reference.path;
    change.device = file.status.st_dev;
    change.inode = file.status.st_ino;
    change.before = stateOf(file.permissions, file.status);
    change.wanted = {file.permissions.kind, reference.mode, reference.user, reference.group,
                     reference.capabilities.value_or(file.permissions.capabilities)};
    if (lendsRights(file.permissions)) {
        const FileDescriptor readable(
            ::open(pathOfDescriptor(file.object.get()).c_str(), O_RDONLY | O_NONBLOCK | O_CLOEXEC));
        change.digest =
            readable
                ? digestOfFile(readable.get(), DigestKind::SHA256, largestContents).value_or("")
                : "";
    }
    return change;
}

std::string lineOfRun(const PermissionsRun& run)
{
    const auto time = std::chrono::floor<std::chrono::seconds>(run.repair.time);
    const RecordedDisk& disk = run.repair.disk;
    return lineOf({{"version", schemaVersion},
                   {"path", charactersFrom(disk.path.native())},
                   {"offset", disk.offset},
                   {"length", disk.length},
                   {"uuid", charactersFrom(disk.uuid)},
                   {"filesystem", charactersFrom(disk.filesystem)},
                   {"name", charactersFrom(disk.name)},
                   {"user", run.repair.user},
                   {"time", time.time_since_epoch().count()},
                   {"mountPoint", charactersFrom(run.mountPoint)},
                   {"rootDevice", run.rootDevice}});
}

std::string lineOfChange(std::uint64_t number, const RecordedChange& change)
{
    return lineOf({{"number", number},
                   {"path", charactersFrom(change.path)},
                   {"device", change.device},
                   {"inode", change.inode},
                   {"before", jsonFrom(change.before)},
                   {"wanted", jsonFrom(change.wanted)},
                   {"digest", change.digest}});
}

std::string lineOfStage(std::uint64_t number, ChangeStage stage,
                        const std::optional<FileState>& after)
{
    json values{{"number", number}, {"stage", static_cast<int>(stage)}};
    if (after)
        values["after"] = jsonFrom(*after);
    return lineOf(values);
}

std::optional<DecodedRecord> decodeRecord(std::string_view text)
{
    std::optional<DecodedRecord> record;
    Lines lines;
    try {
        while (!text.empty()) {
            const bool isCutOff = text.find('\n') == std::string_view::npos;
            const json values = valuesOf(takeField(text, '\n'));
            if (!record) {
                const auto run = values.is_object() ? runFrom(values) : std::nullopt;
                if (!run)
                    return std::nullopt;
                record.emplace(DecodedRecord{*run, {}, 0});
            } else if (values.is_object()) {
                lines.take(values);
            } else if (!isCutOff) {
                ++record->damagedLines;
            }
        }
    } catch (const json::exception&) {
        return std::nullopt;
    }
    if (record)
        record->changes = std::move(lines).changes();
    return record;
}

}  // namespace pellar
