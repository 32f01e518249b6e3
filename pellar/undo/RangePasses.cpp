// SPDX-License-Identifier: Apache-2.0
#include "pellar/undo/RangePasses.h"

#include "pellar/bytes/Digest.h"

#include <algorithm>
#include <cerrno>

namespace pellar {
namespace {

using Cause = UndoFault::Cause;
using MayFault = std::optional<UndoFault>;

constexpr std::size_t largestPiece = 1U << 20U;

MayFault faultOf(Cause cause, int error)
{
    return error == 0 ? MayFault() : UndoFault{cause, error};
}

void add(Digester& digester, ByteView bytes)
{
    digester.add({reinterpret_cast<const char*>(bytes.data()), bytes.size()});
}

bool areEqual(ByteView a, ByteView b)
{
    return std::equal(a.begin(), a.end(), b.begin(), b.end());
}

/// A torn write leaves off at any byte, so each may be the one or the other.
bool isMixture(ByteView bytes, ByteView a, ByteView b)
{
    unsigned foreign = 0;
    for (std::size_t i = 0; i < bytes.size(); ++i)
        foreign |=
            static_cast<unsigned>(bytes[i] != a[i]) & static_cast<unsigned>(bytes[i] != b[i]);
    return foreign == 0;
}

}  // namespace

/// What is dealt with at once: a part of a range, and where it is in the record's files, which hold
/// all ranges one after the other.
struct RangePasses::Piece {
    std::uint64_t place;
    std::uint64_t stored;
    std::size_t length;
};

RangePasses::RangePasses(const RecordDirectory& directory, const std::vector<ByteRange>& ranges,
                         const UndoWork& work, unsigned count)
    : directory_(directory), ranges_(ranges), work_(work)
{
    for (const ByteRange& range : ranges)
        total_ += count * range.length;
}

template <class Deal>
MayFault RangePasses::forEachPiece(Deal&& deal)
{
    std::uint64_t stored = 0;
    for (const ByteRange& range : ranges_)
        for (std::uint64_t done = 0; done < range.length;) {
            if (mayStop_ && work_.isStopped && work_.isStopped())
                return UndoFault{Cause::Stopped};
            const std::uint64_t length = std::min<std::uint64_t>(range.length - done, largestPiece);
            if (const MayFault fault = deal(Piece{range.offset + done, stored, length}))
                return fault;
            done += length;
            stored += length;
            done_ = std::min(done_ + length, total_);
            if (work_.progress)
                work_.progress(done_, total_);
        }
    return std::nullopt;
}

Result<RangePasses::Digests, UndoFault> RangePasses::save(RegionReader& before, RegionReader& after)
{
    struct Copy {
        RegionReader& source;
        Result<FileDescriptor, int> file;
        Cause unreadable;
        Digester digester{DigestKind::SHA256};
    };
    Copy copies[] = {
        {before, directory_.makeFile(RecordDirectory::beforeName), Cause::DiskUnreadable},
        {after, directory_.makeFile(RecordDirectory::afterName), Cause::ResultUnreadable}};
    for (const Copy& copy : copies)
        if (!copy.file)
            return UndoFault{Cause::RecordFailed, copy.file.error()};
    Bytes buffer(largestPiece);
    const MayFault fault = forEachPiece([&](const Piece& piece) -> MayFault {
        const std::span bytes(buffer.data(), piece.length);
        for (Copy& copy : copies) {
            if (const int error = copy.source.read(piece.place, bytes))
                return UndoFault{copy.unreadable, error};
            if (const int error = writeAll(copy.file->get(), piece.stored, bytes))
                return UndoFault{Cause::RecordFailed, error};
            add(copy.digester, bytes);
        }
        return std::nullopt;
    });
    if (fault)
        return *fault;
    for (const Copy& copy : copies)
        if (const int error = directory_.sync(*copy.file))
            return UndoFault{Cause::RecordFailed, error};
    return Digests{copies[0].digester.finish(), copies[1].digester.finish()};
}

bool RangePasses::isShortened(const RegionReader& disk) const
{
    return ranges_.back().offset + ranges_.back().length > disk.length();
}

MayFault RangePasses::compare(RegionReader& disk, const Digests& digests, Expected expected)
{
    if (isShortened(disk))
        return UndoFault{Cause::DiskChanged};
    const auto before = directory_.openFile(RecordDirectory::beforeName);
    const auto after = directory_.openFile(RecordDirectory::afterName);
    if (!before || !after)
        return UndoFault{Cause::RecordFailed, before ? after.error() : before.error()};
    Digester beforeDigester(DigestKind::SHA256);
    Digester afterDigester(DigestKind::SHA256);
    Bytes buffers[3] = {Bytes(largestPiece), Bytes(largestPiece), Bytes(largestPiece)};
    bool isChanged = false;
    const MayFault fault = forEachPiece([&](const Piece& piece) -> MayFault {
        const std::span old(buffers[0].data(), piece.length);
        const std::span repaired(buffers[1].data(), piece.length);
        const std::span found(buffers[2].data(), piece.length);
        if (const int error = readAll(before->get(), piece.stored, old))
            return UndoFault{Cause::RecordFailed, error};
        if (const int error = readAll(after->get(), piece.stored, repaired))
            return UndoFault{Cause::RecordFailed, error};
        if (const int error = disk.read(piece.place, found))
            return UndoFault{Cause::DiskUnreadable, error};
        add(beforeDigester, old);
        add(afterDigester, repaired);
        isChanged = isChanged || !(expected == Expected::Before ? areEqual(found, old)
                                                                : isMixture(found, old, repaired));
        return std::nullopt;
    });
    if (fault)
        return fault;
    // First: bytes that are not those of the record prove nothing about the disk.
    if (beforeDigester.finish() != digests.before || afterDigester.finish() != digests.after)
        return UndoFault{Cause::RecordDamaged};
    return isChanged ? MayFault(UndoFault{Cause::DiskChanged}) : std::nullopt;
}

MayFault RangePasses::saveAfterFrom(RegionReader& disk, const Digests& digests)
{
    if (isShortened(disk))
        return UndoFault{Cause::DiskChanged};
    const auto before = directory_.openFile(RecordDirectory::beforeName);
    if (!before)
        return UndoFault{Cause::RecordFailed, before.error()};
    // The state Applied has to be on the medium before the file goes that only the others need;
    // it may not be when an earlier sync has failed.
    if (const int error = directory_.syncNames())
        return UndoFault{Cause::RecordFailed, error};
    if (const int error = directory_.removeFile(RecordDirectory::afterName))
        return UndoFault{Cause::RecordFailed, error};
    const auto after = directory_.makeFile(RecordDirectory::afterName);
    if (!after)
        return UndoFault{Cause::RecordFailed, after.error()};
    Digester beforeDigester(DigestKind::SHA256);
    Digester afterDigester(DigestKind::SHA256);
    Bytes buffer(largestPiece);
    const MayFault fault = forEachPiece([&](const Piece& piece) -> MayFault {
        const std::span bytes(buffer.data(), piece.length);
        if (const int error = readAll(before->get(), piece.stored, bytes))
            return UndoFault{Cause::RecordFailed, error};
        add(beforeDigester, bytes);
        if (const int error = disk.read(piece.place, bytes))
            return UndoFault{Cause::DiskUnreadable, error};
        add(afterDigester, bytes);
        return faultOf(Cause::RecordFailed, writeAll(after->get(), piece.stored, bytes));
    });
    if (fault)
        return fault;
    if (beforeDigester.finish() != digests.before)
        return UndoFault{Cause::RecordDamaged};
    if (afterDigester.finish() != digests.after)
        return UndoFault{Cause::DiskChanged};
    if (const int error = directory_.sync(*after))
        return UndoFault{Cause::RecordFailed, error};
    return faultOf(Cause::RecordFailed, directory_.syncNames());
}

MayFault RangePasses::write(Region& disk, const char* name, Writing writing)
{
    mayStop_ = false;
    const auto file = directory_.openFile(name);
    if (!file)
        return UndoFault{Cause::RecordFailed, file.error()};
    const MayFault fault = writing == Writing::Everything ? writePieces(disk, *file)
                                                          : writeDifferingPieces(disk, *file);
    if (fault)
        return fault;
    if (const int error = disk.sync())
        return UndoFault{Cause::DiskUnwritable, error};
    disk.forgetCached();
    return readBack(disk, *file);
}

MayFault RangePasses::writePieces(Region& disk, const FileDescriptor& file)
{
    Bytes buffer(largestPiece);
    return forEachPiece([&](const Piece& piece) -> MayFault {
        const std::span bytes(buffer.data(), piece.length);
        if (const int error = readAll(file.get(), piece.stored, bytes))
            return UndoFault{Cause::RecordFailed, error};
        return faultOf(Cause::DiskUnwritable, disk.write(piece.place, bytes));
    });
}

MayFault RangePasses::writeDifferingPieces(Region& disk, const FileDescriptor& file)
{
    // What the medium refused may still stand in the cache.
    disk.forgetCached();
    Bytes buffer(largestPiece);
    Bytes foundBuffer(largestPiece);
    MayFault first;
    const MayFault fault = forEachPiece([&](const Piece& piece) -> MayFault {
        const std::span bytes(buffer.data(), piece.length);
        const std::span found(foundBuffer.data(), piece.length);
        if (const int error = readAll(file.get(), piece.stored, bytes))
            return UndoFault{Cause::RecordFailed, error};
        if (disk.read(piece.place, found) == 0 && areEqual(found, bytes))
            return std::nullopt;
        const int error = disk.write(piece.place, bytes);
        if (error != 0 && !first)
            first = UndoFault{Cause::DiskUnwritable, error};
        return std::nullopt;
    });
    if (first)
        (void)disk.sync();  // the rest shall be there all the same; the fault is already known
    return fault ? fault : first;
}

MayFault RangePasses::readBack(RegionReader& disk, const FileDescriptor& file)
{
    Bytes buffer(largestPiece);
    Bytes foundBuffer(largestPiece);
    return forEachPiece([&](const Piece& piece) -> MayFault {
        const std::span bytes(buffer.data(), piece.length);
        const std::span found(foundBuffer.data(), piece.length);
        if (const int error = readAll(file.get(), piece.stored, bytes))
            return UndoFault{Cause::RecordFailed, error};
        if (const int error = disk.read(piece.place, found))
            return UndoFault{Cause::DiskUnreadable, error};
        return areEqual(found, bytes) ? MayFault() : UndoFault{Cause::DiskForgetful};
    });
}

}  // namespace pellar
