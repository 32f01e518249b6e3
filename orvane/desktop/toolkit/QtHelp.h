// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Bundle.h"
#include "contract/support/OVPreferences.h"
#include "contract/toolkit/Help.h"
#include "orvane/desktop/toolkit/HelpWindow.h"

#include <QPointer>

namespace orvane::desktop {

/// The help book in a window of its own; no network and no browser is needed. The book is in the
/// language of the bundle's texts, in `help/LANGUAGE`.
class QtHelp final : public contract::HelpManager {
public:
    /// `bundle` holds the book and the window's own few texts; `settings` keeps the window's size
    /// and place. Both outlive this object.
    QtHelp(const contract::Bundle& bundle, contract::UserDefaults& settings)
        : bundle_(bundle), settings_(settings)
    {
    }
    QtHelp(const QtHelp&) = delete;
    QtHelp& operator=(const QtHelp&) = delete;
    ~QtHelp() override;

    /// Opens the book, or brings it to the front. An empty anchor is the book's beginning. A book
    /// that cannot be read is said so in the window.
    void openHelpAnchor(std::string_view anchor) override;
    /// None while it is closed.
    HelpWindow* window() { return window_; }

private:
    void makeWindow();

    const contract::Bundle& bundle_;
    contract::UserDefaults& settings_;
    QPointer<HelpWindow> window_;
};

}  // namespace orvane::desktop
