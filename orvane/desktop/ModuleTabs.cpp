// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/ModuleTabs.h"

#include "contract/toolkit/ControlNames.h"
#include "orvane/desktop/RunNotes.h"
#include "orvane/desktop/toolkit/Text.h"

#include <QLabel>

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
      library_(host_.mainRunLoop(), libraryTexts_, surroundings.libraryOptions)
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
    library_.setDelegate(module_->asyncDelegate());
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
    QtButton* const button = interface_ != nullptr ? interface_->stopButton() : nullptr;
    if (button == nullptr)
        return false;
    button->press();
    return true;
}

void ModuleTabs::load(const std::vector<std::filesystem::path>& bundles,
                      const pellar::JobOptions& libraryOptions, const WarningSink& warn)
{
    std::string switchedOff;
    for (const std::filesystem::path& bundle : bundles) {
        auto tab = ModuleTab::load(bundle, {host_, controller_, libraryOptions});
        if (!tab)
            warn(tab.error().message);
        else if (*tab)
            add(*std::move(tab));
        else
            switchedOff += (switchedOff.empty() ? "" : ", ") + bundle.stem().string();
    }
    if (tabs_.empty())
        addEmptyTab(switchedOff);
}

void ModuleTabs::addEmptyTab(const std::string& switchedOff)
{
    const Translator& texts = host_.translator();
    auto* const label = new QLabel(
        toQt(switchedOff.empty()
                 ? texts.text("No module is installed that could work on disks.")
                 : texts.sentence("%@ is switched off in the settings.", {switchedOff})));
    label->setTextFormat(Qt::PlainText);
    label->setAlignment(Qt::AlignCenter);
    label->setWordWrap(true);
    window_.tabs().addTab(label, toQtTitle(texts.text("No Modules")));
}

void ModuleTabs::add(std::unique_ptr<ModuleTab> tab)
{
    const auto order = [](const std::unique_ptr<ModuleTab>& other) {
        return other->module().tabOrder().integer();
    };
    const auto place = std::find_if(tabs_.begin(), tabs_.end(),
                                    [&](const auto& other) { return order(other) > order(tab); });
    QWidget* const page =
        tab->interface() != nullptr ? &tab->interface()->widget() : new QWidget(&window_);
    window_.tabs().insertTab(static_cast<int>(place - tabs_.begin()), page,
                             toQtTitle(tab->module().displayName()));
    if (tab->interface() != nullptr)
        tab->interface()->setMayPerform([this](std::string_view action) {
            if (mayPerform_ && !mayPerform_(action))
                return false;
            // What is pressed while a job runs, begins none.
            if (!controller_.interfaceLock())
                lastAction_ = action;
            return true;
        });
    if (tab->interface() != nullptr && tab->interface()->outlinePeer() != nullptr)
        tab->interface()->outlinePeer()->setRunKnowledge(
            runKnowledge(host_.histories(), host_.translator()));
    tabs_.insert(place, std::move(tab));
}

ModuleTab* ModuleTabs::active()
{
    const auto current = static_cast<std::size_t>(window_.tabs().currentIndex());
    return current < tabs_.size() ? tabs_[current].get() : nullptr;
}

// Which tab is shown is settled first: a module that hears of the selection asks.
void ModuleTabs::update()
{
    for (const auto& tab : tabs_)
        tab->setActive(tab.get() == active());
    if (ModuleTab* const tab = active())
        tab->tellOfSelection();
}

void ModuleTabs::offer()
{
    for (std::size_t i = 0; i < tabs_.size(); ++i)
        window_.tabs().setTabEnabled(static_cast<int>(i), tabs_[i]->isOffered());
}

void ModuleTabs::setCompact(bool isCompact)
{
    for (const auto& tab : tabs_)
        if (tab->interface() != nullptr)
            tab->interface()->setCompact(isCompact);
}

void ModuleTabs::stopJob()
{
    if (stopHostJob_) {
        stopHostJob_();
        return;
    }
    const bool isStopped =
        std::any_of(tabs_.begin(), tabs_.end(), [](const auto& tab) { return tab->stopJob(); });
    if (!isStopped)
        stopHarder();
}

void ModuleTabs::stopHarder()
{
    if (stopHostJob_)
        stopHostJob_();
    for (const auto& tab : tabs_)
        tab->stopHarder();
}

bool ModuleTabs::lastActionIsCheck() const
{
    namespace selector = contract::selector;
    static constexpr std::array own{std::string_view(),          selector::verifyDisk,
                                    selector::repairDisk,        selector::verifyPermissions,
                                    selector::repairPermissions, selector::showDetails,
                                    selector::clearHistory,      selector::help,
                                    selector::deleteSelected};
    return std::ranges::find(own, lastAction_) != own.end();
}

LoadedInterface* ModuleTabs::interface()
{
    ModuleTab* const tab = active();
    return tab != nullptr ? tab->interface() : nullptr;
}

QtButton* ModuleTabs::button(std::string_view outlet)
{
    LoadedInterface* const controls = interface();
    return controls != nullptr ? controls->button(outlet) : nullptr;
}

contract::OutlineView* ModuleTabs::log()
{
    LoadedInterface* const controls = interface();
    return controls != nullptr ? controls->outlineView() : nullptr;
}

void ModuleTabs::reloadLog()
{
    if (log() != nullptr)
        interface()->outlinePeer()->reloadData();
}

std::string ModuleTabs::selectedLogHTML()
{
    return log() != nullptr ? interface()->outlinePeer()->selectionHTML() : std::string();
}

std::string ModuleTabs::selectedLogText()
{
    return log() != nullptr ? interface()->outlinePeer()->selectionText() : std::string();
}

}  // namespace orvane::desktop
