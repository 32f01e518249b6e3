// SPDX-License-Identifier: Apache-2.0
// A module of its own: a tab that says what is selected.
#include "contract/foundation/Format.h"
#include "contract/support/ModuleEntry.h"

#include <array>
#include <exception>
#include <memory>

namespace {

using namespace contract;

class SelectedDisk final : public OVModule, public InterfaceOwner {
public:
    using OVModule::OVModule;
    ~SelectedDisk() override { host().interfaceLoader().disconnect(*this); }

    bool init() override { return host().interfaceLoader().loadInterface("SelectedDisk", *this); }
    std::string displayName() const override
    {
        return bundle().localizedString(localizable("Selection"));
    }
    Value tabOrder() const override { return 50; }
    std::string dataType() const override { return "SelectedDisk"; }
    void windowChangedNotication(const Notification&) override { describe(); }

    // What the interface file has, by the names of its controls.
    std::span<const Outlet> outlets() override { return outlets_; }
    std::unique_ptr<OutlineView> makeOutlineView(std::string_view, OutlineViewPeer&) override
    {
        return nullptr;
    }
    void awakeFromNib() override { describe(); }
    bool perform(Selector, const void*) override { return false; }
    OutlineViewDelegate* outlineViewDelegate() override { return nullptr; }
    SplitViewDelegate* splitViewDelegate() override { return nullptr; }

private:
    void describe()
    {
        if (description_ != nullptr)
            description_->setAttributedStringValue(
                StyledText::make(sentence(), instructionalTextParagraphStyle()));
    }

    std::string sentence() const
    {
        const OVDiskPointer disk = workingDisk();
        if (!disk)
            return bundle().localizedString(localizable("Nothing is selected."));
        const OVFilesystem* const filesystem = disk->filesystem();
        if (filesystem == nullptr)
            return format(bundle().localizedString(
                              localizable("“%@” has no file system that is known here.")),
                          {disk->displayName()});
        return format(
            bundle().localizedString(localizable("“%@” has the file system %@.")),
            {disk->displayName(), filesystem->filesystemType()});
    }

    TextField* description_ = nullptr;
    const std::array<Outlet, 1> outlets_{Outlet{"description", &description_}};
};

bool shouldRun(HostServices&, Bundle&)
{
    return true;
}

// No exception leaves a module.
OVModule* makeModule(HostServices& host, ModuleSite& site)
{
    try {
        auto module = std::make_unique<SelectedDisk>(host, site);
        return module->init() ? module.release() : nullptr;
    } catch (const std::exception&) {
        return nullptr;
    }
}

}  // namespace

extern "C" [[gnu::visibility("default")]] const contract::ModuleEntry* OVModuleEntry()
{
    static const ModuleEntry entry{moduleContractVersion, &shouldRun, &makeModule};
    return &entry;
}
