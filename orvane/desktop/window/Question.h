// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QMessageBox>
#include <QWidget>

#include <functional>
#include <string>
#include <vector>

namespace orvane::desktop {

/// What is asked on a sheet; all of it is plain text in the user's language.
struct Question {
    struct Answer {
        std::string title;
        std::function<void()> chosen;  ///< called when the sheet has closed
    };

    const char* objectName;  ///< also finds the sheet in the window
    std::string text;
    std::string details;
    std::vector<Answer> answers;
    /// Changes nothing. Return and Escape choose it.
    std::string decline;
};

/// Returns at once with the sheet, which goes away with its answer. The window outlives it.
QMessageBox* ask(QWidget& window, const Question& question);

}  // namespace orvane::desktop
