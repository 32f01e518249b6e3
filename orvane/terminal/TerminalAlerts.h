// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/RunLoop.h"
#include "contract/toolkit/Alert.h"
#include "orvane/terminal/Reporter.h"

namespace orvane {

/// Alerts as text. A question is answered by --yes, or asked on the terminal, where only the word
/// for yes confirms; without a terminal it is answered with the button that Return stands for.
class TerminalAlerts final : public contract::Alerts {
public:
    enum class Answer { Confirm, Ask, Decline };

    /// Both outlive this object.
    TerminalAlerts(contract::RunLoop& loop, Reporter& reporter, Answer answer)
        : loop_(loop), reporter_(reporter), answer_(answer)
    {
    }

    std::shared_ptr<contract::Alert> makeAlert(const contract::Alert::Text& text) override;
    void simpleModuleAlert(const std::string& title, const std::string& message,
                           std::int32_t error) override;

    /// A question waits for its answer.
    bool isAsking() const { return isAsking_; }
    /// The last question was not confirmed.
    bool wasDeclined() const { return wasDeclined_; }

private:
    class Question;

    contract::RunLoop& loop_;
    Reporter& reporter_;
    Answer answer_;
    bool isAsking_ = false;
    bool wasDeclined_ = false;
};

}  // namespace orvane
