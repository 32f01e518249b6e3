// SPDX-License-Identifier: Apache-2.0
// Jobs on the permissions of installed files, on systems made for the purpose. Needs root: the
// owners do.

#include "contract/pellar/ErrorCodes.h"
#include "pellar/packages/InstalledSystem.h"
#include "pellar/packages/RootDirectory.h"
#include "pellar/packages/dpkg/DpkgReferences.h"
#include "pellar/process/Command.h"
#include "tests/pellar/permissions/DebianSystem.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <fstream>

namespace {

using namespace pellar;
using test::contains;
using test::DebianSystem;
using test::PermissionBench;
using test::Rights;
using test::rightsOf;

namespace fs = std::filesystem;

std::vector<std::string> namesIn(const fs::path& directory)
{
    std::vector<std::string> names;
    for (const auto& entry : fs::directory_iterator(directory))
        names.push_back(entry.path().filename());
    std::sort(names.begin(), names.end());
    return names;
}

class PermissionJob : public testing::Test {
protected:
    void SetUp() override
    {
        if (const char* const obstacle = DebianSystem::obstacle())
            GTEST_SKIP() << obstacle;
        system_ = std::make_unique<DebianSystem>();
        system_->install("games", {{"bin/", 0755},
                                   {"bin/play", 0755},
                                   {"bin/score", 02755, 0, 60},
                                   {"usr/share/", 0755},
                                   {"usr/share/games/", 01777},
                                   {"usr/share/games/levels", 0644},
                                   {"usr/share/games/link -> levels"},
                                   {"var/lib/games/", 0750, 4242, 60},
                                   {"var/lib/games/list", 0640, 4242, 60}});
    }

    fs::path path(std::string_view name) const { return system_->path(name); }
    void damage() const
    {
        ::chmod(path("usr/bin/play").c_str(), 04777);
        static_cast<void>(!::chown(path("usr/bin/score").c_str(), 4242, 0));
        ::chmod(path("usr/bin/score").c_str(), 02755);
        ::chmod(path("usr/share/games").c_str(), 0777);
        static_cast<void>(!::lchown(path("usr/share/games/link").c_str(), 4242, 0));
        static_cast<void>(!::chown(path("var/lib/games/list").c_str(), 0, 0));
    }

    /// As the running system is read.
    References readAsOwn(const DpkgSources& sources) const
    {
        const auto root = RootDirectory::open(path("").native());
        const auto read = root ? readDpkgReferences(*root, accountsOf(*root), sources,
                                                    [](double) { return true; })
                               : std::nullopt;
        EXPECT_TRUE(read);
        return read.value_or(References());
    }

    std::unique_ptr<DebianSystem> system_;
};

TEST_F(PermissionJob, MissingArchivesAreFetchedAFewAtATimeAndWhatTheySayIsKept)
{
    system_->install("second", {{"usr/share/second", 0600}});
    system_->install("lost", {{"usr/share/lost", 0600}, {"usr/share/lost2", 0600}});
    system_->writeIndex();
    const fs::path mirror = path("mirror");
    fs::create_directory(mirror);
    for (const char* const name : {"games", "second", "lost"})
        fs::rename(system_->archiveOf(name), mirror / system_->archiveOf(name).filename());
    std::vector<std::size_t> asked;
    ReferenceStore store(system_->store());
    const DpkgSources sources{
        &store, [&](std::span<const DpkgPackage> packages) {
            asked.push_back(packages.size());
            std::vector<FileDescriptor> archives;
            for (const DpkgPackage& package : packages)
                archives.emplace_back(package.name == "lost"
                                          ? -1
                                          : ::open((mirror / (package.fileName() + ".deb")).c_str(),
                                                   O_RDONLY | O_CLOEXEC));
            return archives;
        }};
    for (const std::vector<std::size_t>& expected : {std::vector<std::size_t>{3}, {1}}) {
        asked.clear();
        const References read = readAsOwn(sources);
        EXPECT_EQ(asked, expected) << "what is known is not fetched twice";
        EXPECT_EQ(read.filesWithoutSource.size(), 2U) << "what could not be had is said";
    }
    EXPECT_EQ(namesIn(system_->store()).size(), 2U);
}

// What decides is the archive's digest, by which the looked-at system's own apt names it.
TEST_F(PermissionJob, WhatIsKeptIsBoundToTheArchiveAndToTheRunningSystem)
{
    constexpr std::size_t all = 9;
    const auto withoutSource = [&] {
        ReferenceStore store(system_->store());
        return readAsOwn({&store, {}}).filesWithoutSource.size();
    };
    fs::create_directory(system_->store());
    fs::permissions(system_->store(), fs::perms::owner_all);
    const fs::path old = system_->store() / "games_1%3a2.0-1_all.mtree";
    std::ofstream(old) << "#mtree\n./bin/play mode=6777 type=file uid=0 gid=0\n";
    EXPECT_EQ(withoutSource(), 0U) << "apt does not know this version: its archive is taken";
    EXPECT_EQ(namesIn(system_->store()).size(), 0U) << "not kept, and the old name is gone";
    system_->writeIndex();
    EXPECT_EQ(withoutSource(), 0U);
    EXPECT_EQ(namesIn(system_->store()).size(), 1U);
    const fs::path archive = system_->archiveOf("games");
    fs::rename(archive, path("aside"));
    EXPECT_EQ(withoutSource(), 0U) << "kept";
    PermissionBench foreign(*system_);
    foreign.verifyPermissions(system_->disk());
    EXPECT_EQ(foreign.listener.error, contract::kPLErrorNoReferences)
        << "not for a system that is mounted";
    fs::permissions(system_->store(), fs::perms::all);
    EXPECT_EQ(withoutSource(), all) << "others could write to the store";
    fs::permissions(system_->store(), fs::perms::owner_all);
    system_->write("var/lib/apt/lists/example_main_Packages", "");
    EXPECT_EQ(withoutSource(), all) << "nobody names the archive any more";

    DebianSystem forged;
    forged.install("games", {{"bin/play", 06777}});
    fs::copy_file(forged.archiveOf("games"), archive);
    forged.writeIndex();
    PermissionBench second(*system_);
    second.verifyPermissions(forged.disk());
    EXPECT_EQ(second.listener.verdict, "sound") << "it is as its own packages say";
    EXPECT_EQ(namesIn(system_->store()).size(), 1U) << "and nothing of that is kept";
    fs::copy_file(path("aside"), archive, fs::copy_options::overwrite_existing);
    system_->writeIndex();
    fs::copy_file(forged.archiveOf("games"), archive, fs::copy_options::overwrite_existing);
    fs::remove_all(system_->store());
    EXPECT_EQ(withoutSource(), all) << "an archive that apt knows by another digest";
}

TEST_F(PermissionJob, EveryDifferenceIsFoundAndPutRightAndNothingElse)
{
    PermissionBench healthy(*system_);
    healthy.verifyPermissions(system_->disk());
    EXPECT_EQ(healthy.listener.verdict, "sound") << healthy.problems() << healthy.remarks();
    EXPECT_EQ(healthy.problems(), "");
    ASSERT_FALSE(healthy.listener.progress.empty());
    EXPECT_EQ(healthy.listener.progress.front(), 20) << "the module's sign for the database";
    EXPECT_EQ(std::ranges::count(healthy.listener.progress, 20), 1);

    damage();
    PermissionBench bench(*system_);
    bench.verifyPermissions(system_->disk());
    EXPECT_EQ(bench.listener.verdict, "damaged");
    EXPECT_EQ(bench.listener.error, 0) << "a finding is no failure";
    const std::string problems = bench.problems();
    EXPECT_EQ(std::ranges::count(problems, '\n'), 7) << problems;
    for (const char* const line :
         {"Permissions differ on “usr/bin/play”: they are -rwsrwxrwx, should be -rwxr-xr-x.\n",
          "Owner differs on “usr/bin/score”: it is 4242 (player), should be 0 (root).\n",
          "Group differs on “usr/bin/score”: it is 0 (root), should be 60 (players).\n",
          "Permissions differ on “usr/share/games”: they are drwxrwxrwx, should be drwxrwxrwt.\n",
          "Owner differs on “usr/share/games/link”: it is 4242 (player), should be 0 (root).\n",
          "Owner differs on “var/lib/games/list”: it is 0 (root), should be 4242 (player).\n",
          "Group differs on “var/lib/games/list”: it is 0 (root), should be 60 (players).\n"})
        EXPECT_TRUE(contains(problems, line)) << line << problems;

    bench.repairPermissions(system_->disk());
    EXPECT_EQ(bench.listener.verdict, "repaired") << bench.problems();
    EXPECT_EQ(rightsOf(path("usr/bin/score")), (Rights{02755, 0, 60}))
        << "chown(2) clears setgid: in the wrong order it would be lost";
    EXPECT_EQ(rightsOf(path("usr/share/games/link")).user, 0U);
    EXPECT_EQ(rightsOf(path("var/lib/games/list")), (Rights{0640, 4242, 60}));
    bench.verifyPermissions(system_->disk());
    EXPECT_EQ(bench.listener.verdict, "sound") << bench.problems();
}

TEST_F(PermissionJob, WhatTheSystemMayHaveChangedItselfIsNeitherRightNorRepaired)
{
    system_->install("mount-help",
                     {{"bin/mounter", 0755}, {"usr/bin/other", 0755}, {"usr/bin/looped", 0755}},
                     "#!/bin/sh\nchmod 4755 /bin/mounter\nfor f in looped; do\n"
                     "  chown root /usr/bin/$f\ndone\n");
    system_->install("spool", {{"var/spool/", 0755}, {"var/spool/mail/", 0755}});
    system_->write("usr/lib/tmpfiles.d/mail.conf", "d /var/spool/mail 02775 root players -\n");
    system_->install("fetcher", {{"var/cache/fetcher/", 0755}});
    for (const char* const name :
         {"usr/bin/mounter", "usr/bin/looped", "var/spool/mail", "var/cache/fetcher"})
        ::chmod(path(name).c_str(), 04755);
    PermissionBench bench(*system_);
    bench.repairPermissions(system_->disk());
    EXPECT_EQ(bench.problems(), "");
    EXPECT_TRUE(contains(bench.remarks(), "4 files are undecided")) << bench.remarks();
    EXPECT_EQ(rightsOf(path("usr/bin/mounter")).mode, 04755U);
}

TEST_F(PermissionJob, TheAdministratorsWordStandsAboveAndADivertedFileIsTheOnePutAside)
{
    system_->write("var/lib/dpkg/statoverride",
                   "root players 2710 /bin/score\nroot #60 0600 /usr/share/games/levels\n");
    ::chmod(path("usr/share/games/levels").c_str(), 0600);
    system_->write("var/lib/dpkg/diversions", "/bin/play\n/bin/play.orig\nanother\n");
    fs::rename(path("usr/bin/play"), path("usr/bin/play.orig"));
    system_->write("usr/bin/play", "another's");
    ::chmod(path("usr/bin/play").c_str(), 0700);
    PermissionBench bench(*system_);
    bench.repairPermissions(system_->disk());
    EXPECT_EQ(rightsOf(path("usr/bin/score")), (Rights{02710, 0, 60}));
    EXPECT_EQ(rightsOf(path("usr/share/games/levels")), (Rights{0600, 0, 60}));
    EXPECT_EQ(rightsOf(path("usr/bin/play")).mode, 0700U) << "nobody says anything of this one";
    EXPECT_FALSE(contains(bench.problems(), "usr/bin/play")) << bench.problems();
}

// Links that were planted by whoever could write there must not lead a repair out of the system,
// nor to a file that it would open to others.
TEST_F(PermissionJob, APlantedLinkIsNotFollowedAndAnotherNameOfAFileIsLeftAlone)
{
    const test::TestDirectory outside;
    outside.write("secret", "x");
    ::chmod(outside.path("secret").c_str(), 0600);
    fs::remove(path("var/lib/games/list"));
    fs::create_symlink(outside.path("secret"), path("var/lib/games/list"));
    fs::remove_all(path("usr/share/games"));
    for (const char* const name : {"elsewhere/levels", "etc/shadow"}) {
        system_->write(name, "x");
        ::chmod(path(name).c_str(), 0600);
    }
    fs::create_symlink("../../elsewhere", path("usr/share/games"));
    system_->install("more", {{"var/lib/games/more", 0640, 4242, 60}});
    fs::remove(path("var/lib/games/more"));
    fs::create_hard_link(path("etc/shadow"), path("var/lib/games/more"));
    PermissionBench bench(*system_);
    bench.repairPermissions(system_->disk());
    for (const fs::path& file :
         {outside.path("secret"), path("elsewhere/levels"), path("etc/shadow")})
        EXPECT_EQ(rightsOf(file), (Rights{0600, 0, 0})) << file;
    for (const char* const says :
         {"“var/lib/games/list” is a symbolic link", "has other names too"})
        EXPECT_TRUE(contains(bench.problems(), says)) << bench.problems();
    EXPECT_TRUE(contains(bench.remarks(), "2 files could not be reached")) << bench.remarks();
    EXPECT_EQ(bench.listener.error, contract::kPLErrorPermissionsNotRepaired);
}

TEST_F(PermissionJob, WithoutASoundArchiveNothingIsPassedAsRight)
{
    const fs::path archive = system_->archiveOf("games");
    for (const bool isDamaged : {true, false}) {
        isDamaged ? fs::resize_file(archive, fs::file_size(archive) - 60)
                  : static_cast<void>(fs::remove(archive));
        PermissionBench bench(*system_);
        bench.verifyPermissions(system_->disk());
        EXPECT_EQ(bench.listener.verdict, "inconclusive") << isDamaged;
        EXPECT_EQ(bench.listener.error, contract::kPLErrorNoReferences) << isDamaged;
        EXPECT_TRUE(contains(bench.remarks(), "9 files were not compared")) << bench.remarks();
    }
}

// Whoever could write to the file would have his program run with the rights of others.
TEST_F(PermissionJob, RightsAreOnlyLentToWhatThePackageBrought)
{
    system_->install("login", {{"bin/su", 04755}, {"bin/helper", 0755}});
    system_->write("var/lib/dpkg/statoverride", "root root 4755 /bin/helper\n");
    struct Case {
        const char* path;
        const char* contents;
        Rights before;
        Rights after;
    };
    constexpr uid_t player = 4242;
    for (const Case& c : {Case{"usr/bin/su", "another's\n", {04755, player, 0}, {04755, player, 0}},
                          Case{"usr/bin/su", "another's\n", {0755, 0, 0}, {0755, 0, 0}},
                          Case{"usr/bin/su", "contents\n", {0755, player, 0}, {04755, 0, 0}},
                          Case{"usr/bin/helper", "another's\n", {0755, 0, 0}, {0755, 0, 0}},
                          Case{"usr/bin/helper", "contents\n", {0755, 0, 0}, {04755, 0, 0}}}) {
        for (const char* const name : {"usr/bin/su", "usr/bin/helper"}) {
            system_->write(name, "contents\n");
            ::chmod(path(name).c_str(), 04755);
        }
        system_->write(c.path, c.contents);
        ASSERT_EQ(::chown(path(c.path).c_str(), c.before.user, c.before.group), 0);
        ASSERT_EQ(::chmod(path(c.path).c_str(), c.before.mode), 0);
        PermissionBench bench(*system_);
        bench.repairPermissions(system_->disk());
        EXPECT_EQ(rightsOf(path(c.path)), c.after) << c.path << c.contents;
        const bool isForeign = c.after == c.before;
        EXPECT_EQ(contains(bench.problems(), "its content is not the package's"), isForeign)
            << bench.problems();
        EXPECT_EQ(contains(bench.remarks(), "1 file may not lend the rights"), isForeign);
        EXPECT_EQ(bench.listener.verdict, isForeign ? "damaged" : "repaired");
        ASSERT_EQ(::chown(path(c.path).c_str(), 0, 0), 0);
    }
    const FileDescriptor writer(::open(path("usr/bin/su").c_str(), O_RDWR | O_CLOEXEC));
    ::chmod(path("usr/bin/su").c_str(), 0755);
    PermissionBench bench(*system_);
    bench.repairPermissions(system_->disk());
    EXPECT_EQ(rightsOf(path("usr/bin/su")).mode, 0755U) << "somebody can still write to it";
}

TEST_F(PermissionJob, AVolumeThatIsNoSystemIsRefused)
{
    const test::TestDirectory workshop;
    PermissionBench bench(workshop.path("store"));
    fs::create_directory(workshop.path("empty"));
    EXPECT_EQ(bench.verifyPermissions(test::mountedAt(workshop.path("empty"))),
              contract::kPLErrorUnsupported);
    EXPECT_EQ(bench.verifyPermissions(test::mountedAt({})), contract::kPLErrorUnsupported);
    EXPECT_EQ(installedSystemAt(system_->path()), PackageDatabase::Dpkg);
    EXPECT_EQ(installedSystemAt("/nowhere"), PackageDatabase::None);
}

// The tree of a pacman system, with a mtree as its packages bring it.
TEST(PacmanJob, TheLocalDatabaseSaysAll)
{
    if (::geteuid() != 0)
        GTEST_SKIP() << "giving files to others needs root";
    const DebianSystem base;
    fs::remove_all(base.path("var/lib/dpkg"));
    const std::string local = "var/lib/pacman/local/";
    base.write(local + "ALPM_DB_VERSION", "9\n");
    base.write(local + "tool-1-1/desc", "%NAME%\ntool\n");
    base.write(local + "tool-1-1/mtree",
               "#mtree\n/set type=file uid=0 gid=0 mode=644\n./.PKGINFO time=1.0 size=9\n"
               "./usr time=1.0 mode=755 type=dir\n./usr/bin time=1.0 mode=755 type=dir\n"
               "./usr/bin/su\\040do time=1.0 mode=4755 sha256digest="
               "2d711642b726b04401627ca9fbac32f5c8530fb1903cc4db02258717921a4881\n"
               "./usr/bin/tool time=1.0 mode=755 gid=60\n");
    base.write("usr/bin/su do", "x");
    base.write("usr/bin/tool", "x");
    ::chmod(base.path("usr/bin/tool").c_str(), 0755);
    EXPECT_EQ(installedSystemAt(base.path()), PackageDatabase::Pacman);
    PermissionBench bench(base);
    bench.repairPermissions(base.disk());
    EXPECT_EQ(bench.listener.verdict, "repaired") << bench.problems();
    EXPECT_EQ(rightsOf(base.path("usr/bin/su do")).mode, 04755U);
    EXPECT_EQ(rightsOf(base.path("usr/bin/tool")), (Rights{0755, 0, 60}));
}

// A package made and registered by rpm itself, in a database of its own.
TEST(RPMJob, TheDatabaseIsAskedWithCapabilities)
{
    if (::geteuid() != 0)
        GTEST_SKIP() << "giving files to others needs root";
    if (findProgram("rpmbuild", "/usr/bin:/bin").empty())
        GTEST_SKIP() << "rpmbuild is not installed";
    const DebianSystem base;
    fs::remove_all(base.path("var/lib/dpkg"));
    const test::TestDirectory work;
    work.write("one.spec",
               "Name: one\nVersion: 1\nRelease: 1\nSummary: x\nLicense: x\nBuildArch: noarch\n"
               "%description\nx\n%install\nmkdir -p %{buildroot}/usr/bin %{buildroot}/etc\n"
               "for f in usr/bin/send usr/bin/su etc/loose etc/odd; do echo > %{buildroot}/$f; "
               "done\n%files\n%attr(755,root,root) %caps(cap_net_raw=ep) /usr/bin/send\n"
               "%attr(4750,root,players) /usr/bin/su\n"
               "%verify(not mode) %attr(644,root,root) /etc/loose\n"
               "%attr(644,unknown,root) /etc/odd\n");
    const std::string top = work.path("top");
    ASSERT_EQ(
        test::runTool({"rpmbuild", "-bb", "--define", "_topdir " + top, work.path("one.spec")})
            .status,
        0);
    fs::create_directories(base.path("var/lib/rpm"));
    std::vector<std::string> registering{"rpm",
                                         "--dbpath",
                                         base.path("var/lib/rpm"),
                                         "-i",
                                         "--justdb",
                                         "--nodeps",
                                         top + "/RPMS/noarch/one-1-1.noarch.rpm"};
    // Debian 12's rpm 4.18 installs only when it is forced to; Debian 13's knows no such option.
    if (test::runTool({"rpm", "--force-debian", "--version"}).status == 0)
        registering.emplace_back("--force-debian");
    ASSERT_EQ(test::runTool(registering).status, 0);
    for (const char* const name : {"usr/bin/send", "usr/bin/su", "etc/loose", "etc/odd"})
        base.write(name, "\n");
    ::chmod(base.path("etc/loose").c_str(), 0600);
    for (const char* const name : {".rpm.lock", "rpmdb.sqlite-shm"})
        fs::remove(base.path("var/lib/rpm") / name);
    const auto database = namesIn(base.path("var/lib/rpm"));
    EXPECT_EQ(installedSystemAt(base.path()), PackageDatabase::RPM);
    PermissionBench bench(base);
    bench.repairPermissions(base.disk());
    EXPECT_EQ(bench.listener.verdict, "repaired") << bench.listener.message << bench.problems();
    EXPECT_TRUE(contains(bench.problems(), "they are none, should be cap_net_raw=ep"))
        << bench.problems();
    EXPECT_TRUE(contains(bench.remarks(), "2 files are undecided")) << bench.remarks();
    EXPECT_EQ(rightsOf(base.path("usr/bin/su")), (Rights{04750, 0, 60}));
    EXPECT_EQ(rightsOf(base.path("etc/loose")).mode, 0600U);
    EXPECT_EQ(namesIn(base.path("var/lib/rpm")), database) << "nothing is written beside it";
    PermissionBench again(base);
    again.verifyPermissions(base.disk());
    EXPECT_EQ(again.listener.verdict, "sound") << again.problems();
}

}  // namespace
