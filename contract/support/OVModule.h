// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/support/HostServices.h"

#include <string>
#include <string_view>

namespace contract {

/// What the host knows about the place of one module in its window. Main thread only; outlives
/// the module.
class ModuleSite {
public:
    virtual ~ModuleSite() = default;

    /// The module's tab is the one that is shown.
    virtual bool isActiveTab() const = 0;
    virtual OVWindowController& windowController() = 0;
    /// The disk that the host regards as the tab's subject; none when there is none.
    virtual OVDiskPointer workingDisk() const = 0;
    /// The window that holds the module's view.
    virtual Window& window() = 0;
    /// The module's own bundle.
    virtual Bundle& bundle() = 0;
    virtual PLManager& pl() = 0;
};

/// The base class of the host's modules: one tab of its main window each. Main thread only.
class OVModule {
public:
    OVModule(HostServices& host, ModuleSite& site) : host_(host), site_(site) {}
    OVModule(const OVModule&) = delete;
    OVModule& operator=(const OVModule&) = delete;
    virtual ~OVModule() = default;

    /// Called once, right after construction; NO when the module cannot be used.
    [[nodiscard]] virtual bool init() { return true; }
    virtual void registerForNotifications() {}

    virtual std::string displayName() const = 0;
    virtual Value tabOrder() const = 0;
    virtual std::string dataType() const = 0;

    virtual bool canPrint() { return false; }
    virtual void printModuleSpecific(const void* /*sender*/) {}
    /// Whether the tab is offered for a disk of this type at all.
    virtual bool displayPanelForDiskTypeAndDisk(std::int32_t /*type*/, const OVDiskPointer&)
    {
        return true;
    }
    virtual bool supportsContextMenuForDiskTypeSelectedDisk(std::int32_t, const OVDiskPointer&)
    {
        return false;
    }

    // What the host tells every module.
    virtual void selectionDidChange(const Notification&) {}
    virtual void windowChangedNotication(const Notification&) {}
    virtual void diskChangedHandler(const Notification*) {}

    /// Who receives the callbacks of the disk-management library; none when the module runs no
    /// jobs. The host registers it with the module's manager.
    virtual PLAsyncDelegate* asyncDelegate() { return nullptr; }

protected:
    HostServices& host() const { return host_; }
    OVWindowController& windowController() const { return site_.windowController(); }
    OVDiskController& diskController() const { return host_.sharedDiskController(); }
    OVDiskPointer workingDisk() const { return site_.workingDisk(); }
    bool currentActiveTab() const { return site_.isActiveTab(); }
    PLManager& pl() const { return site_.pl(); }
    /// The window of the module's view.
    Window& utilityViewWindow() const { return site_.window(); }
    Bundle& bundle() const { return site_.bundle(); }

    void simpleModuleAlert(const std::string& title, const std::string& message,
                           ErrorCode error) const
    {
        host_.alerts().simpleModuleAlert(title, message, error);
    }

    // The looks of the first and of the later paragraphs of instructional text.
    static TextStyle instructionalTextParagraphStyle();
    static TextStyle instructionalTextParagraphStyleNoIndent();

private:
    HostServices& host_;
    ModuleSite& site_;
};

inline TextStyle OVModule::instructionalTextParagraphStyle()
{
    ParagraphStyle paragraph;
    paragraph.firstLineIndent = 0;
    paragraph.headIndent = 12;
    paragraph.spacingAfter = 4;
    return {Font::system(11), {}, paragraph};
}

inline TextStyle OVModule::instructionalTextParagraphStyleNoIndent()
{
    ParagraphStyle paragraph;
    paragraph.spacingAfter = 4;
    return {Font::system(11), {}, paragraph};
}

}  // namespace contract
