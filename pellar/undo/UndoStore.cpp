// SPDX-License-Identifier: Apache-2.0
#include "pellar/undo/UndoStore.h"

#include "pellar/bytes/Digest.h"
#include "pellar/undo/PublicIndex.h"

#include <algorithm>
#include <array>
#include <cerrno>
#include <ctime>
#include <system_error>

namespace pellar {
namespace {

using Cause = UndoFault::Cause;

/// Sorts like the time.
std::string nameFor(std::chrono::system_clock::time_point time)
{
    const std::time_t seconds = std::chrono::system_clock::to_time_t(time);
    std::tm parts{};
    std::array<char, 64> text{};
    if (::gmtime_r(&seconds, &parts) == nullptr)
        return "record";
    return {text.data(), std::strftime(text.data(), text.size(), "%Y%m%dT%H%M%SZ", &parts)};
}

std::string sha256(std::string_view bytes)
{
    Digester digester(DigestKind::SHA256);
    digester.add(bytes);
    return digester.finish();
}

std::uint64_t totalOf(const std::vector<ByteRange>& ranges)
{
    std::uint64_t total = 0;
    for (const ByteRange& range : ranges)
        total += range.length;
    return total;
}

bool hasFacts(const RecordDirectory& directory)
{
    const auto file = directory.openFile(RecordDirectory::factsName);
    return file || file.error() != ENOENT;
}

/// None when they cannot be trusted, or a file that must be there is missing or cut off.
std::optional<RecordFacts> factsIn(const RecordDirectory& directory)
{
    const auto text = directory.readFile(RecordDirectory::factsName, largestFacts);
    std::optional<RecordFacts> facts = text ? decodeFacts(*text) : std::nullopt;
    if (!facts || facts->rangeCount > facts->changedBytes ||
        !directory.hasFile(RecordDirectory::rangesName, facts->rangeCount * encodedRangeBytes) ||
        !directory.hasFile(RecordDirectory::beforeName, facts->changedBytes))
        return std::nullopt;
    if (facts->state != RecordState::Applied &&
        !directory.hasFile(RecordDirectory::afterName, facts->changedBytes))
        return std::nullopt;
    return facts;
}

std::optional<std::vector<ByteRange>> rangesIn(const RecordDirectory& directory,
                                               const RecordFacts& facts)
{
    const auto text =
        directory.readFile(RecordDirectory::rangesName, facts.rangeCount * encodedRangeBytes);
    if (!text || sha256(*text) != facts.rangesDigest)
        return std::nullopt;
    std::vector<ByteRange> ranges =
        decodeRanges({reinterpret_cast<const std::uint8_t*>(text->data()), text->size()});
    if (!areInOrder(ranges, facts.repair.disk.length) || totalOf(ranges) != facts.changedBytes)
        return std::nullopt;
    return ranges;
}

Sentence withoutDirectory(const std::string& reason)
{
    return {
        "there is no directory to keep the bytes in that a repair overwrites: %1$@", reason, {}};
}

/// Whoever makes a record has its lock until it is committed.
void removeLeftOver(const RecordDirectory& directory)
{
    if (directory.lock() == 0 && !hasFacts(directory))
        (void)directory.remove();  // it is tried again with the next listing
}

/// A copy of the disk has its UUID as well; so by that alone it is known only where its own place
/// is empty.
bool isSameDisk(const RecordedDisk& recorded, const RecordedDisk& disk)
{
    if (recorded.length != disk.length)
        return false;
    const bool hasOtherIdentity =
        !recorded.uuid.empty() && !disk.uuid.empty() && recorded.uuid != disk.uuid;
    if (recorded.path == disk.path)
        return recorded.offset == disk.offset && !hasOtherIdentity;
    std::error_code error;
    return !recorded.uuid.empty() && recorded.uuid == disk.uuid &&
           !std::filesystem::exists(recorded.path, error) && !error;
}

}  // namespace

const ListedRecord* newestOf(const RecordedDisk& disk, const RecordList& list)
{
    const auto found = std::ranges::find_if(list.records, [&](const ListedRecord& record) {
        return isSameDisk(record.facts.repair.disk, disk);
    });
    return found == list.records.end() ? nullptr : &*found;
}

Result<UndoStore, Sentence> UndoStore::open(const std::filesystem::path& directory,
                                            SyncFunction sync, const std::filesystem::path& index)
{
    auto opened = StoreDirectory::open(directory, sync);
    if (!opened)
        return withoutDirectory(opened.error());
    const auto records = std::make_shared<const StoreDirectory>(std::move(*opened));
    const auto published = PublicIndex::openUnlessEmpty(index, records, std::move(sync));
    UndoStore store(records, published ? *published : nullptr);
    if (!published)
        store.whyNoIndex_ = published.error();
    return store;
}

Result<UndoRecord, Sentence> UndoStore::save(const RecordedRepair& repair,
                                             std::vector<ByteRange> ranges, RegionReader& before,
                                             RegionReader& after, const UndoWork& work) const
{
    if (!whyNoIndex_.empty())
        return withoutDirectory(whyNoIndex_);
    if (!areInOrder(ranges, std::min({repair.disk.length, before.length(), after.length()})))
        return unchangedBecause({Cause::RecordFailed, EINVAL});
    auto directory = RecordDirectory::make(directory_, nameFor(repair.time));
    if (!directory)
        return unchangedBecause({Cause::RecordFailed, directory.error()});
    RecordFacts facts;
    facts.repair = repair;
    facts.rangeCount = ranges.size();
    facts.changedBytes = totalOf(ranges);
    UndoRecord record(std::move(*directory), index_, std::move(facts), std::move(ranges),
                      UndoRecord::Stage::Uncommitted);

    auto digests = RangePasses(record.directory_, record.ranges_, work, 1).save(before, after);
    if (!digests)
        return unchangedBecause(digests.error());
    const Bytes encoded = encodeRanges(record.ranges_);
    const std::string_view text(reinterpret_cast<const char*>(encoded.data()), encoded.size());
    record.facts_.beforeDigest = std::move(digests->before);
    record.facts_.afterDigest = std::move(digests->after);
    record.facts_.rangesDigest = sha256(text);
    if (const int error = record.directory_.writeFile(RecordDirectory::rangesName, text))
        return unchangedBecause({Cause::RecordFailed, error});
    if (const int error = record.directory_.syncNames())
        return unchangedBecause({Cause::RecordFailed, error});
    return record;
}

RecordList UndoStore::list() const
{
    RecordList list;
    for (const std::string& name : directory_->names()) {
        auto directory = RecordDirectory::open(directory_, name);
        if (!directory) {
            if (directory.error() != ENOENT)
                list.broken.push_back(name);
        } else if (!hasFacts(*directory)) {
            removeLeftOver(*directory);
        } else {
            // Held while the facts are read, so that nobody begins to change them now.
            const bool isInUse = directory->lockForReading() == EWOULDBLOCK;
            if (auto facts = factsIn(*directory)) {
                list.records.push_back({name, std::move(*facts), isInUse});
                mendIndex(list.records.back());
            } else if (!isInUse && hasFacts(*directory)) {
                list.broken.push_back(name);
                if (index_)
                    (void)index_->remove(name);
            }
        }
    }
    if (index_)
        index_->removeOrphans();
    sortNewestFirst(list.records, [](const ListedRecord& record) -> const RecordedRepair& {
        return record.facts.repair;
    });
    return list;
}

void UndoStore::mendIndex(const ListedRecord& record) const
{
    if (index_ && !record.isInUse)
        index_->mend(record.id, record.facts);
}

Result<RecordDirectory, Sentence> UndoStore::openLocked(const std::string& id) const
{
    auto directory = waitingForLock([&]() -> Result<RecordDirectory, int> {
        auto opened = RecordDirectory::open(directory_, id);
        const int error = opened ? opened->lock() : 0;
        if (error != 0)
            return error;
        return opened;
    });
    if (directory)
        return std::move(*directory);
    if (directory.error() == EWOULDBLOCK)
        return Sentence{"the saved bytes are in use", {}, {}};
    return Sentence{"the saved bytes cannot be read: %1$@",
                    std::generic_category().message(directory.error()),
                    {}};
}

Result<UndoRecord, Sentence> UndoStore::take(const std::string& id) const
{
    auto directory = openLocked(id);
    if (!directory)
        return directory.error();
    auto facts = factsIn(*directory);
    auto ranges = facts ? rangesIn(*directory, *facts) : std::nullopt;
    if (!ranges)
        return unchangedBecause({Cause::RecordDamaged});
    return UndoRecord(std::move(*directory), index_, std::move(*facts), std::move(*ranges),
                      UndoRecord::Stage::Committed);
}

int UndoStore::remove(const RecordDirectory& directory) const
{
    const int error = directory.remove();
    return error == 0 && index_ ? index_->remove(directory.name()) : error;
}

Result<void, Sentence> UndoStore::remove(const std::string& id) const
{
    const auto directory = openLocked(id);
    if (!directory)
        return directory.error();
    if (const int error = remove(*directory))
        return Sentence{
            "the saved bytes cannot be removed: %1$@", std::generic_category().message(error), {}};
    return {};
}

std::size_t UndoStore::removeBeyond(const RecordLimits& limits,
                                    std::chrono::system_clock::time_point now) const
{
    const RecordList list = this->list();
    std::size_t records = list.records.size();
    std::uint64_t bytes = 0;
    for (const ListedRecord& record : list.records)
        bytes += record.facts.changedBytes;
    std::size_t removed = 0;
    for (auto record = list.records.rbegin(); record != list.records.rend(); ++record) {
        const bool isBeyond = records > limits.records || bytes > limits.bytes ||
                              now - record->facts.repair.time > limits.age;
        if (!isBeyond || record->isInUse)
            continue;
        const auto directory = openLocked(record->id);
        const auto facts = directory ? factsIn(*directory) : std::nullopt;
        if (!facts || facts->state != RecordState::Applied || remove(*directory) != 0)
            continue;
        --records;
        bytes -= record->facts.changedBytes;
        ++removed;
    }
    return removed;
}

}  // namespace pellar
