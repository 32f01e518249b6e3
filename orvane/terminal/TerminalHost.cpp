// SPDX-License-Identifier: Apache-2.0
#include "orvane/terminal/TerminalHost.h"

#include "contract/foundation/UTF8.h"

#include <algorithm>
#include <cctype>
#include <cstdio>
#include <iostream>

namespace orvane {
namespace {

constexpr const char* table = "Orvane";

/// The word, or its first letter; capitals do not matter where they are Latin.
bool confirms(std::string_view answer, std::string_view yes)
{
    const auto isLike = [](std::string_view one, std::string_view other) {
        return std::ranges::equal(one, other, [](unsigned char a, unsigned char b) {
            return std::tolower(a) == std::tolower(b);
        });
    };
    std::string_view rest = yes;
    contract::takeCharacter(rest);
    return isLike(answer, yes) || isLike(answer, yes.substr(0, yes.size() - rest.size()));
}

}  // namespace

class TerminalAlerts::Question final : public contract::Alert,
                                       public std::enable_shared_from_this<Question> {
public:
    Question(TerminalAlerts& alerts, Text text) : alerts_(alerts), text_(std::move(text)) {}

    std::vector<contract::Button*> buttons() override { return {&default_, &alternate_}; }
    void orderOut() override {}

    void beginSheetModalForWindow(contract::Window* /*window*/,
                                  std::function<void(contract::Alert&, long)> end) override
    {
        alerts_.isAsking_ = true;
        alerts_.loop_.performOnMainThread(
            [self = shared_from_this(), end = std::move(end)] {
                const bool isConfirmed = self->isConfirmed();
                self->alerts_.isAsking_ = false;
                self->alerts_.wasDeclined_ = !isConfirmed;
                const TerminalButton& pressed = isConfirmed ? self->default_ : self->alternate_;
                end(*self, static_cast<long>(pressed.tag()));
            },
            contract::RunLoop::Wait::No);
    }

private:
    bool isConfirmed() const
    {
        if (alerts_.answer_ != Answer::Ask)
            return alerts_.answer_ == Answer::Confirm;
        alerts_.reporter_.alert(text_.message, text_.informative);
        std::printf("%s %s ", contract::printable(text_.defaultButton).c_str(),
                    alerts_.texts_.translate(table, "[y/N]").c_str());
        std::fflush(stdout);
        std::string answer;
        std::getline(std::cin, answer);
        return confirms(answer, "Yes") || confirms(answer, alerts_.texts_.translate(table, "Yes"));
    }

    TerminalAlerts& alerts_;
    Text text_;
    TerminalButton default_;
    TerminalButton alternate_;
};

std::shared_ptr<contract::Alert> TerminalAlerts::makeAlert(const contract::Alert::Text& text)
{
    return std::make_shared<Question>(*this, text);
}

void TerminalAlerts::simpleModuleAlert(const std::string& title, const std::string& message,
                                       std::int32_t /*error*/)
{
    reporter_.alert(title, message);
}

TerminalHost::TerminalHost(SupportOptions options, MainLoop& loop, TerminalInterface& interface,
                           TerminalAlerts& alerts, Reporter& reporter,
                           std::optional<bool> showsDetails)
    : SupportHost(std::move(options), loop),
      preferences_(SupportHost::sharedPreferences(), showsDetails),
      interface_(interface),
      alerts_(alerts),
      reporter_(reporter)
{
    // A check goes on from the newest ones; who shows a history has the others read.
    constexpr std::int64_t newestRecords = 128;
    histories().loadGradually([] {}, newestRecords);
    // Every volume of an image is there when the attachment has returned.
    threads().setAttachesSynchronously(true);
}

void TerminalHost::openHelpAnchor(std::string_view /*anchor*/)
{
    reporter_.warning(translator().text("Help is shown by “fixwell --help”."));
}

void TerminalHost::declareTypes(const std::vector<contract::PasteboardType>& /*types*/,
                                const void* /*owner*/)
{
    reporter_.warning(translator().text("Copying is done by the terminal."));
}

void TerminalHost::setData(std::string_view /*data*/, contract::PasteboardType /*type*/) {}

void TerminalHost::runPrintOperation(contract::OutlineView& /*view*/,
                                     const contract::PrintInfo& /*info*/, bool /*showsPanel*/,
                                     contract::Window* /*window*/)
{
    reporter_.warning(translator().text("Printing is done by redirecting “fixwell history”."));
}

}  // namespace orvane
