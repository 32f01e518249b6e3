// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/desktop/session/SessionBuses.h"
#include "orvane/jobs/JobLedger.h"
#include "orvane/support/texts/Catalogue.h"

#include <QObject>
#include <QString>

#include <chrono>
#include <functional>
#include <string>
#include <string_view>
#include <vector>

namespace orvane::desktop {

struct FinishedRun {
    StartedRun run;
    RunEnd end;
};

/// What the desktop is asked to show.
struct Notice {
    std::string title;  ///< plain text
    std::string body;   ///< markup, with everything of ours escaped
};

/// The end of a job that took no longer is no news.
inline constexpr std::chrono::seconds longestGlanceAway{10};

/// Whether a job's end is news to the user: who looks at the window has seen it.
[[nodiscard]] bool isWorthANotice(std::chrono::steady_clock::duration length, bool isWindowActive,
                                  std::chrono::steady_clock::duration glance = longestGlanceAway);

/// What a job did, at least one run, and how it went; what was not found sound comes first.
[[nodiscard]] Notice noticeOf(std::vector<FinishedRun> runs, const Translator& texts);

/// `text` for a notification's body, which is markup (Desktop Notifications Specification,
/// "Markup"): one line in which nothing is a tag.
[[nodiscard]] std::string noticeMarkup(std::string_view text);

/// Shows notices through the desktop's notification server (Desktop Notifications Specification
/// 1.2). Where there is none, nothing happens. Nothing here waits for the server. Main thread.
class DesktopNotifier final : public QObject {
    Q_OBJECT

public:
    struct Options {
        BusLookup bus;
        std::string desktopEntry;   ///< the name of the program's desktop file, and of its icon
        std::string show = "Show";  ///< what a click does, for servers that show it as a button
        std::function<void()> clicked;
    };

    explicit DesktopNotifier(Options options) : options_(std::move(options)) {}

    /// Takes the place of the notice before.
    void show(const Notice& notice);

private slots:
    void actionInvoked(uint notice, const QString& action);
    void activationToken(uint notice, const QString& token);

private:
    void listen(QDBusConnection& bus);

    const Options options_;
    uint latest_ = 0;  ///< the server's number; 0 while it has given none
    bool isListening_ = false;
};

}  // namespace orvane::desktop
