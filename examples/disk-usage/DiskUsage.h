// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "UsageText.h"
#include "contract/support/OVModule.h"

#include <array>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace diskusage {

/// A tab that tells how full the selected disks are and, when it is asked to, what takes the room
/// on them. It reads directories alone and opens no file. Main thread.
class DiskUsage final : public contract::OVModule, public contract::InterfaceOwner {
public:
    DiskUsage(contract::HostServices& host, contract::ModuleSite& site);
    /// A scan that runs ends by itself, and nobody hears of it.
    ~DiskUsage() override;

    bool init() override;
    std::string displayName() const override;
    contract::Value tabOrder() const override { return 50; }
    std::string dataType() const override { return "DiskUsage"; }
    void selectionDidChange(const contract::Notification&) override { show(); }
    void windowChangedNotication(const contract::Notification&) override { show(); }
    void diskChangedHandler(const contract::Notification*) override { show(); }

    // What the interface file has, by the names of its controls.
    std::span<const contract::Outlet> outlets() override { return outlets_; }
    std::unique_ptr<contract::OutlineView> makeOutlineView(std::string_view,
                                                           contract::OutlineViewPeer&) override
    {
        return nullptr;
    }
    void awakeFromNib() override { show(); }
    bool perform(contract::Selector action, const void* sender) override;
    contract::OutlineViewDelegate* outlineViewDelegate() override { return nullptr; }
    contract::SplitViewDelegate* splitViewDelegate() override { return nullptr; }

private:
    struct Run;
    using Disks = std::vector<contract::OVDiskPointer>;

    /// The selected disks, each whole disk with the volumes on it.
    Disks selectedVolumes() const;
    void measure();
    void measured(const contract::OVDiskPointer& disk, ScanResult result);
    void ended();
    void show();
    void showButton(const Disks& volumes);
    std::string textOf(const Disks& volumes) const;

    /// What was measured, and where the disk was mounted then.
    struct Measurement {
        std::string mountPoint;
        ScanResult result;
    };

    UsageText text_;
    contract::TextField* instructions_ = nullptr;
    contract::TextView* usage_ = nullptr;
    contract::Button* measureButton_ = nullptr;
    const std::array<contract::Outlet, 3> outlets_;
    std::map<std::string, Measurement, std::less<>> measurements_;  ///< by disk identifier
    std::shared_ptr<Run> run_;                                      ///< that is under way
};

}  // namespace diskusage
