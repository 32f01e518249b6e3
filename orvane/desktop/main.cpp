// SPDX-License-Identifier: Apache-2.0
#include "contract/foundation/Format.h"
#include "contract/foundation/UTF8.h"
#include "orvane/desktop/DesktopSession.h"
#include "orvane/desktop/session/SingleInstance.h"
#include "orvane/desktop/toolkit/ColorScheme.h"
#include "orvane/support/ProgramStart.h"
#include "orvane/support/loop/SignalReader.h"
#include "orvane/support/modules/ModuleSearch.h"
#include "orvane/support/texts/Catalogue.h"
#include "orvane/support/texts/Language.h"

#include <QApplication>
#include <QIcon>
#include <QSocketNotifier>
#include <QStyle>

#include <cstdio>
#include <exception>
#include <functional>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace orvane::desktop {
namespace {

constexpr int exitWrongUsage = 2;

class UsageTexts {
public:
    std::string usage() const
    {
        return contract::format(text("Usage: %@"), {"orvane [IMAGE…]"}) + "\n" +
               text(
                   "Opens the window for checking and repairing disks, with these disk images in "
                   "its list.") +
               "\n" + text("A device, a mount point, LABEL=… or UUID=… selects that disk.") +
               "\n\n  --help       " + text("Show this help") + "\n  --version    " +
               text("Show the version") + "\n\n" + text("“fixwell” does the same in a terminal.") +
               "\n";
    }
    std::string unknown(std::string_view option) const
    {
        return contract::format(text("There is no option “%@”."), {contract::printable(option)}) +
               "\n" + usage();
    }

private:
    std::string text(std::string_view key) const { return texts_.translate("Orvane", key); }

    const Catalogue texts_{hostBundleDirectory(runningExecutable()) / "locale"};
};

/// What is left of the command line when Qt has taken its own options.
struct CommandLine {
    std::vector<std::string> names;
    std::optional<int> exitStatus;
};

CommandLine readCommandLine(int argc, char** argv)
{
    CommandLine line;
    bool takesOptions = true;
    for (int i = 1; i < argc; ++i) {
        const std::string_view argument = argv[i];
        if (!takesOptions || !argument.starts_with("-")) {
            line.names.emplace_back(argument);
        } else if (argument == "--") {
            takesOptions = false;
        } else if (argument == "--help" || argument == "-h") {
            std::fputs(UsageTexts().usage().c_str(), stdout);
            return {{}, 0};
        } else if (argument == "--version") {
            std::puts(("orvane " + std::string(programVersion())).c_str());
            return {{}, 0};
        } else {
            std::fputs(UsageTexts().unknown(argument).c_str(), stderr);
            return {{}, exitWrongUsage};
        }
    }
    return line;
}

bool asksForText(int argc, char** argv)
{
    for (int i = 1; i < argc; ++i)
        for (const std::string_view option : {"--help", "-h", "--version"})
            if (argv[i] == option)
                return true;
    return false;
}

/// Calls back from the event loop for each signal that would end the program. Made before any
/// thread is started.
class TerminationSignals {
public:
    /// From here on, with the application object there, each signal calls `received`.
    void watch(std::function<void()> received)
    {
        if (signals_.descriptor() < 0)
            return;
        notifier_.emplace(signals_.descriptor(), QSocketNotifier::Read);
        QObject::connect(&*notifier_, &QSocketNotifier::activated, &*notifier_,
                         [this, received = std::move(received)] {
                             while (signals_.take())
                                 received();
                         });
    }

private:
    SignalReader signals_;
    std::optional<QSocketNotifier> notifier_;
};

int run(int argc, char** argv)
{
    setInheritanceRight();
    adoptUserLocale();
    // Where there is no display, the application object would end the program.
    if (asksForText(argc, argv))
        return readCommandLine(argc, argv).exitStatus.value_or(0);
    TerminationSignals termination;
    QApplication application(argc, argv);
    if (QApplication::style()->name() == QLatin1String("fusion"))
        QApplication::setStyle(new FramedStyle);
    QApplication::setApplicationName(QStringLiteral("orvane"));
    QApplication::setApplicationDisplayName(QStringLiteral("Orvane"));
    QApplication::setDesktopFileName(QLatin1String(desktopEntry));
    // The desktop has the icon only where the program is installed.
    QApplication::setWindowIcon(QIcon::fromTheme(QLatin1String(desktopEntry),
                                                 QIcon(QStringLiteral(":/icons/program.svg"))));
    const CommandLine line = readCommandLine(argc, argv);
    if (line.exitStatus)
        return *line.exitStatus;

    const SessionBuses buses = realBuses();
    SingleInstance instance(buses.session, desktopEntry);
    if (instance.handOver(line.names))
        return 0;
    std::optional<ColorScheme> colors;
    if (const auto bus = buses.session())
        colors.emplace(*bus);

    SessionOptions options;
    options.disksToOpen = line.names;
    options.buses = buses;
    options.closed = [] {
        QCoreApplication::exit();
    };
    DesktopSession session(std::move(options));
    termination.watch([&session] { session.end(); });
    instance.setEvents({[&session] { session.present(); },
                        [&session](const std::vector<std::string>& names) {
                            session.open(names);
                        }});
    session.show();
    return QApplication::exec();
}

}  // namespace
}  // namespace orvane::desktop

int main(int argc, char** argv)
{
    try {
        return orvane::desktop::run(argc, argv);
    } catch (const std::exception& error) {
        std::fprintf(stderr, "orvane: unexpected failure: %s\n", error.what());
        return 1;
    }
}
