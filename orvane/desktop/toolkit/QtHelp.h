// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "fixwell/host/foundation/Bundle.h"
#include "fixwell/host/toolkit/Help.h"

#include <QPointer>
#include <QTextBrowser>

#include <filesystem>

namespace orvane::desktop {

/// The help book in a window of its own; no network and no browser is needed.
class QtHelp final : public fixwell::HelpManager {
public:
    /// `book` is an HTML file. `texts` gives the window's own few texts, and outlives this
    /// object.
    QtHelp(std::filesystem::path book, const fixwell::Bundle& texts);
    QtHelp(const QtHelp&) = delete;
    QtHelp& operator=(const QtHelp&) = delete;
    ~QtHelp() override;

    /// Opens the book, or brings it to the front. An empty anchor is the book's beginning. A book
    /// that cannot be read is said so in the window.
    void openHelpAnchor(std::string_view anchor) override;

private:
    QTextBrowser& window();

    std::filesystem::path book_;
    const fixwell::Bundle& texts_;
    QPointer<QTextBrowser> window_;
};

}  // namespace orvane::desktop
