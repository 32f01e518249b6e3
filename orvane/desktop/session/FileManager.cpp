// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/session/FileManager.h"

#include <QDBusMessage>
#include <QDBusPendingCallWatcher>
#include <QDBusPendingReply>
#include <QFile>
#include <QStringList>

#include <system_error>

namespace orvane::desktop {
namespace {

QUrl urlOf(const std::filesystem::path& path)
{
    return QUrl::fromLocalFile(QFile::decodeName(path.c_str()));
}

}  // namespace

void FileManager::show(const std::filesystem::path& path)
{
    std::error_code ignored;
    const bool isDirectory = std::filesystem::is_directory(path, ignored);
    const std::filesystem::path directory = isDirectory ? path : path.parent_path();
    const auto bus = bus_();
    if (!bus) {
        open(directory);
        return;
    }
    const QString service = QStringLiteral("org.freedesktop.FileManager1");
    QDBusMessage call = QDBusMessage::createMethodCall(
        service, QStringLiteral("/org/freedesktop/FileManager1"), service,
        isDirectory ? QStringLiteral("ShowFolders") : QStringLiteral("ShowItems"));
    call << QStringList{urlOf(path).toString(QUrl::FullyEncoded)} << QString();
    auto* const answer = new QDBusPendingCallWatcher(bus->asyncCall(call), this);
    connect(answer, &QDBusPendingCallWatcher::finished, this, [this, answer, directory] {
        if (QDBusPendingReply<>(*answer).isError())
            open(directory);
        answer->deleteLater();
    });
}

void FileManager::open(const std::filesystem::path& directory)
{
    if (!fallback_.open(urlOf(directory)))
        fallback_.failed();
}

}  // namespace orvane::desktop
