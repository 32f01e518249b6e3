// SPDX-License-Identifier: Apache-2.0
#include "tests/terminal/ProgramTest.h"

#include "tests/support/TestDirectory.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <poll.h>
#include <pty.h>
#include <sys/prctl.h>
#include <sys/syscall.h>
#include <sys/wait.h>
#include <array>
#include <cerrno>
#include <stdexcept>

#include <algorithm>
#include <csignal>
#include <cstdlib>
#include <fstream>
#include <thread>

namespace orvane::test {
namespace {

/// In the child; the test has no threads, so it may allocate there.
[[noreturn]] void execute(Launch launch)
{
    std::vector<std::string> settings;
    for (const auto& [name, value] : launch.environment)
        settings.push_back(name + "=" + value);
    launch.arguments.insert(launch.arguments.begin(), "fixwell");
    const auto pointersTo = [](std::vector<std::string>& texts) {
        std::vector<char*> pointers;
        for (std::string& text : texts)
            pointers.push_back(text.data());
        pointers.push_back(nullptr);
        return pointers;
    };
    const bool isAllowed =
        !launch.user || ::setresuid(*launch.user, *launch.user, *launch.user) == 0;
    if (isAllowed && (launch.directory.empty() || ::chdir(launch.directory.c_str()) == 0))
        ::execve(TERMINAL_PROGRAM, pointersTo(launch.arguments).data(),
                 pointersTo(settings).data());
    ::_exit(127);
}

}  // namespace

Program::Program(const Launch& launch) : deadline_(Clock::now() + launch.limit)
{
    if (launch.columns)
        startOnTerminal(launch);
    else
        startInPipes(launch);
    if (id_ < 0)
        throw std::runtime_error("cannot start the program");
    end_ = FileDescriptor(static_cast<int>(::syscall(SYS_pidfd_open, id_, 0)));
    for (const FileDescriptor* descriptor : {&output_, &errors_})
        if (*descriptor)
            ::fcntl(descriptor->get(), F_SETFL, O_NONBLOCK);
}

Program::~Program()
{
    if (id_ == 0)
        return;
    ::kill(id_, SIGKILL);
    reap();
}

void Program::startInPipes(const Launch& launch)
{
    auto output = pellar::makePipe();
    auto errors = pellar::makePipe();
    if (!output || !errors)
        throw std::runtime_error("cannot make a pipe for the test");
    id_ = ::fork();
    if (id_ == 0) {
        ::dup2(::open("/dev/null", O_RDONLY | O_CLOEXEC), STDIN_FILENO);
        ::dup2(launch.output == Launch::Output::Full ? ::open("/dev/full", O_WRONLY | O_CLOEXEC)
                                                     : output->writeEnd.get(),
               STDOUT_FILENO);
        if (launch.output == Launch::Output::Closed)
            ::close(STDOUT_FILENO);
        ::dup2(errors->writeEnd.get(), STDERR_FILENO);
        execute(launch);
    }
    output_ = std::move(output->readEnd);
    errors_ = std::move(errors->readEnd);
}

void Program::startOnTerminal(const Launch& launch)
{
    winsize size{};
    size.ws_row = 24;
    size.ws_col = *launch.columns;
    int master = -1;
    id_ = ::forkpty(&master, nullptr, nullptr, &size);
    if (id_ == 0)
        execute(launch);
    ::fcntl(master, F_SETFD, FD_CLOEXEC);
    output_ = FileDescriptor(master);
}

bool Program::waitFor(std::string_view text, int times)
{
    std::size_t from = 0;
    while (times > 0) {
        const std::size_t found = result_.output.find(text, from);
        if (found == std::string::npos && !readMore())
            return false;
        if (found == std::string::npos)
            continue;
        from = found + text.size();
        --times;
    }
    return true;
}

void Program::type(std::string_view bytes)
{
    ASSERT_EQ(::write(output_.get(), bytes.data(), bytes.size()),
              static_cast<ssize_t>(bytes.size()));
}

void Program::signal(int number)
{
    ASSERT_EQ(::kill(id_, number), 0);
}

// "ShdPnd: 0000000000000000" in /proc/ID/status: none is pending (proc(5)).
void Program::waitUntilSignalsAreTaken() const
{
    const std::string path = "/proc/" + std::to_string(id_) + "/status";
    for (bool isTaken = false; !isTaken && Clock::now() < deadline_; ::usleep(1000)) {
        std::ifstream status(path);
        for (std::string line; std::getline(status, line);)
            if (line.starts_with("ShdPnd:"))
                isTaken = line.find_first_not_of("0\t ", 7) == std::string::npos;
    }
}

void Program::stopReading()
{
    output_.reset();
    errors_.reset();
}

const RunResult& Program::finish()
{
    while (readMore()) {
    }
    if (id_ != 0)
        reap();
    return result_;
}

/// NO when the program has ended and all that it wrote is read, or when it had to be killed.
bool Program::readMore()
{
    if (id_ == 0)
        return false;
    std::array<pollfd, 3> waits{
        {{output_.get(), POLLIN, 0}, {errors_.get(), POLLIN, 0}, {end_.get(), POLLIN, 0}}};
    const auto left =
        std::chrono::duration_cast<std::chrono::milliseconds>(deadline_ - Clock::now());
    const int count =
        ::poll(waits.data(), waits.size(), static_cast<int>(std::max(left.count(), 0L)));
    if (count <= 0 && errno != EINTR) {
        ADD_FAILURE() << "the program took too long and was killed; it had said:\n"
                      << result_.output.substr(0, 2000) << result_.errors.substr(0, 2000);
        ::kill(id_, SIGKILL);
        reap();
        return false;
    }
    take(output_, result_.output);
    take(errors_, result_.errors);
    if ((waits[2].revents & POLLIN) == 0)
        return true;
    reap();
    return false;
}

/// What is there now. A terminal answers EIO when nobody has its other side open any more.
void Program::take(FileDescriptor& from, std::string& into)
{
    std::array<char, 65536> room;
    while (from) {
        const ssize_t count = ::read(from.get(), room.data(), room.size());
        if (count > 0)
            into.append(room.data(), static_cast<std::size_t>(count));
        else if (count == 0 || (errno != EINTR && errno != EAGAIN))
            from.reset();
        else if (errno == EAGAIN)
            break;
    }
}

void Program::reap()
{
    int status = 0;
    while (::waitpid(id_, &status, 0) < 0 && errno == EINTR) {
    }
    id_ = 0;
    take(output_, result_.output);
    take(errors_, result_.errors);
    result_.status = WIFEXITED(status) ? WEXITSTATUS(status) : -1;
    result_.signal = WIFSIGNALED(status) ? WTERMSIG(status) : 0;
}

// A sanitizer's settings belong to the machine, everything else to the test.
ProgramTest::ProgramTest()
    : environment_{{"PATH", "/usr/sbin:/usr/bin:/sbin:/bin"},
                   {"LC_ALL", "C.UTF-8"},
                   {"TERM", "xterm"},
                   {"HOME", path("home")},
                   {"XDG_STATE_HOME", path("state")},
                   {"XDG_CONFIG_HOME", path("config")}}
{
    for (const char* const name : {"ASAN_OPTIONS", "UBSAN_OPTIONS", "LSAN_OPTIONS"})
        if (const char* const value = std::getenv(name))
            environment_[name] = value;
}

// Whatever the program leaves behind comes to the test.
void ProgramTest::SetUp()
{
    ASSERT_EQ(::prctl(PR_SET_CHILD_SUBREAPER, 1), 0);
}

void ProgramTest::TearDown()
{
    EXPECT_EQ(endStrayProcesses(), 0) << "processes were left behind";
}

Launch ProgramTest::launch(std::vector<std::string> arguments) const
{
    Launch started;
    started.arguments = std::move(arguments);
    started.environment = environment_;
    started.directory = directory_.path();
    return started;
}

RunResult ProgramTest::run(std::vector<std::string> arguments) const
{
    return Program(launch(std::move(arguments))).finish();
}

RunResult ProgramTest::runOnTerminal(std::vector<std::string> arguments) const
{
    Launch started = launch(std::move(arguments));
    started.columns = 80;
    return Program(started).finish();
}

// Without marks of unused inodes all tables are read; they are holes and cost no room.
std::filesystem::path ProgramTest::makeSlowVolume(std::string_view name) const
{
    return makeVolume(name, 6144 * mebibyte, {"-O", "^metadata_csum,^uninit_bg", "-N", "3000000"});
}

std::filesystem::path ProgramTest::makeDamagedVolume(std::string_view name,
                                                     const std::vector<std::string>& options) const
{
    const std::filesystem::path image = makeVolume(name, 8 * mebibyte, options);
    change(image, "clri <2>");
    return image;
}

std::filesystem::path ProgramTest::makeDisk(std::string_view name,
                                            const std::vector<std::filesystem::path>& volumes,
                                            std::string_view label) const
{
    std::string script = "label: " + std::string(label) + "\n";
    std::string contents(1 * mebibyte, '\0');
    for (const std::filesystem::path& volume : volumes) {
        const std::string bytes = contentsOf(volume);
        script += "start=" + std::to_string(contents.size() / 512) +
                  ", size=" + std::to_string(bytes.size() / 512) + "\n";
        contents += bytes;
    }
    write(path(name), contents + std::string(1 * mebibyte, '\0'));
    prepareWith({"sfdisk", "-q", path(name)}, script);
    return path(name);
}

// A tool whose program was killed is killed by the kernel a moment later: two seconds are waited,
// and what is there then was left behind.
int endStrayProcesses()
{
    constexpr std::chrono::milliseconds pause{20};
    for (int i = 0; i < 100 && ::waitpid(-1, nullptr, WNOHANG) >= 0; ++i)
        std::this_thread::sleep_for(pause);
    std::ifstream children("/proc/self/task/" + std::to_string(::getpid()) + "/children");
    for (pid_t child = 0; children >> child;)
        ::kill(child, SIGKILL);
    int reaped = 0;
    while (::waitpid(-1, nullptr, 0) > 0)
        ++reaped;
    return reaped;
}

Events::Events(std::string_view output)
{
    for (const std::string& line : linesOf(output)) {
        nlohmann::json event = nlohmann::json::parse(line, nullptr, false);
        if (event.is_object() && event.contains("event"))
            all_.push_back(std::move(event));
        else
            ADD_FAILURE() << "no event: " << line;
    }
}

std::vector<nlohmann::json> Events::named(std::string_view event) const
{
    std::vector<nlohmann::json> found;
    std::copy_if(all_.begin(), all_.end(), std::back_inserter(found),
                 [event](const nlohmann::json& one) { return one["event"] == event; });
    return found;
}

std::vector<std::string> Events::story(const std::vector<std::string>& names) const
{
    std::vector<std::string> story;
    for (const nlohmann::json& event : all_) {
        std::string line = event["event"];
        if (std::find(names.begin(), names.end(), line) == names.end())
            continue;
        for (const char* key : {"disk", "verdict"})
            if (event.contains(key))
                line += " " + event[key].get<std::string>();
        story.push_back(line);
    }
    return story;
}

std::vector<nlohmann::json> Events::recordsWith(std::string_view part) const
{
    std::vector<nlohmann::json> found = named("record");
    std::erase_if(found, [part](const nlohmann::json& record) {
        return record["text"].get<std::string>().find(part) == std::string::npos;
    });
    return found;
}

std::vector<std::string> linesOf(std::string_view text)
{
    std::vector<std::string> lines;
    while (!text.empty()) {
        const std::size_t end = std::min(text.find('\n'), text.size());
        lines.emplace_back(text.substr(0, end));
        text.remove_prefix(std::min(end + 1, text.size()));
    }
    return lines;
}

std::size_t countOf(std::string_view part, std::string_view text)
{
    std::size_t count = 0;
    for (std::size_t at = text.find(part); at != std::string_view::npos;
         at = text.find(part, at + part.size()))
        ++count;
    return count;
}

bool holdsControls(std::string_view text)
{
    for (std::size_t i = 0; i < text.size(); ++i) {
        const auto byte = static_cast<unsigned char>(text[i]);
        const auto next = static_cast<unsigned char>(i + 1 < text.size() ? text[i + 1] : 0);
        if ((byte < 0x20 && byte != '\n') || byte == 0x7F)
            return true;
        if (byte == 0xC2 && next >= 0x80 && next < 0xA0)  // U+0080 to U+009F, such as CSI
            return true;
    }
    return text.find("\xE2\x80\xAE") != std::string_view::npos;  // right-to-left override
}

}  // namespace orvane::test
