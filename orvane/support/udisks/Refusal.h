// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/support/files/Failure.h"
#include "orvane/support/texts/Catalogue.h"

#include <string>
#include <string_view>

namespace orvane {

/// Why a disk was not mounted, unmounted or ejected, or an image not attached or detached.
struct Refusal {
    enum class Kind {
        NoService,      ///< there is no system bus, or no UDisks2 on it
        UnknownDevice,  ///< UDisks2 has not heard of the device
        NoFilesystem,
        AlreadySo,  ///< mounted, or not mounted, as was wanted
        Busy,       ///< `detail` names who holds it, where that can be seen
        NotAllowed,
        Dismissed,  ///< the user would not say the password
        NoAnswer,   ///< within the time
        Ended,      ///< UDisks2 went away while it worked
        Abandoned,  ///< the program ends
        NoTable,    ///< /etc/fstab does not say where
        CannotEject,
        HoldsSystem,  ///< the system runs from it
        IsImage,      ///< a file, and no device
        IsNoImage,    ///< less than a sector, or no regular file
        IsWhole,      ///< it has volumes, and is none
        IsNoLoop,     ///< a device that no image is behind
        HasGone,
        Lingers,     ///< it goes when it is open no more
        Attached,    ///< an image that is attached already; `detail` names the device
        BeingUsed,   ///< an image that is being verified or repaired
        IsReadOnly,  ///< an image that this user may not write to
        Other,       ///< `detail` says what
    };

    Kind kind = Kind::Other;
    std::string detail;  ///< printable

    friend bool operator==(const Refusal&, const Refusal&) = default;
};

/// What an error that came over the bus means. Its name and text are from outside: any bytes.
[[nodiscard]] Refusal refusalOf(std::string_view errorName, std::string_view errorText);

/// Only the machine itself is left to ask: there is no UDisks2, or it does not know the device.
[[nodiscard]] bool isLeftToOthers(const Refusal& refusal);
/// Nothing that anybody needs to be told.
[[nodiscard]] bool isSilent(const Refusal& refusal);

/// The end of a sentence that begins with what was attempted.
[[nodiscard]] std::string reasonText(const Refusal& refusal, const Translator& texts);

}  // namespace orvane
