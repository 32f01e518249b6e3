// SPDX-License-Identifier: Apache-2.0
// What the helper takes from the program that asks, and from the mount table.

#include "orvane/privileges/AskingProgram.h"
#include "orvane/privileges/MountedSystem.h"
#include "orvane/support/ProgramStart.h"
#include "pellar/process/Command.h"
#include "tests/pellar/JobFixture.h"

#include <gtest/gtest.h>

#include <fcntl.h>
#include <poll.h>
#include <sys/prctl.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <fstream>

namespace orvane {
namespace {

constexpr uid_t somebody = 65534;

/// Runs in a child, whose parent is this program; what it answers.
bool inChild(const std::function<bool()>& question)
{
    return test::statusOfChild([&question] { return question() ? 0 : 1; }) == 0;
}

TEST(AskingProgram, GivesWhatItHasOpenItself)
{
    if (::geteuid() != 0)
        GTEST_SKIP() << "only root may take a file from any program (ptrace(2), Yama)";
    const pellar::test::TestDirectory workshop;
    workshop.write("file", "here");
    const FileDescriptor file(::open(workshop.path("file").c_str(), O_RDONLY | O_CLOEXEC));
    const auto reads = [&file](uid_t user) {
        const auto program = AskingProgram::of(user);
        const FileDescriptor taken = program ? program->take(file.get()) : FileDescriptor();
        char text[5] = {};
        return taken && ::pread(taken.get(), text, 4, 0) == 4 && std::string(text) == "here";
    };
    EXPECT_TRUE(inChild([&] { return reads(::getuid()); }));
    EXPECT_FALSE(inChild([&] { return reads(::getuid() + 1); })) << "another user's program";
    EXPECT_FALSE(inChild([] {
        const auto program = AskingProgram::of(::getuid());
        return program && program->take(1000);
    })) << "nothing is open there";
}

// su(1) has the user's number again when it starts their shell, and may have root's files open.
TEST(AskingProgram, OneThatHadOtherRightsIsNotTrusted)
{
    if (::geteuid() != 0)
        GTEST_SKIP() << "only root can give rights up";
    struct Case {
        uid_t real, effective, saved;
        bool isDumpable, isTrusted;
        std::string_view because;
    };
    for (const Case& c : {
             Case{somebody, somebody, somebody, true, true, "the user's own"},
             Case{somebody, somebody, somebody, false, false, "it had root's rights"},
             Case{somebody, somebody, 0, true, false, "it can have them back"},
             Case{somebody, 0, 0, true, false, "a setuid program"},
         })
        EXPECT_EQ(inChild([&c] {
                      const auto ready = pellar::makePipe().value();
                      const pid_t helper = ::fork();
                      if (helper == 0) {
                          pollfd told{ready.readEnd.get(), POLLIN, 0};
                          ::poll(&told, 1, -1);
                          ::_exit(AskingProgram::of(somebody) ? 0 : 1);
                      }
                      static_cast<void>(!::setresuid(c.real, c.effective, c.saved));
                      ::prctl(PR_SET_DUMPABLE, c.isDumpable ? 1 : 0);
                      static_cast<void>(!::write(ready.writeEnd.get(), "x", 1));
                      int status = -1;
                      ::waitpid(helper, &status, 0);
                      return status == 0;
                  }),
                  c.isTrusted)
            << c.because;
}

TEST(AttachedRegion, TheWayInWhichItIsOpenIsTheLimit)
{
    const pellar::test::TestDirectory workshop;
    workshop.write("image", std::string(8192, 'x'));
    const std::string image = workshop.path("image");
    HelperRequest request;
    request.disk.offset = 4096;
    request.disk.length = 4096;
    struct Case {
        std::string file;
        int mode;
        pellar::Operation operation;
        std::uint64_t length;
        std::string_view reason;
    };
    constexpr auto verify = pellar::Operation::Verify;
    constexpr auto repair = pellar::Operation::Repair;
    constexpr std::string_view noPart = "it is not a part of an image that you have opened";
    for (const Case& c : {
             Case{image, O_RDONLY, repair, 4096, "you may not write to the image"},
             Case{image, O_WRONLY, repair, 4096, noPart},
             Case{image, O_PATH, verify, 4096, noPart},
             Case{image, O_RDONLY, verify, ~std::uint64_t(0), noPart},
             Case{"/dev/null", O_RDWR, verify, 4096, noPart},
         }) {
        request.task.operation = c.operation;
        request.disk.length = c.length;
        const FileDescriptor file(::open(c.file.c_str(), c.mode | O_CLOEXEC));
        const auto attached = attachRegion(file, request);
        ASSERT_FALSE(attached) << c.file;
        EXPECT_EQ(attached.error().reason.key, c.reason) << c.file << c.mode;
    }
}

// What a library prints as root would otherwise go into the disk that is being repaired.
TEST(ProgramStart, NoFileThatIsOpenedLaterTakesTheirPlace)
{
    for (const int closed : {STDIN_FILENO, STDOUT_FILENO, STDERR_FILENO})
        EXPECT_TRUE(inChild([closed] {
            for (int number = closed; number <= STDERR_FILENO; ++number)
                ::close(number);
            setInheritanceRight();
            const FileDescriptor disk(::open("/dev/null", O_RDWR | O_CLOEXEC));
            char byte = 0;
            const bool isAtEnd = closed != STDIN_FILENO || ::read(STDIN_FILENO, &byte, 1) == 0;
            return isAtEnd && disk.get() > STDERR_FILENO && ::write(STDERR_FILENO, "x", 1) < 0;
        })) << closed;
}

TEST(ProgramStart, WhatWasIgnoredOrLimitedMakesNothingElseFail)
{
    EXPECT_TRUE(inChild([] {
        ::signal(SIGCHLD, SIG_IGN);
        setInheritanceRight();
        return inChild([] { return true; });
    })) << "the end of a child is not learnt";
    const pellar::test::TestDirectory workshop;
    EXPECT_TRUE(inChild([&workshop] {
        const rlimit limit{4096, 4096};
        ::setrlimit(RLIMIT_FSIZE, &limit);
        setInheritanceRight();
        const std::string bytes(8192, 'x');
        const FileDescriptor file(
            ::open(workshop.path("file").c_str(), O_WRONLY | O_CREAT | O_CLOEXEC, 0600));
        return ::write(file.get(), bytes.data(), bytes.size()) == 4096 &&
               ::write(file.get(), bytes.data(), bytes.size()) < 0 && errno == EFBIG;
    })) << "a limit on the size of files ends more than the writing";
}

TEST(TrustedWay, RootGoesAndRunsNothingOnAWayThatOthersCouldChange)
{
    if (::geteuid() != 0)
        GTEST_SKIP() << "only root can give files away";
    const std::filesystem::path base("/run/orvane-way-test");
    const auto directory = base / "tools/more";
    const auto program = directory / "e2fsck";
    struct Case {
        std::filesystem::path changed;
        uid_t owner;
        mode_t mode;
        bool isToolFound, isWayOfRoots;
        std::string_view because;
    };
    for (const Case& c : {
             Case{program, 0, 0755, true, true, "root's"},
             Case{program, somebody, 0755, false, true, "another user's"},
             Case{program, 0, 0757, false, true, "written by anybody"},
             Case{directory, somebody, 0755, false, false, "its owner can exchange it"},
             Case{directory.parent_path(), 0, 0777, false, false, "and anybody"},
             Case{directory.parent_path(), 0, 01777, true, false,
                  "not what is another's, as in /tmp"},
         }) {
        std::filesystem::create_directories(directory);
        std::ofstream(program) << "#!/bin/sh\n";
        ASSERT_EQ(::chmod(program.c_str(), 0755), 0);
        ASSERT_EQ(::chmod(c.changed.c_str(), c.mode), 0);
        ASSERT_EQ(::chown(c.changed.c_str(), c.owner, 0), 0);
        EXPECT_EQ(!pellar::findProgram("e2fsck", directory.native()).empty(), c.isToolFound)
            << c.because;
        EXPECT_EQ(isWayOfRootsAlone(program), c.isWayOfRoots) << c.because;
        std::filesystem::remove_all(base);
    }
    std::filesystem::create_directories(directory);
    std::filesystem::create_directory_symlink(directory, base / "link");
    EXPECT_FALSE(isWayOfRootsAlone(base / "link/x")) << "a link leads somewhere else tomorrow";
    std::filesystem::remove_all(base);
}

}  // namespace
}  // namespace orvane
