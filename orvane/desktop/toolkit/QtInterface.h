// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Bundle.h"
#include "contract/toolkit/Interface.h"
#include "orvane/desktop/toolkit/LogSearch.h"
#include "orvane/desktop/toolkit/LogTable.h"
#include "orvane/desktop/toolkit/OutlinePeer.h"
#include "orvane/desktop/toolkit/QtControls.h"

#include <QPointer>
#include <QWidget>

#include <functional>
#include <map>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

namespace orvane::desktop {

/// The controls of one module. The loader keeps them, without a module behind them when it has
/// gone.
class LoadedInterface {
public:
    /// `root` is the widget that the interface file describes; this object owns it, wherever it
    /// is put in a window. The window must not be destroyed before the module.
    /// Without the host's texts, its own controls of the log are left out.
    LoadedInterface(std::unique_ptr<QWidget> root, contract::InterfaceOwner& owner,
                    const std::function<void()>& beforeRows, const contract::Bundle* hostTexts);
    LoadedInterface(const LoadedInterface&) = delete;
    LoadedInterface& operator=(const LoadedInterface&) = delete;
    ~LoadedInterface();

    /// To be put in the window; it can be used as long as this object.
    QWidget& widget() { return *root_; }
    /// None when the file has no button of that name.
    QtButton* button(std::string_view name);
    /// The one that stops the module's job now; none when there is none that can be pressed.
    QtButton* stopButton();
    /// Asked before the module performs an action of the user's; where it answers NO, nothing
    /// happens.
    void setMayPerform(std::function<bool(std::string_view action)> asked)
    {
        mayPerform_ = std::move(asked);
    }
    /// Where there is little room, the instructions give theirs to the log.
    void setCompact(bool isCompact);
    /// The module's view of its log, for the menus: copy, select all, delete, validation. None
    /// when the file has none, and after the module has gone.
    contract::OutlineView* outlineView() { return outlineView_.get(); }
    OutlinePeer* outlinePeer() { return peer_.get(); }
    /// The search above the log, for the menus; none where the log has none.
    LogSearch* search() { return search_; }
    /// What the log says while it is empty; none when it says nothing.
    EmptyNote* emptyNote() { return emptyNote_; }

    /// The module goes away: nothing is sent to it any more, and its view is destroyed.
    void disconnect();
    bool belongsTo(const contract::InterfaceOwner& owner) const { return owner_ == &owner; }

private:
    void adoptButtons();
    void fill(const contract::Outlet& outlet);
    void limitSplitView();
    void fitButtons();
    void addHostControls(LogTable& table);
    void makeOutlineView(contract::OutlineView** place, LogTable& table);
    template <class Control, class Widget, class Outlet>
    void fillText(Outlet** place, std::string_view name);

    QPointer<QWidget> root_;
    contract::InterfaceOwner* owner_;
    const std::function<void()>& beforeRows_;
    const contract::Bundle* hostTexts_;
    std::function<bool(std::string_view action)> mayPerform_;
    std::map<std::string, std::unique_ptr<QtButton>, std::less<>> buttons_;
    std::vector<std::unique_ptr<contract::View>> texts_;
    std::unique_ptr<OutlinePeer> peer_;
    QPointer<EmptyNote> emptyNote_;
    QPointer<LogSearch> search_;
    std::unique_ptr<contract::OutlineView> outlineView_;
};

/// Loads interface files, `NAME.ui`, as Qt Designer writes them. A widget's object name is the
/// name of its outlet, a button's dynamic property `action` its first action, and the custom
/// widget class of the log the name of the module's view class. Texts are looked up in the
/// module's bundle. Main thread.
class QtInterface final : public contract::InterfaceLoader {
public:
    /// `beforeRows` is called before new rows of a log are shown. `hostTexts` outlives this object;
    /// without it, logs cannot be searched.
    explicit QtInterface(std::function<void()> beforeRows,
                         const contract::Bundle* hostTexts = nullptr)
        : beforeRows_(std::move(beforeRows)), hostTexts_(hostTexts)
    {
    }

    /// Where the interface file of the module that is made next lies; the bundle must live until
    /// then.
    void setBundle(const contract::Bundle& bundle) { bundle_ = &bundle; }
    /// The interface that was loaded last; none before, or when its file could not be read.
    LoadedInterface* latest() { return loaded_.empty() ? nullptr : loaded_.back().get(); }

    bool loadInterface(std::string_view name, contract::InterfaceOwner& owner) override;
    void disconnect(contract::InterfaceOwner& owner) override;

private:
    std::function<void()> beforeRows_;
    const contract::Bundle* hostTexts_;
    const contract::Bundle* bundle_ = nullptr;
    std::vector<std::unique_ptr<LoadedInterface>> loaded_;
};

}  // namespace orvane::desktop
