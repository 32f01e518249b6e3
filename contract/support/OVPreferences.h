// SPDX-License-Identifier: Apache-2.0
#pragma once

namespace contract {

/// The host's preferences. Main thread only.
class OVPreferences {
public:
    virtual ~OVPreferences() = default;

    virtual bool showDetailsInFixwell() const = 0;
    virtual void setShowDetailsInFixwell(bool shows) = 0;
    /// The running system's root volume is mounted read-only, as a rescue system's is.
    virtual bool rootVolumeIsReadOnly() const = 0;
};

}  // namespace contract
