// SPDX-License-Identifier: Apache-2.0
#include "orvane/terminal/DesktopNotice.h"

#include "orvane/support/udisks/BusCall.h"

#include <chrono>
#include <cstdint>
#include <map>

namespace orvane {
namespace {

constexpr std::chrono::seconds longestWait{5};
constexpr const char* service = "org.freedesktop.Notifications";
constexpr std::uint8_t critical = 2;
constexpr std::int32_t untilDismissed = 0;

// A body is markup: nothing of ours may be a tag.
std::string markup(const std::vector<std::string>& lines)
{
    std::string text;
    for (const std::string& line : lines) {
        text += text.empty() ? "" : "\n";
        for (const char c : contract::printable(line))
            text += c == '&' ? "&amp;" : c == '<' ? "&lt;" : c == '>' ? "&gt;" : std::string(1, c);
    }
    return text;
}

void addArguments(sdbus::MethodCall& call, const DesktopNotice& notice)
{
    const std::map<std::string, sdbus::Variant> hints{
        {"urgency", sdbus::Variant(critical)},
        {"desktop-entry", sdbus::Variant(std::string("org.orvane.Orvane"))}};
    call << std::string("Fixwell") << std::uint32_t{0} << std::string("org.orvane.Orvane")
         << notice.title << markup(notice.lines) << std::vector<std::string>() << hints
         << untilDismissed;
}

Failure failure(const std::string& why)
{
    return cannot("notify", service, why);
}

}  // namespace

Result<void, Failure> showOnDesktop(const DesktopNotice& notice)
{
    try {
        const auto bus = sdbus::createSessionBusConnection();
        BusCall call(
            *bus, {"/org/freedesktop/Notifications", service, "Notify", service},
            [&notice](sdbus::MethodCall& message) { addArguments(message, notice); }, longestWait);
        if (const auto answer = call.wait({}, longestWait); !answer)
            return failure(answer.error().detail.empty() ? "it does not answer"
                                                         : answer.error().detail);
        return {};
    } catch (const sdbus::Error& error) {
        return failure(contract::printable(error.getMessage()));
    }
}

}  // namespace orvane
