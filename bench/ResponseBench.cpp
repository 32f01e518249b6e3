// SPDX-License-Identifier: Apache-2.0

// How long the window leaves its user waiting: while a tool prints 400,000 lines a second for five
// seconds, and with a history of a million rows. Needs a display.
// Usage: response-bench TOOL-DIRECTORY SCRATCH-DIRECTORY IMAGE IMAGE, where the tool floods as
// "e2fsck".

#include "orvane/desktop/DesktopSession.h"

#include <QApplication>
#include <QEventLoop>
#include <QScrollBar>
#include <QTest>
#include <QTimer>

#include <algorithm>
#include <atomic>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <thread>

namespace {

using namespace orvane::desktop;
using Clock = std::chrono::steady_clock;

double millisecondsSince(Clock::time_point start)
{
    return std::chrono::duration<double, std::milli>(Clock::now() - start).count();
}

/// Sends an event to the window's thread every two milliseconds, and notes how long each waited.
class Stopwatch {
public:
    Stopwatch()
        : thread_([this](const std::stop_token& stop) {
              while (!stop.stop_requested()) {
                  send();
                  std::this_thread::sleep_for(std::chrono::milliseconds(2));
              }
          })
    {
    }

    /// Sorted, in milliseconds.
    std::vector<double> stop()
    {
        thread_ = {};
        QCoreApplication::processEvents();
        std::sort(waits_.begin(), waits_.end());
        return waits_;
    }

private:
    void send()
    {
        QMetaObject::invokeMethod(
            &receiver_, [this, sent = Clock::now()] { waits_.push_back(millisecondsSince(sent)); },
            Qt::QueuedConnection);
    }

    std::vector<double> waits_;  // main thread
    QObject receiver_;
    std::jthread thread_;
};

double residentMegabytes()
{
    std::ifstream status("/proc/self/status");
    for (std::string line; std::getline(status, line);)
        if (line.starts_with("VmRSS:"))
            return std::atof(line.c_str() + 6) / 1024;
    return 0;
}

void tell(const char* what, const std::vector<double>& waits)
{
    const auto at = [&](double share) {
        return waits[static_cast<std::size_t>(share * static_cast<double>(waits.size() - 1))];
    };
    std::printf("%s: an event waits %.2f ms (median), %.2f (99 of 100), %.2f at most\n", what,
                at(0.5), at(0.99), waits.back());
}

class Bench {
public:
    Bench(std::string image, std::string other, std::filesystem::path scratch)
        : image_(std::move(image)), other_(std::move(other)), scratch_(std::move(scratch))
    {
        open({image_});
    }

    void flood()
    {
        Stopwatch stopwatch;
        const double before = residentMegabytes();
        const Clock::time_point start = Clock::now();
        button("verifyDiskButton").press();
        int looks = 0;
        int lost = 0;
        wait([&] {
            const QScrollBar& bar = *table().verticalScrollBar();
            ++looks;
            lost += bar.value() < bar.maximum() ? 1 : 0;
            return button("verifyDiskButton").title() == "Verify Disk";
        });
        const double taken = millisecondsSince(start);
        tell("400,000 lines a second", stopwatch.stop());
        std::printf(
            "  after %.2f s the window was done; %d rows, %.0f bytes a row; the newest row "
            "was out of sight in %d of %d looks\n",
            taken / 1000, detailedRows(), (residentMegabytes() - before) * 1048576 / detailedRows(),
            lost, looks);
    }

    void reopen()
    {
        session_.reset();
        open({other_, image_});  // the first one is selected
        Stopwatch stopwatch;
        const Clock::time_point start = Clock::now();
        select(1);
        wait([&] { return table().model()->rowCount() > 0; });
        table().viewport()->repaint();
        std::printf("a history of %d rows opens in %.1f ms\n", table().model()->rowCount(),
                    millisecondsSince(start));
        QTest::qWait(500);
        tell("while it opens", stopwatch.stop());
        scroll("brief");
        Clock::time_point press = Clock::now();
        button("showDetailsButton").press();
        table().viewport()->repaint();
        wait([&] { return table().model()->rowCount() > 100000; });
        table().viewport()->repaint();
        std::printf("details (%d rows) appear in %.1f ms\n", table().model()->rowCount(),
                    millisecondsSince(press));
        scroll("detailed");
        button("showDetailsButton").press();
    }

    void close() { session_.reset(); }

private:
    void open(const std::vector<std::string>& images)
    {
        SessionOptions options;
        options.paths = {scratch_ / "config", scratch_ / "state", scratch_ / "cache",
                         scratch_ / "data"};
        options.disksToOpen = images;
        options.scansSystemDisks = false;
        options.outputLimits.lines = 10'000'000;
        session_ = std::make_unique<DesktopSession>(std::move(options));
        session_->show();
        wait([&] {
            return session_->host().sharedDiskController().roots().size() == 2 * images.size();
        });
        select(0);
        QTest::qWait(300);
    }

    void select(int row)
    {
        DiskList& disks = session_->window().disks();
        disks.setCurrentIndex(disks.model()->index(row, 0));
    }

    void scroll(const char* mode)
    {
        QScrollBar& bar = *table().verticalScrollBar();
        std::vector<double> steps;
        for (int i = 0; i <= 200; ++i) {
            const Clock::time_point start = Clock::now();
            bar.setValue(static_cast<int>(static_cast<qint64>(bar.maximum()) * i / 200));
            table().viewport()->repaint();
            steps.push_back(millisecondsSince(start));
        }
        std::sort(steps.begin(), steps.end());
        std::printf("scrolling, %s: a picture takes %.2f ms (median), %.2f at most\n", mode,
                    steps[steps.size() / 2], steps.back());
    }

    int detailedRows()
    {
        if (!button("showDetailsButton").isChecked())
            button("showDetailsButton").press();
        peer().flush();
        const int rows = table().model()->rowCount();
        button("showDetailsButton").press();
        peer().flush();
        return rows;
    }

    // As the program runs: nothing sleeps while there is something to do.
    template <class Question>
    void wait(Question isDone)
    {
        QEventLoop loop;
        QTimer looks;
        QObject::connect(&looks, &QTimer::timeout, &loop, [&] {
            if (isDone())
                loop.quit();
        });
        looks.start(5);
        loop.exec();
    }

    OutlinePeer& peer() { return *session_->activeTab()->interface()->outlinePeer(); }
    LogTable& table() { return peer().table(); }
    QtButton& button(const char* name) { return *session_->activeTab()->interface()->button(name); }

    std::string image_;
    std::string other_;
    std::filesystem::path scratch_;
    std::unique_ptr<DesktopSession> session_;
};

}  // namespace

int main(int argc, char** argv)
{
    std::setvbuf(stdout, nullptr, _IOLBF, 0);
    QApplication application(argc, argv);
    QApplication::setQuitOnLastWindowClosed(false);
    if (argc != 5) {
        std::fprintf(stderr,
                     "Usage: response-bench TOOL-DIRECTORY SCRATCH-DIRECTORY IMAGE IMAGE\n");
        return 2;
    }
    ::setenv("FIXWELL_TOOL_PATH", argv[1], 1);
    std::printf("at the start %.1f MiB are resident\n", residentMegabytes());
    Bench bench(argv[3], argv[4], argv[2]);
    std::printf("with the window open %.1f MiB are resident\n", residentMegabytes());
    bench.flood();
    bench.reopen();
    bench.close();
    return 0;
}
