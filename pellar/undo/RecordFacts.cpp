// SPDX-License-Identifier: Apache-2.0
#include "pellar/undo/RecordFacts.h"

#include "pellar/bytes/Digest.h"
#include "pellar/undo/TextFromBytes.h"

#include <nlohmann/json.hpp>

#include <algorithm>
#include <array>

namespace pellar {
namespace {

using nlohmann::json;

constexpr int schemaVersion = 1;

struct StateName {
    RecordState state;
    std::string_view name;
};

constexpr std::array stateNames{StateName{RecordState::Applying, "applying"},
                                StateName{RecordState::Applied, "applied"},
                                StateName{RecordState::Undoing, "undoing"}};

std::string sha256(std::string_view text)
{
    Digester digester(DigestKind::SHA256);
    digester.add(text);
    return digester.finish();
}

json jsonFrom(const RecordedDisk& disk)
{
    return {{"path", charactersFrom(disk.path.native())},
            {"offset", disk.offset},
            {"length", disk.length},
            {"uuid", charactersFrom(disk.uuid)},
            {"filesystem", charactersFrom(disk.filesystem)},
            {"name", charactersFrom(disk.name)}};
}

std::string bytesIn(const json& values, const char* key)
{
    return bytesFrom(values.at(key).get_ref<const std::string&>());
}

RecordedDisk diskFrom(const json& values)
{
    return {bytesIn(values, "path"),
            values.at("offset").get<std::uint64_t>(),
            values.at("length").get<std::uint64_t>(),
            bytesIn(values, "uuid"),
            bytesIn(values, "filesystem"),
            bytesIn(values, "name")};
}

std::optional<RecordFacts> factsFrom(const json& values)
{
    using std::chrono::seconds;
    using std::chrono::system_clock;
    if (values.at("version").get<int>() != schemaVersion)
        return std::nullopt;
    const std::optional<Task> task = taskNamed(values.at("task").get_ref<const std::string&>());
    const auto* const state =
        std::ranges::find(stateNames, values.at("state").get<std::string>(), &StateName::name);
    if (!task || state == stateNames.end())
        return std::nullopt;
    const system_clock::time_point time{seconds(values.at("time").get<std::int64_t>())};
    return RecordFacts{{diskFrom(values.at("disk")), *task, values.at("user").get<uid_t>(), time},
                       state->state,
                       values.at("ranges").get<std::uint64_t>(),
                       values.at("changedBytes").get<std::uint64_t>(),
                       values.at("rangesDigest").get<std::string>(),
                       values.at("beforeDigest").get<std::string>(),
                       values.at("afterDigest").get<std::string>()};
}

}  // namespace

std::string encodeFacts(const RecordFacts& facts)
{
    const auto time = std::chrono::floor<std::chrono::seconds>(facts.repair.time);
    const json values{
        {"version", schemaVersion},
        {"disk", jsonFrom(facts.repair.disk)},
        {"task", nameOf(facts.repair.task)},
        {"user", facts.repair.user},
        {"time", time.time_since_epoch().count()},
        {"state", std::ranges::find(stateNames, facts.state, &StateName::state)->name},
        {"ranges", facts.rangeCount},
        {"changedBytes", facts.changedBytes},
        {"rangesDigest", facts.rangesDigest},
        {"beforeDigest", facts.beforeDigest},
        {"afterDigest", facts.afterDigest}};
    const std::string text = values.dump(1) + "\n";
    return sha256(text) + "\n" + text;
}

std::optional<RecordFacts> decodeFacts(std::string_view text)
{
    const std::size_t end = text.find('\n');
    if (end == std::string_view::npos || text.substr(0, end) != sha256(text.substr(end + 1)))
        return std::nullopt;
    try {
        return factsFrom(json::parse(text.substr(end + 1)));
    } catch (const json::exception&) {
        return std::nullopt;
    }
}

bool areInOrder(const std::vector<ByteRange>& ranges, std::uint64_t length)
{
    std::uint64_t end = 0;
    for (const ByteRange& range : ranges) {
        if (range.offset < end || range.length == 0 || range.length > length ||
            range.offset > length - range.length)
            return false;
        end = range.offset + range.length;
    }
    return !ranges.empty();
}

Bytes encodeRanges(const std::vector<ByteRange>& ranges)
{
    Bytes bytes(ranges.size() * encodedRangeBytes);
    for (std::size_t i = 0; i < ranges.size(); ++i) {
        putLittleEndian(bytes, i * encodedRangeBytes, 8, ranges[i].offset);
        putLittleEndian(bytes, i * encodedRangeBytes + 8, 8, ranges[i].length);
    }
    return bytes;
}

std::vector<ByteRange> decodeRanges(ByteView bytes)
{
    std::vector<ByteRange> ranges(bytes.size() / encodedRangeBytes);
    for (std::size_t i = 0; i < ranges.size(); ++i)
        ranges[i] = {littleEndian(bytes, i * encodedRangeBytes, 8),
                     littleEndian(bytes, i * encodedRangeBytes + 8, 8)};
    return ranges;
}

}  // namespace pellar
