// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "orvane/desktop/session/SessionBuses.h"

#include <QObject>
#include <QUrl>

#include <filesystem>
#include <functional>

namespace orvane::desktop {

/// Shows files in the desktop's file manager (org.freedesktop.FileManager1, File Manager D-Bus
/// Interface specification). Where none answers on the session's bus, the directory is opened with
/// what the desktop has for directories. Nothing here waits. Main thread.
class FileManager final : public QObject {
public:
    struct Fallback {
        /// Opens a directory; NO where nothing could be started.
        std::function<bool(const QUrl& directory)> open;
        /// Neither way was possible.
        std::function<void()> failed;
    };

    FileManager(BusLookup bus, Fallback fallback)
        : bus_(std::move(bus)), fallback_(std::move(fallback))
    {
    }

    /// A directory is opened; a file is selected in the directory that it lies in.
    void show(const std::filesystem::path& path);

private:
    void open(const std::filesystem::path& directory);

    const BusLookup bus_;
    const Fallback fallback_;
};

}  // namespace orvane::desktop
