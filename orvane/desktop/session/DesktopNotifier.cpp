// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/session/DesktopNotifier.h"

#include "contract/foundation/UTF8.h"
#include "contract/pellar/MessageKeys.h"

#include <QDBusMessage>
#include <QDBusPendingCallWatcher>
#include <QDBusPendingReply>
#include <QVariantMap>

#include <algorithm>

namespace orvane::desktop {
namespace {

constexpr std::size_t mostLines = 4;  // a bubble is small

std::string titleOf(const std::vector<FinishedRun>& runs, const Translator& texts)
{
    const StartedRun& first = runs.front().run;
    const bool isRepair = first.task.isRepair() || first.task.isUndo();
    if (runs.size() == 1)
        return texts.sentence(
            isRepair ? texts.text("Repair of “%@”") : texts.text("Verification of “%@”"),
            {contract::printable(first.disk)});
    const long count = static_cast<long>(runs.size());
    return contract::format(
        isRepair ? texts.plural("Repair of %ld disk", "Repair of %ld disks", count)
                 : texts.plural("Verification of %ld disk", "Verification of %ld disks", count),
        {count});
}

std::string lineOf(const FinishedRun& finished, const Translator& texts)
{
    const std::string& message = finished.end.message;
    return noticeMarkup(
        message.empty() ? finished.run.disk + ": " + texts.text(finished.end.verdict) : message);
}

bool isSound(const FinishedRun& finished)
{
    return finished.end.verdict == contract::kPLVerdictSound.text();
}

const QString service = QStringLiteral("org.freedesktop.Notifications");
const QString path = QStringLiteral("/org/freedesktop/Notifications");
const QString clickAction = QStringLiteral("default");

// The server decides how long a notice is to be seen.
constexpr int serversChoice = -1;

}  // namespace

bool isWorthANotice(std::chrono::steady_clock::duration length, bool isWindowActive,
                    std::chrono::steady_clock::duration glance)
{
    return length > glance && !isWindowActive;
}

Notice noticeOf(std::vector<FinishedRun> runs, const Translator& texts)
{
    Notice notice{titleOf(runs, texts), ""};
    std::stable_partition(runs.begin(), runs.end(),
                          [](const FinishedRun& run) { return !isSound(run); });
    const std::size_t shown = runs.size() > mostLines ? mostLines - 1 : runs.size();
    for (std::size_t i = 0; i < shown; ++i)
        notice.body += (i == 0 ? "" : "\n") + lineOf(runs[i], texts);
    if (shown < runs.size())
        notice.body +=
            "\n" + texts.sentence("and %ld more", {static_cast<long>(runs.size() - shown)});
    return notice;
}

std::string noticeMarkup(std::string_view text)
{
    std::string markup;
    for (const char c : contract::printable(text))
        switch (c) {
            case '&': markup += "&amp;"; break;
            case '<': markup += "&lt;"; break;
            case '>': markup += "&gt;"; break;
            default: markup += c;
        }
    return markup;
}

void DesktopNotifier::show(const Notice& notice)
{
    auto bus = options_.bus();
    if (!bus)
        return;
    listen(*bus);
    const QString entry = QString::fromStdString(options_.desktopEntry);
    QDBusMessage call =
        QDBusMessage::createMethodCall(service, path, service, QStringLiteral("Notify"));
    call << QStringLiteral("Orvane") << latest_ << entry << QString::fromStdString(notice.title)
         << QString::fromStdString(notice.body)
         << QStringList{clickAction, QString::fromStdString(options_.show)}
         << QVariantMap{{QStringLiteral("desktop-entry"), entry}} << serversChoice;
    auto* const answer = new QDBusPendingCallWatcher(bus->asyncCall(call), this);
    connect(answer, &QDBusPendingCallWatcher::finished, this, [this, answer] {
        const QDBusPendingReply<uint> number = *answer;
        latest_ = number.isError() ? 0 : number.value();
        answer->deleteLater();
    });
}

void DesktopNotifier::listen(QDBusConnection& bus)
{
    if (std::exchange(isListening_, true))
        return;
    bus.connect(service, path, service, QStringLiteral("ActivationToken"), this,
                SLOT(activationToken(uint, QString)));
    bus.connect(service, path, service, QStringLiteral("ActionInvoked"), this,
                SLOT(actionInvoked(uint, QString)));
}

// Comes before the click where the compositor lets only those windows come to the front whose
// program shows that the user wants it; Qt takes the token from there.
void DesktopNotifier::activationToken(uint notice, const QString& token)
{
    if (notice == latest_ && latest_ != 0)
        qputenv("XDG_ACTIVATION_TOKEN", token.toUtf8());
}

void DesktopNotifier::actionInvoked(uint notice, const QString& action)
{
    if (notice == latest_ && latest_ != 0 && action == clickAction && options_.clicked)
        options_.clicked();
}

}  // namespace orvane::desktop
