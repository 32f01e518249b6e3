// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/overlay/FuseMount.h"
#include "pellar/overlay/Overlay.h"

#include <memory>
#include <thread>

namespace pellar {

/// An overlay as a regular file that any program can be given, and opens again by
/// pathOfDescriptor(3): served by a thread of this process through FUSE, and mounted nowhere, so
/// neither a mount nor a file is left however this process ends; a program that still holds it
/// then gets ENOTCONN.
class OverlayFile {
public:
    /// An errno as of `mountDetached`. The overlay outlives it.
    [[nodiscard]] static Result<std::unique_ptr<OverlayFile>, int> present(Overlay& overlay);

    OverlayFile(const OverlayFile&) = delete;
    OverlayFile& operator=(const OverlayFile&) = delete;
    /// What others still hold of it is of no use to them from now on.
    ~OverlayFile();

    /// Open for reading and writing, of the overlay's length.
    int descriptor() const { return file_.get(); }

private:
    class Server;

    explicit OverlayFile(std::unique_ptr<Server> server);

    std::unique_ptr<Server> server_;
    std::thread thread_;
    FileDescriptor file_;
};

}  // namespace pellar
