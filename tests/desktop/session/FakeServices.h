// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/process/FileDescriptor.h"

#include <QDBusConnection>
#include <QDBusUnixFileDescriptor>
#include <QObject>
#include <QStringList>
#include <QVariantMap>

#include <poll.h>

#include <vector>

namespace orvane::desktop::test {

/// A notification server that shows nothing and keeps what it was asked to show.
class FakeNotifications : public QObject {
    Q_OBJECT
    Q_CLASSINFO("D-Bus Interface", "org.freedesktop.Notifications")

public:
    struct Shown {
        uint replaced;
        QString title;
        QString body;
        QStringList actions;
    };

    explicit FakeNotifications(QDBusConnection bus)
    {
        bus.registerObject(QStringLiteral("/org/freedesktop/Notifications"), this,
                           QDBusConnection::ExportAllSlots | QDBusConnection::ExportAllSignals);
        bus.registerService(QStringLiteral("org.freedesktop.Notifications"));
    }

    std::vector<Shown> shown;

public slots:
    uint Notify(const QString& /*program*/, uint replaced, const QString& /*icon*/,
                const QString& title, const QString& body, const QStringList& actions,
                const QVariantMap& /*hints*/, int /*milliseconds*/)
    {
        shown.push_back({replaced, title, body, actions});
        return replaced != 0 ? replaced : 7;
    }

signals:
    void ActivationToken(uint notice, const QString& token);
    void ActionInvoked(uint notice, const QString& action);
};

/// A file manager that shows nothing and keeps what it was asked to show.
class FakeFileManager : public QObject {
    Q_OBJECT
    Q_CLASSINFO("D-Bus Interface", "org.freedesktop.FileManager1")

public:
    explicit FakeFileManager(QDBusConnection bus)
    {
        bus.registerObject(QStringLiteral("/org/freedesktop/FileManager1"), this,
                           QDBusConnection::ExportAllSlots);
        bus.registerService(QStringLiteral("org.freedesktop.FileManager1"));
    }

    QStringList items;
    QStringList folders;

public slots:
    void ShowItems(const QStringList& urls, const QString& /*startupID*/) { items += urls; }
    void ShowFolders(const QStringList& urls, const QString& /*startupID*/) { folders += urls; }
};

/// logind's locks, which last until their holder closes the descriptor.
class FakeLogind : public QObject {
    Q_OBJECT
    Q_CLASSINFO("D-Bus Interface", "org.freedesktop.login1.Manager")

public:
    explicit FakeLogind(QDBusConnection bus)
    {
        bus.registerObject(QStringLiteral("/org/freedesktop/login1"), this,
                           QDBusConnection::ExportAllSlots);
        bus.registerService(QStringLiteral("org.freedesktop.login1"));
    }

    std::vector<QStringList> asked;

    /// How many locks have a holder.
    int held() const
    {
        int count = 0;
        for (const pellar::FileDescriptor& lock : locks_) {
            pollfd polled{lock.get(), POLLIN, 0};
            count += ::poll(&polled, 1, 0) == 0 ? 1 : 0;
        }
        return count;
    }

public slots:
    QDBusUnixFileDescriptor Inhibit(const QString& what, const QString& who, const QString& why,
                                    const QString& mode)
    {
        asked.push_back({what, who, why, mode});
        auto pipe = pellar::makePipe();
        locks_.push_back(std::move(pipe->readEnd));
        return QDBusUnixFileDescriptor(pipe->writeEnd.get());
    }

private:
    std::vector<pellar::FileDescriptor> locks_;
};

}  // namespace orvane::desktop::test
