// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "DirectoryScan.h"
#include "contract/foundation/Format.h"
#include "contract/support/HostServices.h"

#include <cstdint>
#include <initializer_list>
#include <string>
#include <string_view>

namespace diskusage {

/// What the tab says of disks, in the user's language. Main thread; host and bundle outlive it.
class UsageText {
public:
    UsageText(contract::HostServices& host, const contract::Bundle& bundle)
        : host_(host), bundle_(bundle)
    {
    }

    /// What it is called, where it is mounted, how full it is: a line or two.
    std::string ofDisk(const contract::OVDisk& disk) const;
    /// What a scan of it found, and what it left out.
    std::string ofScan(const ScanResult& scan) const;
    /// "Measuring “X”: 120 files and folders so far"
    std::string ofProgress(const contract::OVDisk& disk, const ScanProgress& progress) const;

    std::string localized(std::string_view key) const { return bundle_.localizedString(key); }

private:
    std::string sentence(std::string_view key,
                         std::initializer_list<contract::FormatArgument> arguments) const;
    std::string number(std::uint64_t count) const;
    std::string bytes(std::uint64_t count) const;
    std::string omissions(const ScanResult& scan) const;

    contract::HostServices& host_;
    const contract::Bundle& bundle_;
};

}  // namespace diskusage
