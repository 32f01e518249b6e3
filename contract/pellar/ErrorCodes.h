// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>
#include <cstdint>
#include <string_view>

namespace contract {

/// Signed 32-bit codes, 0 for success. The host turns them into text with OVLocalizedErrorString.
using ErrorCode = std::int32_t;

inline constexpr ErrorCode kPLNoError = 0;

// Codes that the module itself knows.
inline constexpr ErrorCode kPLErrorNoDiskReference = -69879;
inline constexpr ErrorCode kPLErrorCouldNotUnmount = -69888;
/// The disk is in use; the module restates it by the kind of disk as one of the three below.
inline constexpr ErrorCode kPLErrorDiskInUse = -69845;
inline constexpr ErrorCode kPLErrorCancelled = -69884;
inline constexpr ErrorCode kOVErrorCannotRepairInUse = -19996;
inline constexpr ErrorCode kOVErrorSystemDiskInUse = -19997;
inline constexpr ErrorCode kOVErrorDiskInUse = -19998;

// How the library's jobs end.
inline constexpr ErrorCode kPLErrorDamaged = -69701;       ///< verified: needs to be repaired
inline constexpr ErrorCode kPLErrorNotRepaired = -69702;   ///< repaired: damage is left
inline constexpr ErrorCode kPLErrorInconclusive = -69703;  ///< neither sound nor damaged is known
inline constexpr ErrorCode kPLErrorToolMissing = -69704;   ///< the checking tool is not installed
inline constexpr ErrorCode kPLErrorToolFailed = -69705;   ///< it crashed, was killed, could not run
inline constexpr ErrorCode kPLErrorCannotOpen = -69706;   ///< no such disk, or no permission
inline constexpr ErrorCode kPLErrorUnsupported = -69707;  ///< no tool for this file system
inline constexpr ErrorCode kPLErrorToolMisbehaved = -69708;  ///< output without end, or no answer
inline constexpr ErrorCode kPLErrorDiskChanged = -69709;     ///< it shrank or went away meanwhile
inline constexpr ErrorCode kPLErrorReadOnly = -69710;        ///< a repair of what cannot be written
inline constexpr ErrorCode kPLErrorBusy = -69711;  ///< another job of this tool is running

/// Verified: damaged, and this kind of volume is not repaired here.
inline constexpr ErrorCode kPLErrorDamagedForGood = -69712;
/// A repair was tried, would leave damage, and was not applied: the disk is as it was.
inline constexpr ErrorCode kPLErrorNotProven = -69713;
inline constexpr ErrorCode kPLErrorNotTried = -69714;     ///< a repair could not be tried first
inline constexpr ErrorCode kPLErrorInterrupted = -69715;  ///< an earlier repair is half applied
inline constexpr ErrorCode kPLErrorNothingToUndo = -69716;
inline constexpr ErrorCode kPLErrorNotUndone = -69717;  ///< and the disk is as it was

/// A repair of what is not repaired here, though it can be verified.
inline constexpr ErrorCode kPLErrorNoRepairHere = -69740;
/// The medium, not the file system: places of the disk cannot be read.
inline constexpr ErrorCode kPLErrorUnreadable = -69741;
/// The end of the volume is not on the disk.
inline constexpr ErrorCode kPLErrorCutShort = -69742;

inline constexpr ErrorCode kPLErrorNoPartitionMap = -69720;
inline constexpr ErrorCode kPLErrorMapDamaged = -69721;      ///< a repair can restore it
inline constexpr ErrorCode kPLErrorMapNeedsPerson = -69722;  ///< and none can
inline constexpr ErrorCode kPLErrorMapNotRepaired = -69723;  ///< damage is left

inline constexpr ErrorCode kPLErrorNoReferences = -69730;            ///< nothing could be compared
inline constexpr ErrorCode kPLErrorPermissionsNotRepaired = -69731;  ///< some still differ

inline constexpr ErrorCode kPLErrorNotAdministrator = -69732;  ///< only root may
/// The job needs more rights than the user has, and they were not given.
inline constexpr ErrorCode kPLErrorNotAuthorized = -69733;

struct ErrorText {
    ErrorCode code;
    std::string_view key;  ///< English, and the key of its translations
};

/// Every code there is, but 0, with what it means.
inline constexpr std::array errorTexts{
    ErrorText{kPLErrorNoDiskReference, "The disk is no longer available."},
    ErrorText{kPLErrorCouldNotUnmount, "The volume is mounted and could not be unmounted."},
    ErrorText{kPLErrorDiskInUse, "The disk is in use by another program."},
    ErrorText{kPLErrorCancelled, "The operation was stopped."},
    ErrorText{kOVErrorCannotRepairInUse, "The disk cannot be repaired while it is in use."},
    ErrorText{kOVErrorSystemDiskInUse,
              "The disk is in use by the running system and cannot be checked now."},
    ErrorText{kOVErrorDiskInUse, "The disk is in use and cannot be checked now."},
    ErrorText{kPLErrorDamaged, "The volume is damaged; use Repair Disk."},
    ErrorText{kPLErrorDamagedForGood,
              "The volume is damaged, and this kind of volume is not repaired here; copy what "
              "matters to another disk."},
    ErrorText{kPLErrorNoRepairHere,
              "This kind of volume is not repaired here; copy what matters to another disk."},
    ErrorText{kPLErrorUnreadable,
              "The disk cannot be read in places; copy it to another disk first (ddrescue)."},
    ErrorText{kPLErrorCutShort,
              "The end of the volume is missing, and no repair brings it back; copy what matters "
              "to another disk."},
    ErrorText{kPLErrorNotProven,
              "A repair was tried and would leave damage, so nothing was written to the volume."},
    ErrorText{kPLErrorNotTried,
              "The repair could not be tried first, so nothing was written to the volume."},
    ErrorText{kPLErrorInterrupted,
              "An earlier repair of the disk was interrupted; finish it or undo it first."},
    ErrorText{kPLErrorNothingToUndo, "There is no repair of the disk that could be undone."},
    ErrorText{kPLErrorNotUndone, "The repair was not undone; the disk is as the repair left it."},
    ErrorText{kPLErrorNotRepaired, "The volume is still damaged after the repair."},
    ErrorText{kPLErrorInconclusive, "It could not be determined whether the volume is damaged."},
    ErrorText{kPLErrorToolMissing, "The checking tool for this file system is not installed."},
    ErrorText{kPLErrorToolFailed, "The checking tool failed."},
    ErrorText{kPLErrorNoReferences,
              "It is not known here what permissions the installed files should have."},
    ErrorText{kPLErrorPermissionsNotRepaired,
              "Some permissions still differ from what they should be."},
    ErrorText{kPLErrorNotAdministrator, "Only an administrator may repair permissions."},
    ErrorText{kPLErrorNotAuthorized, "It takes an administrator's rights, which were not given."},
    ErrorText{kPLErrorCannotOpen, "The disk could not be opened."},
    ErrorText{kPLErrorUnsupported, "There is no tool for this kind of disk."},
    ErrorText{kPLErrorToolMisbehaved,
              "The checking tool was ended because it no longer worked as it should."},
    ErrorText{kPLErrorDiskChanged, "The disk changed while it was being checked."},
    ErrorText{kPLErrorReadOnly, "The disk cannot be written, so it cannot be repaired."},
    ErrorText{kPLErrorBusy, "Another operation is still running."},
    ErrorText{kPLErrorNoPartitionMap, "There is no partition map on the disk."},
    ErrorText{kPLErrorMapDamaged, "The partition map is damaged, and a repair can restore it."},
    ErrorText{kPLErrorMapNeedsPerson,
              "The partition map is damaged in a way that only a person can put right."},
    ErrorText{kPLErrorMapNotRepaired, "The partition map is damaged and was not repaired."},
};

// A number or a text that stood twice would make one error look like another.
consteval bool everyErrorIsThereOnce()
{
    for (auto text = errorTexts.begin(); text != errorTexts.end(); ++text)
        for (auto other = text + 1; other != errorTexts.end(); ++other)
            if (text->code == other->code || text->key == other->key)
                return false;
    return true;
}
static_assert(everyErrorIsThereOnce());

}  // namespace contract
