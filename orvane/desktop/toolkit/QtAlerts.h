// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/toolkit/Alert.h"

#include <QPointer>
#include <QWidget>

#include <functional>
#include <memory>
#include <string>

namespace orvane::desktop {

/// Alerts as sheets: modal for their window alone, with plain text only.
class QtAlerts final : public contract::Alerts {
public:
    /// `errorText` explains an error code.
    explicit QtAlerts(std::function<std::string(std::int32_t)> errorText)
        : errorText_(std::move(errorText))
    {
    }

    /// The window that sheets are shown on, whichever window a module names.
    void setWindow(QWidget* window) { window_ = window; }

    /// Asked before a simple alert is shown; YES withholds it, because the host has more to say
    /// about the same.
    void setWithheld(std::function<bool()> isWithheld) { isWithheld_ = std::move(isWithheld); }

    std::shared_ptr<contract::Alert> makeAlert(const contract::Alert::Text& text) override;
    /// Returns at once; the sheet goes away with its button.
    void simpleModuleAlert(const std::string& title, const std::string& message,
                           std::int32_t error) override;

private:
    class Sheet;

    std::function<std::string(std::int32_t)> errorText_;
    std::function<bool()> isWithheld_;
    QPointer<QWidget> window_;
};

}  // namespace orvane::desktop
