// SPDX-License-Identifier: Apache-2.0
// The process that reads what strangers wrote, and what they may have written.

#include "pellar/packages/PackagedFile.h"
#include "pellar/packages/RPMReferences.h"
#include "pellar/packages/RootDirectory.h"
#include "pellar/packages/TemporaryDirectory.h"
#include "pellar/packages/reader/ReaderProcess.h"
#include "pellar/packages/reader/ReferenceBytes.h"
#include "pellar/process/ChildProcess.h"
#include "pellar/process/ReducedRights.h"
#include "tests/pellar/permissions/DebianSystem.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/file.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <chrono>
#include <csignal>
#include <thread>

namespace {

using namespace pellar;

namespace fs = std::filesystem;

Result<References, Sentence> readIn(const fs::path& directory, const Reading& reading,
                                    StopSwitch& stop)
{
    const auto root = RootDirectory::open(directory);
    const ReadingProgress progress = [](double) {
        return true;
    };
    return root ? readApart({*root, {}, progress}, stop, reading) : Sentence{"no root", {}, {}};
}

/// The reader's own word, as the only thing that it can answer: the path of a file.
References saying(const std::string& word)
{
    References references;
    references.filesWithoutSource.push_back(word);
    return references;
}

TEST(ReaderProcess, ReachesNothingButTheFilesItIsGiven)
{
    const test::TestDirectory workshop;
    fs::create_directory(workshop.path("root"));
    workshop.write("root/file", "inside");
    fs::create_symlink("/etc/passwd", workshop.path("root/link"));
    const pid_t host = ::getpid();
    StopSwitch stop;
    const auto answer = readIn(
        workshop.path("root"),
        [host](const RootFiles& root, const auto&, const auto&) -> std::optional<References> {
            const auto isOpen = [](int descriptor) {
                return descriptor >= 0 ? "open " : "";
            };
            std::string word = root.read("file", 100).value_or("nothing") + ' ';
            word += root.openFile("link") || root.openFile("../../etc/passwd") ? "outside " : "";
            word += std::to_string(root.names("").size()) + " names ";
            word += isOpen(::open("/etc/passwd", O_RDONLY));
            word += isOpen(::openat(AT_FDCWD, "/proc/self/status", O_RDONLY));
            word += isOpen(::socket(AF_UNIX, SOCK_STREAM, 0));
            word += ::fork() >= 0 ? "forked " : "";
            word += ::kill(host, 0) == 0 ? "signals " : "";
            char* const arguments[]{nullptr};
            ::execve("/bin/true", arguments, arguments);
            return saying(word);
        },
        stop);
    ASSERT_TRUE(answer) << answer.error().key;
    EXPECT_EQ(answer->filesWithoutSource.at(0), "inside 2 names ");
}

TEST(ReaderProcess, EndsWithASentenceWhateverItDoes)
{
    const test::TestDirectory workshop;
    const Reading crash = [](auto&&...) -> std::optional<References> {
        ::abort();
    };
    const Reading longPath = [](auto&&...) {
        return std::optional(saying(std::string(1U << 20U, 'x')));
    };
    const Reading allMemory = [](auto&&...) -> std::optional<References> {
        for (std::string all;;)
            all.append(1U << 24U, 'x');
    };
    for (const Reading& reading : {crash, longPath, allMemory}) {
        StopSwitch stop;
        const auto answer = readIn(workshop.path(""), reading, stop);
        ASSERT_TRUE(!answer);
        EXPECT_FALSE(answer.error().isEmpty());
    }
    EXPECT_EQ(::waitpid(-1, nullptr, WNOHANG), -1) << "nothing is left to be reaped";
}

TEST(ReaderProcess, IsStoppedInTheMiddleOfALoop)
{
    const test::TestDirectory workshop;
    StopSwitch stop;
    std::thread user([&stop] {
        std::this_thread::sleep_for(std::chrono::milliseconds(100));
        stop.press();
    });
    const auto answer = readIn(
        workshop.path(""),
        [](const auto&, const auto&, const auto&) -> std::optional<References> {
            for (std::string text;; text.clear())
                text.append(1000, 'x');
        },
        stop);
    user.join();
    ASSERT_TRUE(!answer);
    EXPECT_TRUE(answer.error().isEmpty());
    EXPECT_EQ(::waitpid(-1, nullptr, WNOHANG), -1);
}

TEST(ReducedProgram, IsNobodyAndWritesWhereItMay)
{
    if (::geteuid() != 0)
        GTEST_SKIP() << "becoming another user needs root";
    const test::TestDirectory workshop;
    ::chmod(workshop.path("").c_str(), 0755);
    for (const char* const name : {"own", "other"}) {
        fs::create_directory(workshop.path(name));
        ::chmod(workshop.path(name).c_str(), 0777);
    }
    const bool hasLandlock = bool(ruleForWritingBelow(workshop.path("own")));
    const FileDescriptor sink(::open("/dev/null", O_WRONLY | O_CLOEXEC));
    for (const char* const name : {"own/file", "other/file"}) {
        auto started = ChildProcess::start(
            {"/usr/bin/touch", {workshop.path(name)}, true, workshop.path("own")}, {sink.get()});
        ASSERT_TRUE(started);
        static_cast<void>(started->reap());
    }
    ASSERT_TRUE(fs::exists(workshop.path("own/file")));
    EXPECT_EQ(test::rightsOf(workshop.path("own/file")).user, userOfReduced);
    EXPECT_NE(fs::exists(workshop.path("other/file")), hasLandlock);
}

TEST(ReferenceBytes, AreReferencesOrNone)
{
    References references;
    references.files.push_back(
        {"usr/bin/su", FileKind::Regular, 04755, 0, 8, "", Doubt::State, std::string(32, '0')});
    references.packages = 3;
    references.filesWithoutSource = {"a", "b"};
    const std::string bytes = bytesOf(references);
    const auto read = referencesIn(bytes);
    ASSERT_TRUE(read);
    EXPECT_EQ(bytesOf(*read), bytes);
    for (std::size_t i = 0; i < bytes.size(); ++i) {
        std::string changed = bytes;
        changed[i] = static_cast<char>(changed[i] ^ 0x80);
        const auto other = referencesIn(changed);
        EXPECT_TRUE(!other || bytesOf(*other) == changed) << i;
    }
    for (const char* const path : {"", "/etc/passwd"}) {
        references.files.front().path = path;
        EXPECT_FALSE(referencesIn(bytesOf(references))) << path;
    }
}

/// A .deb whose data.tar is these bytes.
std::string debWith(std::string_view data)
{
    std::string bytes = "!<arch>\n";
    const auto add = [&bytes](std::string name, std::string_view member) {
        std::string size = std::to_string(member.size());
        name.resize(16, ' ');
        size.resize(10, ' ');
        bytes += name + "0           0     0     100644  " + size + "`\n" + std::string(member);
        bytes += member.size() % 2 != 0 ? "\n" : "";
    };
    add("debian-binary", "2.0\n");
    add("data.tar", data);
    return bytes;
}

// A library that knows a packing without being able to undo it runs a program found by PATH.
TEST(DebArchive, StartsNoProgramToBeUnpacked)
{
    const test::TestDirectory workshop;
    const std::string before = std::getenv("PATH");
    fs::create_directory(workshop.path("bin"));
    for (const char* const name : {"lrzip", "lzop", "grzip"}) {
        workshop.write(std::string("bin/") + name,
                       "#!/bin/sh\necho >" + workshop.path("ran").native() + "\n");
        ::chmod(workshop.path(std::string("bin/") + name).c_str(), 0755);
    }
    ::setenv("PATH", (workshop.path("bin").native() + ':' + before).c_str(), 1);
    for (const std::string_view magic :
         {std::string_view("LRZI\0\6", 6), std::string_view("\x89LZO\0\r\n\x1A\n", 9),
          std::string_view("GRZipII\0\2\4:)", 12)}) {
        workshop.write("x.deb", debWith(std::string(magic) + std::string(1000, 'x')));
        const FileDescriptor file(::open(workshop.path("x.deb").c_str(), O_RDONLY | O_CLOEXEC));
        const PackagedFiles files = readDebArchive(file.get());
        ASSERT_TRUE(!files);
        EXPECT_EQ(files.error(), PackageFault::Malformed) << magic;
    }
    ::setenv("PATH", before.c_str(), 1);
    EXPECT_FALSE(fs::exists(workshop.path("ran")));
}

TEST(PackageBounds, MoreThanAPackageMayHaveIsNotRead)
{
    std::string equal, many;
    for (std::size_t i = 0; i <= mostFilesOfPackage; ++i) {
        equal += "./a mode=1\n";
        many += "./" + std::to_string(i) + " mode=1\n";
    }
    std::string huge(512, '\0');  // a tar header with a size of 64 GiB
    huge.replace(0, 1, "x");
    huge.replace(100, 7, "0000644");
    huge.replace(124, 12, "777777777777");
    huge.replace(257, 8, std::string_view("ustar\00000", 8));
    unsigned sum = 8 * ' ';
    for (const char c : huge)
        sum += static_cast<unsigned char>(c);
    char text[8];
    std::snprintf(text, sizeof text, "%06o", sum);
    huge.replace(148, 7, std::string_view(text, 7)).replace(155, 1, " ");
    const test::TestDirectory workshop;
    workshop.write("x.deb", debWith(huge));
    const FileDescriptor deb(::open(workshop.path("x.deb").c_str(), O_RDONLY | O_CLOEXEC));
    for (const PackagedFiles& files :
         {parseMtree(equal), parseMtree(many), readDebArchive(deb.get())}) {
        ASSERT_TRUE(!files);
        EXPECT_EQ(files.error(), PackageFault::BeyondBounds);
    }
}

TEST(RPMDatabaseCopy, IsBoundedAndLeavesNothingBehind)
{
    const test::TestDirectory workshop;
    fs::create_directory(workshop.path("tmp"));
    fs::create_directory(workshop.path("db"));
    ::setenv("TMPDIR", workshop.path("tmp").c_str(), 1);
    workshop.write("db/Packages", "SQLite format 3");
    const auto root = RootDirectory::open(workshop.path(""));
    ASSERT_TRUE(root);
    const auto copyOf = [&](std::uintmax_t size, const StopSwitch& stop) {
        fs::resize_file(workshop.path("db/Packages"), size);
        return copyDatabase(*root, "db", stop);
    };
    StopSwitch stop;
    const auto contents = [](const auto& copy) -> std::string {
        return copy ? "copied" : std::string(copy.error().key);
    };
    {
        const auto sparse = copyOf(1U << 30U, stop);
        ASSERT_EQ(contents(sparse), "copied");
        struct stat status = {};
        const auto file = sparse->path() / "Packages";
        ASSERT_EQ(::stat(file.c_str(), &status), 0);
        EXPECT_EQ(status.st_size, 1 << 30);
        EXPECT_LT(status.st_blocks, 1000) << "its holes are holes";
    }
    EXPECT_EQ(contents(copyOf(15ULL << 30U, stop)),
              "the package database is larger than any system's is; it was not read");
    stop.press();
    EXPECT_EQ(contents(copyOf(4096, stop)), "") << "stopped";
    EXPECT_TRUE(fs::is_empty(workshop.path("tmp")));
    // Left by a process that was killed, just made by one, and held by one since long.
    for (const char* const name : {"killed", "young", "held"}) {
        const fs::path left = workshop.path(std::string("tmp/orvane-rpmdb.") + name);
        fs::create_directories(left / "files/deep");
        if (std::string_view(name) != "young")
            fs::last_write_time(left, fs::file_time_type::clock::now() - std::chrono::hours(1));
    }
    const FileDescriptor lock(
        ::open(workshop.path("tmp/orvane-rpmdb.held").c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    ASSERT_EQ(::flock(lock.get(), LOCK_EX | LOCK_NB), 0);
    EXPECT_EQ(contents(copyOf(4096, stop)), "") << "stopped";
    EXPECT_FALSE(fs::exists(workshop.path("tmp/orvane-rpmdb.killed")));
    EXPECT_TRUE(fs::exists(workshop.path("tmp/orvane-rpmdb.young")));
    EXPECT_TRUE(fs::exists(workshop.path("tmp/orvane-rpmdb.held")));
    ::unsetenv("TMPDIR");
}

}  // namespace
