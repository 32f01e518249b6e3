// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/toolkit/Control.h"
#include "contract/toolkit/OutlineView.h"

#include <memory>
#include <span>
#include <string_view>
#include <variant>

namespace contract {

/// A place for a control of the interface file; the front end fills it with the control whose
/// name in the file is `name`. A place whose control is missing stays empty.
struct Outlet {
    std::string_view name;
    std::variant<Button**, TextField**, TextView**, OutlineView**> place;
};

/// Who owns an interface file: the module. The front end makes the controls, connects them and
/// sends their actions here.
class InterfaceOwner {
public:
    virtual std::span<const Outlet> outlets() = 0;
    /// The module's own outline view class for the custom widget class of that name in the
    /// interface file; none when the module has no such class. `peer` outlives the view.
    virtual std::unique_ptr<OutlineView> makeOutlineView(std::string_view className,
                                                         OutlineViewPeer& peer) = 0;
    /// The outlets are connected.
    virtual void awakeFromNib() = 0;
    /// Carries out an action of a control or menu. NO when the module has no such action.
    virtual bool perform(Selector action, const void* sender) = 0;

    /// For the data source of the outline view and the delegate of the split view.
    virtual OutlineViewDelegate* outlineViewDelegate() = 0;
    virtual SplitViewDelegate* splitViewDelegate() = 0;

protected:
    ~InterfaceOwner() = default;
};

class InterfaceLoader {
public:
    virtual ~InterfaceLoader() = default;

    /// Makes the controls of the module's interface file `name`, fills the outlets, connects
    /// actions and delegates, and sends awakeFromNib. NO, and nothing done but awakeFromNib, when
    /// there is no such file.
    virtual bool loadInterface(std::string_view name, InterfaceOwner& owner) = 0;
    /// The owner goes away: nothing is sent to it any more.
    virtual void disconnect(InterfaceOwner& owner) = 0;
};

}  // namespace contract
