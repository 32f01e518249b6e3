// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/toolkit/Control.h"

#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace contract {

/// A question on a sheet. Made by the front end; kept by whoever shows it until it has ended.
class Alert {
public:
    struct Text {
        std::string message;
        std::string informative;
        std::string defaultButton;
        std::string alternateButton;  ///< empty for none
    };

    virtual ~Alert() = default;

    /// The default button first. Valid as long as the alert.
    virtual std::vector<Button*> buttons() = 0;
    /// Shows the sheet on `window`. `end` is called once, later, from the main run loop, with the
    /// tag of the button that was pressed.
    virtual void beginSheetModalForWindow(Window* window,
                                          std::function<void(Alert&, long returnCode)> end) = 0;
    virtual void orderOut() = 0;
};

class Alerts {
public:
    virtual ~Alerts() = default;

    virtual std::shared_ptr<Alert> makeAlert(const Alert::Text& text) = 0;
    /// A warning that only asks to be acknowledged. `title` may be empty; `error` is a code to
    /// explain besides, or 0.
    virtual void simpleModuleAlert(const std::string& title, const std::string& message,
                                   std::int32_t error) = 0;
};

}  // namespace contract
