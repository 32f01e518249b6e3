// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/ModuleTab.h"

#include <algorithm>
#include <array>

namespace orvane::desktop {

Result<std::unique_ptr<ModuleTab>, Failure> ModuleTab::load(const std::filesystem::path& bundle,
                                                            const Surroundings& surroundings)
{
    auto loaded = loadModule(bundle);
    if (!loaded)
        return loaded.error();
    auto tab = std::make_unique<ModuleTab>(surroundings, *std::move(loaded));
    if (!shouldRun(tab->loaded_, surroundings.host))
        return std::unique_ptr<ModuleTab>();
    if (const auto made = tab->makeModule(); !made)
        return made.error();
    return tab;
}

ModuleTab::ModuleTab(const Surroundings& surroundings, LoadedModule loaded)
    : host_(surroundings.host),
      window_(surroundings.window),
      loaded_(std::move(loaded)),
      libraryTexts_(host_.hostBundle().catalogue()),
      library_(host_.mainRunLoop(), libraryTexts_, surroundings.libraryOptions),
      observedLibrary_(library_, surroundings.jobs)
{
    libraryTexts_.setResultTexts(loaded_.bundle->catalogue());
}

ModuleTab::~ModuleTab()
{
    if (interface_ != nullptr && interface_->outlineView() != nullptr)
        host_.printing().forget(*interface_->outlineView());
}

Result<void, Failure> ModuleTab::makeModule()
{
    const LoadedInterface* const before = host_.interfaceLoader().latest();
    host_.interfaceLoader().setBundle(*loaded_.bundle);
    auto made = orvane::makeModule(loaded_, host_, *this);
    if (!made)
        return made.error();
    module_ = *std::move(made);
    if (LoadedInterface* const latest = host_.interfaceLoader().latest(); latest != before)
        interface_ = latest;
    observedLibrary_.setDelegate(module_->asyncDelegate());
    return {};
}

contract::OVDiskPointer ModuleTab::workingDisk() const
{
    const auto selected = window_.allSelectedItemsFilterDuplicates(false, true);
    return selected.empty() ? nullptr : selected.front();
}

void ModuleTab::tellOfSelection()
{
    module_->windowChangedNotication({contract::OVDiskChangedNotification, nullptr, {}});
}

void ModuleTab::deliver(const contract::Notification& notification)
{
    module_->diskChangedHandler(&notification);
}

bool ModuleTab::isOffered()
{
    const auto selected = window_.allSelectedItemsFilterDuplicates(false, true);
    return selected.empty() ||
           std::any_of(selected.begin(), selected.end(), [this](const auto& disk) {
               return module_->displayPanelForDiskTypeAndDisk(disk->diskType(), disk);
           });
}

bool ModuleTab::stopJob()
{
    if (interface_ == nullptr)
        return false;
    for (const char* const name : {"verifyDiskButton", "repairDiskButton",
                                   "verifyPermissionsButton", "repairPermissionsButton"}) {
        QtButton* const button = interface_->button(name);
        if (button != nullptr && button->action() == "stopAction:" && button->isEnabled()) {
            button->press();
            return true;
        }
    }
    return false;
}

}  // namespace orvane::desktop
