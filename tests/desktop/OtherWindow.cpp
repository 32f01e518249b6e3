// SPDX-License-Identifier: Apache-2.0
#include "tests/desktop/OtherWindow.h"

#include "orvane/desktop/DesktopSession.h"

#include <QTest>

#include <cstdlib>

namespace orvane::desktop::test {
namespace {

constexpr int longestWait = 60'000;  // milliseconds

bool verify(DesktopSession& session, const Disk& disk)
{
    QtButton& button = *session.activeTab()->interface()->button("verifyDiskButton");
    session.window().disks().select(disk);
    button.press();
    return button.title() != "Verify Disk" &&
           QTest::qWaitFor([&] { return button.title() == "Verify Disk"; }, longestWait);
}

}  // namespace

int runOtherWindow(int argc, char** argv)
{
    if (argc != 5)
        return 2;
    const std::filesystem::path directory = argv[2];
    SessionOptions options;
    options.paths = {directory / "config", directory / "state", directory / "cache",
                     directory / "data"};
    options.disksToOpen = {argv[3]};
    options.scansSystemDisks = false;
    DesktopSession session(std::move(options));
    session.show();
    DiskController& disks = session.host().sharedDiskController();
    if (!QTest::qWaitFor([&] { return disks.roots().size() == 2; }, longestWait))
        return 3;
    for (int i = std::atoi(argv[4]); i > 0; --i)
        if (!verify(session, *disks.roots().front()))
            return 1;
    return 0;
}

}  // namespace orvane::desktop::test
