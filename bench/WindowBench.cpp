// SPDX-License-Identifier: Apache-2.0

// How long programs take from their start to a painted window, one after the other in rounds, so
// that a machine that grows slower does so for all; and what they keep in memory a second later.
// Usage: window-bench ROUNDS PROGRAM [ARGUMENT...] [-- PROGRAM [ARGUMENT...]]...

#include <X11/Xlib.h>
#include <X11/Xutil.h>
#include <fcntl.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <optional>
#include <set>
#include <string>
#include <thread>
#include <vector>

extern char** environ;

namespace {

using Clock = std::chrono::steady_clock;
using Command = std::vector<std::string>;

struct Start {
    double seconds;
    double residentMegabytes;  ///< VmRSS, a second after the window was there
};

/// A window counts as painted when this many colours are in it: a bare background has few.
constexpr std::size_t coloursOfAPaintedWindow = 16;
constexpr auto longestStart = std::chrono::seconds(20);
constexpr int smallestSide = 200;

pid_t spawn(const Command& command)
{
    std::vector<char*> argv;
    for (const std::string& argument : command)
        argv.push_back(const_cast<char*>(argument.c_str()));
    argv.push_back(nullptr);
    posix_spawn_file_actions_t actions;
    ::posix_spawn_file_actions_init(&actions);
    for (const int descriptor : {1, 2})
        ::posix_spawn_file_actions_addopen(&actions, descriptor, "/dev/null", O_WRONLY, 0);
    pid_t child = -1;
    if (::posix_spawnp(&child, argv[0], &actions, nullptr, argv.data(), environ) != 0)
        child = -1;
    ::posix_spawn_file_actions_destroy(&actions);
    return child;
}

bool isPainted(Display* display, const XWindowAttributes& window)
{
    XImage* const image = XGetImage(display, DefaultRootWindow(display), window.x, window.y,
                                    static_cast<unsigned>(window.width),
                                    static_cast<unsigned>(window.height), AllPlanes, ZPixmap);
    if (image == nullptr)
        return false;
    std::set<unsigned long> colours;
    for (int y = 0; y < image->height && colours.size() < coloursOfAPaintedWindow; y += 2)
        for (int x = 0; x < image->width && colours.size() < coloursOfAPaintedWindow; ++x)
            colours.insert(XGetPixel(image, x, y));
    XDestroyImage(image);
    return colours.size() >= coloursOfAPaintedWindow;
}

/// Whether a large window is on the screen, and painted. Windows lie on the screen's own, as no
/// window manager runs.
bool hasPaintedWindow(Display* display)
{
    Window root = 0;
    Window parent = 0;
    Window* windows = nullptr;
    unsigned count = 0;
    XQueryTree(display, DefaultRootWindow(display), &root, &parent, &windows, &count);
    bool isThere = false;
    for (unsigned i = 0; i < count && !isThere; ++i) {
        XWindowAttributes attributes{};
        isThere = XGetWindowAttributes(display, windows[i], &attributes) != 0 &&
                  attributes.map_state == IsViewable && attributes.width >= smallestSide &&
                  attributes.height >= smallestSide && isPainted(display, attributes);
    }
    if (windows != nullptr)
        XFree(windows);
    return isThere;
}

double residentMegabytes(pid_t process)
{
    std::ifstream status("/proc/" + std::to_string(process) + "/status");
    for (std::string line; std::getline(status, line);)
        if (line.starts_with("VmRSS:"))
            return std::atof(line.c_str() + 6) / 1024;
    return 0;
}

std::optional<Start> startOnce(Display* display, const Command& command)
{
    const auto begin = Clock::now();
    const pid_t child = spawn(command);
    if (child < 0)
        return std::nullopt;
    while (!hasPaintedWindow(display) && Clock::now() - begin < longestStart)
        std::this_thread::sleep_for(std::chrono::milliseconds(1));
    const std::chrono::duration<double> taken = Clock::now() - begin;
    std::this_thread::sleep_for(std::chrono::seconds(1));
    const double resident = residentMegabytes(child);
    ::kill(child, SIGTERM);
    int status = 0;
    ::waitpid(child, &status, 0);
    std::this_thread::sleep_for(std::chrono::milliseconds(300));
    if (taken >= longestStart)
        return std::nullopt;
    return Start{taken.count(), resident};
}

template <class Field>
double median(std::vector<Start> starts, Field field)
{
    std::sort(starts.begin(), starts.end(),
              [&](const Start& a, const Start& b) { return a.*field < b.*field; });
    return starts[starts.size() / 2].*field;
}

// Windows come and go while they are looked at.
int ignoreError(Display* /*display*/, XErrorEvent* /*event*/)
{
    return 0;
}

}  // namespace

int main(int argc, char** argv)
{
    if (argc < 3) {
        std::fprintf(stderr, "Usage: window-bench ROUNDS PROGRAM [ARGUMENT...] [-- PROGRAM...]\n");
        return 2;
    }
    std::vector<Command> commands(1);
    for (int i = 2; i < argc; ++i)
        if (std::string(argv[i]) == "--")
            commands.emplace_back();
        else
            commands.back().emplace_back(argv[i]);

    Display* const display = XOpenDisplay(nullptr);
    if (display == nullptr) {
        std::fprintf(stderr, "window-bench: there is no display\n");
        return 1;
    }
    XSetErrorHandler(ignoreError);
    std::vector<std::vector<Start>> starts(commands.size());
    const int rounds = std::max(1, std::atoi(argv[1]));
    for (int round = -1; round < rounds; ++round)
        for (std::size_t i = 0; i < commands.size(); ++i) {
            const std::optional<Start> start = startOnce(display, commands[i]);
            if (!start) {
                std::fprintf(stderr, "window-bench: %s showed no window\n",
                             commands[i].front().c_str());
                return 1;
            }
            if (round >= 0)  // the first round only warms up
                starts[i].push_back(*start);
        }
    for (std::size_t i = 0; i < commands.size(); ++i)
        std::printf("%s: painted after %.3f s, %.1f MiB resident (medians of %d)\n",
                    commands[i].front().c_str(), median(starts[i], &Start::seconds),
                    median(starts[i], &Start::residentMegabytes), rounds);
    XCloseDisplay(display);
    return 0;
}
