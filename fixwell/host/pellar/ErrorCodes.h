// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

namespace fixwell {

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

// The library's own.
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

}  // namespace fixwell
