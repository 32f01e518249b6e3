// SPDX-License-Identifier: Apache-2.0
#include "pellar/packages/PackagedFile.h"
#include "pellar/packages/RPMReferences.h"
#include "pellar/packages/ScriptMentions.h"
#include "pellar/packages/TemporaryFileRules.h"
#include "pellar/packages/dpkg/AptArchives.h"
#include "pellar/packages/dpkg/DpkgDatabase.h"
#include "pellar/permissions/Inspection.h"

#include <gtest/gtest.h>

namespace {

using namespace pellar;

PathAliases merged()
{
    PathAliases aliases;
    aliases.add("bin", "usr/bin");
    aliases.add("sbin", "/usr/sbin");
    aliases.add("usr/sbin", "bin");
    return aliases;
}

TEST(PathAliases, LeadToThePathWithoutLinks)
{
    struct Case {
        const char* path;
        const char* canonical;
    };
    for (const Case& c :
         {Case{"/bin/x", "usr/bin/x"}, Case{"./sbin/x", "usr/bin/x"}, Case{"bin", "usr/bin"},
          Case{"binary/x", "binary/x"}, Case{"//usr//lib/./x/", "usr/lib/x"}})
        EXPECT_EQ(merged().canonical(c.path), c.canonical) << c.path;
    PathAliases loop;
    loop.add("a", "b");
    loop.add("b", "a");
    EXPECT_FALSE(loop.canonical("a/x").empty()) << "ends";
}

TEST(ModeText, IsThatOfLs)
{
    struct Case {
        FileKind kind;
        mode_t mode;
        const char* text;
    };
    for (const Case& c :
         {Case{FileKind::Regular, 0664, "-rw-rw-r--"}, Case{FileKind::Regular, 04755, "-rwsr-xr-x"},
          Case{FileKind::Regular, 06644, "-rwSr-Sr--"},
          Case{FileKind::Directory, 01777, "drwxrwxrwt"},
          Case{FileKind::Directory, 01770, "drwxrwx--T"}})
        EXPECT_EQ(modeText(c.kind, c.mode), c.text);
}

TEST(Comparison, SeesWhatAFileOfItsKindHas)
{
    const Permissions file{FileKind::Regular, 0755, 1, 2, "cap_net_raw=ep"};
    Reference should{"x", FileKind::Regular, 0755, 1, 2, "cap_net_raw=ep", Doubt::None, {}};
    EXPECT_TRUE(compare(should, file).isNone());
    should.capabilities.reset();
    EXPECT_TRUE(compare(should, file).isNone()) << "the source does not tell capabilities";
    should.capabilities = "";
    EXPECT_EQ(compare(should, file), (Difference{false, false, false, false, true}));
    should.kind = FileKind::SymbolicLink;
    EXPECT_EQ(compare(should, file), (Difference{true, false, false, false, false}));
    const Permissions link{FileKind::SymbolicLink, 0777, 5, 2, ""};
    EXPECT_EQ(compare(should, link), (Difference{false, false, true, false, false}));
}

TEST(ScriptMentions, DoubtWhatAScriptMaySet)
{
    struct Case {
        const char* script;
        const char* path;
        FileKind kind;
        bool isConcerned;
        std::string_view because;
    };
    constexpr auto regular = FileKind::Regular;
    constexpr auto directory = FileKind::Directory;
    for (const Case& c : {
             Case{"chmod 4755 /bin/fusermount3", "usr/bin/fusermount3", regular, true, "by alias"},
             Case{"echo /bin/x", "usr/bin/x", regular, false, "sets nothing"},
             Case{"F=/usr/bin/x\nchmod u+s \"$F\"", "usr/bin/x", regular, true, "a variable"},
             Case{"for f in su mount; do chmod u+s /bin/$f; done", "usr/bin/su", regular, true,
                  "a loop over names"},
             Case{"D=/var/lib/x\nchown u $D/y", "var/lib/x/y", regular, true, "a path's end"},
             Case{"chown -R u:g /var/lib/x", "var/lib/x/deep/file", regular, true, "a whole tree"},
             Case{"chown -R u:g /var/lib/x", "var/lib/xy", regular, false, "another's name"},
             Case{"install -m 644 a /etc/b\nls /usr/bin", "usr/bin", directory, false,
                  "only spoken of"},
             Case{"chmod 644 /usr/share/x/*.so", "usr/share/x/a.so", regular, true, "a pattern"},
             Case{"chmod 4755 /usr/bin/$x", "usr/bin", directory, false, "only what is in it"},
             Case{"chmod \\\n 700 /usr/lib", "usr/lib", directory, true, "a continued line"},
             Case{"set_perms polkitd root 700 /etc/polkit-1/rules.d\nchown a \"$1\"",
                  "etc/polkit-1/rules.d", directory, true, "a function"},
             Case{"dpkg-statoverride --add root g 710 \"/etc/ssl/private\"", "etc/ssl/private",
                  directory, true, "quoted"},
             Case{"D=/var/lib/x\nchown u $D/y", "var/lib/x/yy", regular, false, "another's end"},
             Case{"setcap cap_net_raw+ep /bin/ping", "usr/bin/ping", regular, true, "capabilities"},
         }) {
        ScriptMentions mentions;
        mentions.add(c.script, merged());
        EXPECT_EQ(mentions.mayConcernOwn(c.path, c.kind), c.isConcerned) << c.because;
    }
}

TEST(TemporaryFileRules, ConcernWhatTheySet)
{
    TemporaryFileRules rules;
    rules.add(
        "# a comment\nd /run/a 1777 root root 10d -\nd /var/b - - -\nz /etc/c* 0600 - -\n"
        "Z /var/log/d 0750\nx /tmp/e 0700\nf+ \"/etc/f\" 0644 root root\n",
        {});
    struct Case {
        const char* path;
        bool isConcerned;
    };
    for (const Case& c : {Case{"run/a", true}, Case{"var/b", false}, Case{"etc/cat", true},
                          Case{"etc/c/x", false}, Case{"var/log/d/deep/x", true},
                          Case{"tmp/e", false}, Case{"etc/f", true}, Case{"etc", false}})
        EXPECT_EQ(rules.concern(c.path), c.isConcerned) << c.path;
}

TEST(DpkgStatus, TellsWhatIsThere)
{
    const auto packages = parseDpkgStatus(
        "Package: a\nStatus: install ok installed\nVersion: 1:2\nArchitecture: amd64\n"
        "Description: x\n Package: forged\n\n"
        "Package: gone\nStatus: deinstall ok config-files\nVersion: 1\nArchitecture: all\n\n"
        "Package: half\nStatus: install ok half-configured\nVersion: 1\nArchitecture: all\n\n"
        "Package: ../../etc/x\nStatus: install ok installed\nVersion: 1\nArchitecture: all\n\n"
        "Package: last\nStatus: install ok triggers-pending\nVersion: 1\nArchitecture: all");
    ASSERT_EQ(packages.size(), 3U);
    EXPECT_EQ(packages[0].fileName(), "a_1%3a2_amd64");
    EXPECT_FALSE(packages[1].isConfigured);
    EXPECT_TRUE(packages[2].isConfigured);
}

TEST(ArchiveAddress, IsOnlyTakenWithAHash)
{
    EXPECT_EQ(parseArchiveAddress("'http://a/h_1_all.deb' h_1_all.deb 53 SHA256:2e6e"),
              (ArchiveAddress{"http://a/h_1_all.deb", "h_1_all.deb", "SHA256:2e6e"}));
    for (const char* const line :
         {"'http://a/h_1_all.deb' h_1_all.deb 53 ",
          "'http://a/h_1_all.deb' h_1_all.deb 53 MD5Sum:2", "'file:/etc/shadow' a 53 SHA256:2e6e",
          "E: Can't find a source", ""})
        EXPECT_FALSE(parseArchiveAddress(line)) << line;
}

TEST(RPMFiles, ALineIsOneFileOrNone)
{
    Accounts accounts{AccountNames("root:x:0:0\nmail:x:8:8\n"), AccountNames("root:x:0:\n")};
    const std::string good = "104755\t0\t4294967295\t0\tmail\troot\t\t\t/bin/x\ty";
    const RPMFile file = parseRPMFile(good, accounts, merged());
    EXPECT_EQ(file.line, RPMLine::File);
    EXPECT_EQ(file.reference.path, "usr/bin/x\ty");
    EXPECT_EQ(file.reference.mode, 04755U);
    EXPECT_EQ(file.reference.user, 8U);
    EXPECT_EQ(file.reference.doubt, Doubt::None);
    const auto doubtOf = [&](std::string_view line) {
        return parseRPMFile(line, accounts, merged()).reference.doubt;
    };
    EXPECT_EQ(doubtOf("100644\t0\t4294967295\t0\tnobody\troot\t\t\t/a"), Doubt::UnknownAccount);
    EXPECT_EQ(doubtOf("100644\t0\t4294967207\t0\troot\troot\t\t\t/a"), Doubt::NotVerified);
    EXPECT_EQ(doubtOf("100644\t0\t4294967295\t64\troot\troot\t\t\t/a"), Doubt::NotVerified);
    EXPECT_EQ(parseRPMFile("100644\t2\t0\t0\troot\troot\t\t\t/a", accounts, {}).line,
              RPMLine::NotInstalled);
    for (std::size_t length = 0; length < good.find('/'); ++length)
        EXPECT_EQ(parseRPMFile(good.substr(0, length), accounts, {}).line, RPMLine::Malformed)
            << length;
}

TEST(Mtree, GivesBackWhatWasWritten)
{
    const std::string digest(64, 'a');
    const std::vector<PackagedFile> files{
        {"usr", FileKind::Directory, 0755, {"root", 0}, {"root", 0}, {}},
        {"usr/a b\\#=\xC3\xBC", FileKind::Regular, 04755, {"", 4242}, {"mail", 8}, digest},
        {"usr/link", FileKind::SymbolicLink, 0777, {"root", 0}, {"root", 0}, {}}};
    const std::string text = writeMtree(files);
    const PackagedFiles read = parseMtree(text);
    ASSERT_TRUE(read) << text;
    EXPECT_EQ(*read, files) << text;
    for (const char* const line : {"./x mode=9\n", "./x uid=\n", "/etc/x mode=1\n", "x\n",
                                   "./x sha256digest=../../x\n", "\x89PNG\n"})
        EXPECT_FALSE(parseMtree(line)) << line;
}

}  // namespace
