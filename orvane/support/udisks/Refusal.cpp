// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/udisks/Refusal.h"

#include "contract/foundation/UTF8.h"

#include <algorithm>
#include <array>

namespace orvane {
namespace {

using Kind = Refusal::Kind;

struct KnownError {
    std::string_view prefix;
    Kind kind;
};

// The bus's own names are of the D-Bus specification and sd-bus-errors(3), the others of the
// UDisks2 reference manual ("Error domain"). The first that fits counts.
constexpr std::array knownErrors{
    KnownError{"org.freedesktop.DBus.Error.ServiceUnknown", Kind::NoService},
    KnownError{"org.freedesktop.DBus.Error.NameHasNoOwner", Kind::NoService},
    KnownError{"org.freedesktop.DBus.Error.Spawn.", Kind::NoService},
    KnownError{"org.freedesktop.DBus.Error.NoServer", Kind::NoService},
    KnownError{"org.freedesktop.DBus.Error.FileNotFound", Kind::NoService},
    KnownError{"org.freedesktop.systemd1.", Kind::NoService},
    KnownError{"org.freedesktop.DBus.Error.Disconnected", Kind::Ended},
    KnownError{"org.freedesktop.DBus.Error.Timeout", Kind::NoAnswer},
    KnownError{"org.freedesktop.DBus.Error.TimedOut", Kind::NoAnswer},
    KnownError{"org.freedesktop.DBus.Error.AccessDenied", Kind::NotAllowed},
    KnownError{"org.freedesktop.DBus.Error.UnknownMethod", Kind::NoFilesystem},
    KnownError{"org.freedesktop.DBus.Error.UnknownInterface", Kind::NoFilesystem},
    KnownError{"org.freedesktop.DBus.Error.UnknownObject", Kind::UnknownDevice},
    KnownError{"org.freedesktop.UDisks2.Error.AlreadyMounted", Kind::AlreadySo},
    KnownError{"org.freedesktop.UDisks2.Error.NotMounted", Kind::AlreadySo},
    KnownError{"org.freedesktop.UDisks2.Error.DeviceBusy", Kind::Busy},
    KnownError{"org.freedesktop.UDisks2.Error.NotAuthorizedDismissed", Kind::Dismissed},
    KnownError{"org.freedesktop.UDisks2.Error.NotAuthorized", Kind::NotAllowed},
    KnownError{"org.freedesktop.UDisks2.Error.Timedout", Kind::NoAnswer},
};

// "NoReply" is also how the bus tells that the callee has left: "Message recipient disconnected
// from message bus without replying" (dbus-daemon 1.14). On a time-out it is sd-bus that says so.
Kind kindOfNoReply(std::string_view text)
{
    return text.find("disconnected") != std::string_view::npos ? Kind::Ended : Kind::NoAnswer;
}

}  // namespace

Refusal refusalOf(std::string_view errorName, std::string_view errorText)
{
    const std::string text = contract::printable(errorText);
    if (errorName == "org.freedesktop.DBus.Error.NoReply")
        return {kindOfNoReply(errorText), text};
    const auto* const known =
        std::find_if(knownErrors.begin(), knownErrors.end(),
                     [&](const KnownError& error) { return errorName.starts_with(error.prefix); });
    if (known != knownErrors.end())
        return {known->kind, known->kind == Kind::Busy ? std::string() : text};
    return {Kind::Other, text.empty() ? contract::printable(errorName) : text};
}

bool isLeftToOthers(const Refusal& refusal)
{
    return refusal.kind == Kind::NoService || refusal.kind == Kind::UnknownDevice;
}

bool isSilent(const Refusal& refusal)
{
    return refusal.kind == Kind::AlreadySo || refusal.kind == Kind::Dismissed ||
           refusal.kind == Kind::Abandoned;
}

std::string reasonText(const Refusal& refusal, const Translator& texts)
{
    switch (refusal.kind) {
        case Kind::NoService:
            return texts.text("UDisks2 cannot be reached, and without it only root may do that");
        case Kind::UnknownDevice: return texts.text("UDisks2 does not know it");
        case Kind::NoFilesystem:
            return texts.text("there is no file system on it that can be mounted");
        case Kind::Busy:
            return refusal.detail.empty() ? texts.text("it is in use")
                                          : texts.sentence("it is in use by %@", {refusal.detail});
        case Kind::NotAllowed: return texts.text("you are not allowed to do that");
        case Kind::NoAnswer: return texts.text("UDisks2 did not answer in time");
        case Kind::Ended: return texts.text("UDisks2 ended in the middle of it");
        case Kind::NoTable:
            return texts.text(
                "UDisks2 cannot be reached, and /etc/fstab does not say where to mount it");
        case Kind::HoldsSystem: return texts.text("the system runs from it");
        case Kind::CannotEject: return texts.text("its drive does not eject");
        case Kind::IsImage:
            return texts.text("it is an image file, which has to be attached as a device first");
        case Kind::IsNoImage:
            return texts.text("it is no regular file, or too small to hold a disk");
        case Kind::IsWhole: return texts.text("it is a disk with volumes; name one of them");
        case Kind::IsNoLoop: return texts.text("it is not an attached image");
        case Kind::HasGone: return texts.text("it is no longer there");
        case Kind::Lingers:
            return texts.text("it is still in use, and comes off when it no longer is");
        case Kind::Attached:
            return texts.sentence("it is attached already, as %@", {refusal.detail});
        case Kind::BeingUsed: return texts.text("it is being verified or repaired");
        case Kind::IsReadOnly:
            return texts.text("you may not write to it; it can be attached to be read only");
        case Kind::Dismissed: return texts.text("the authorisation was not given");
        case Kind::AlreadySo: return texts.text("it is so already");
        case Kind::Abandoned:
        case Kind::Other: break;
    }
    return refusal.detail;
}

}  // namespace orvane
