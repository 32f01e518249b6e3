// SPDX-License-Identifier: Apache-2.0
#include "pellar/ErrorTexts.h"

#include "fixwell/host/foundation/Format.h"
#include "pellar/ErrorCodes.h"

#include <algorithm>
#include <array>

namespace pellar {
namespace {

struct ErrorText {
    fixwell::ErrorCode code;
    std::string_view key;
};

constexpr std::array texts{
    ErrorText{fixwell::kPLErrorNoDiskReference, "The disk is no longer available."},
    ErrorText{fixwell::kPLErrorCouldNotUnmount,
              "The volume is mounted and could not be unmounted."},
    ErrorText{fixwell::kPLErrorDiskInUse, "The disk is in use by another program."},
    ErrorText{fixwell::kPLErrorCancelled, "The operation was stopped."},
    ErrorText{fixwell::kOVErrorCannotRepairInUse,
              "The disk cannot be repaired while it is in use."},
    ErrorText{fixwell::kOVErrorSystemDiskInUse,
              "The disk is in use by the running system and cannot be checked now."},
    ErrorText{fixwell::kOVErrorDiskInUse, "The disk is in use and cannot be checked now."},
    ErrorText{fixwell::kPLErrorDamaged, "The volume is damaged; use Repair Disk."},
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
    ErrorText{fixwell::kPLErrorNotRepaired, "The volume is still damaged after the repair."},
    ErrorText{fixwell::kPLErrorInconclusive,
              "It could not be determined whether the volume is damaged."},
    ErrorText{fixwell::kPLErrorToolMissing,
              "The checking tool for this file system is not installed."},
    ErrorText{fixwell::kPLErrorToolFailed, "The checking tool failed."},
    ErrorText{kPLErrorNoReferences,
              "It is not known here what permissions the installed files should have."},
    ErrorText{kPLErrorPermissionsNotRepaired,
              "Some permissions still differ from what they should be."},
    ErrorText{kPLErrorNotAdministrator, "Only an administrator may repair permissions."},
    ErrorText{kPLErrorNotAuthorized, "It takes an administrator's rights, which were not given."},
    ErrorText{fixwell::kPLErrorCannotOpen, "The disk could not be opened."},
    ErrorText{fixwell::kPLErrorUnsupported, "There is no tool for this kind of disk."},
    ErrorText{fixwell::kPLErrorToolMisbehaved,
              "The checking tool was ended because it no longer worked as it should."},
    ErrorText{fixwell::kPLErrorDiskChanged, "The disk changed while it was being checked."},
    ErrorText{fixwell::kPLErrorReadOnly, "The disk cannot be written, so it cannot be repaired."},
    ErrorText{fixwell::kPLErrorBusy, "Another operation is still running."},
    ErrorText{kPLErrorNoPartitionMap, "There is no partition map on the disk."},
    ErrorText{kPLErrorMapDamaged, "The partition map is damaged, and a repair can restore it."},
    ErrorText{kPLErrorMapNeedsPerson,
              "The partition map is damaged in a way that only a person can put right."},
    ErrorText{kPLErrorMapNotRepaired, "The partition map is damaged and was not repaired."},
};

// Codes are given out in two headers. A number that stood in both would give one error the other's
// text.
consteval bool everyCodeAndTextIsThereOnce()
{
    for (auto text = texts.begin(); text != texts.end(); ++text)
        for (auto other = text + 1; other != texts.end(); ++other)
            if (text->code == other->code || text->key == other->key)
                return false;
    return true;
}
static_assert(everyCodeAndTextIsThereOnce());

}  // namespace

std::string_view errorTextKey(fixwell::ErrorCode code)
{
    const auto found = std::find_if(texts.begin(), texts.end(),
                                    [code](const ErrorText& text) { return text.code == code; });
    return found == texts.end() ? std::string_view() : found->key;
}

std::string errorText(fixwell::ErrorCode code, const Texts& texts)
{
    const std::string_view key = errorTextKey(code);
    return key.empty() ? fixwell::format(texts.text("Error %ld."), {code}) : texts.text(key);
}

}  // namespace pellar
