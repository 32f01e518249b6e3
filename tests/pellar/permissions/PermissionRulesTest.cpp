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
    for (const auto& [path, canonical] : {std::pair("/bin/x", "usr/bin/x"),
                                          {"./sbin/x", "usr/bin/x"},
                                          {"bin", "usr/bin"},
                                          {"binary/x", "binary/x"},
                                          {"//usr//lib/./x/", "usr/lib/x"}})
        EXPECT_EQ(merged().canonical(path), canonical) << path;
    PathAliases loop;
    loop.add("a", "b");
    loop.add("b", "a");
    EXPECT_FALSE(loop.canonical("a/x").empty()) << "ends";
}

TEST(ModeText, IsThatOfLs)
{
    EXPECT_EQ(modeText(FileKind::Regular, 06644), "-rwSr-Sr--");
    EXPECT_EQ(modeText(FileKind::Directory, 01777), "drwxrwxrwt");
    EXPECT_EQ(modeText(FileKind::Directory, 01770), "drwxrwx--T");
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
    constexpr auto regular = FileKind::Regular;
    constexpr auto directory = FileKind::Directory;
    const std::string inLoop = "for f in su mount; do chmod u+s /bin/$f; done";
    const std::string inFunction =
        "set_perms polkitd root 700 /etc/polkit-1/rules.d\nchown a \"$1\"";
    const std::string override = "dpkg-statoverride --add root g 710 \"/etc/ssl/private\"";
    for (const auto& [script, path, kind, isConcerned] :
         {std::tuple(std::string("chmod 4755 /bin/su"), "usr/bin/su", regular, true),
          {"echo /bin/x", "usr/bin/x", regular, false},
          {"F=/usr/bin/x\nchmod u+s \"$F\"", "usr/bin/x", regular, true},
          {inLoop, "usr/bin/su", regular, true},
          {"D=/var/lib/x\nchown u $D/y", "var/lib/x/y", regular, true},
          {"D=/var/lib/x\nchown u $D/y", "var/lib/x/yy", regular, false},
          {"chown -R u:g /var/lib/x", "var/lib/x/deep/file", regular, true},
          {"chown -R u:g /var/lib/x", "var/lib/xy", regular, false},
          {"install -m 644 a /etc/b\nls /usr/bin", "usr/bin", directory, false},
          {"chmod 644 /usr/share/x/*.so", "usr/share/x/a.so", regular, true},
          {"chmod 4755 /usr/bin/$x", "usr/bin", directory, false},
          {"chmod \\\n 700 /usr/lib", "usr/lib", directory, true},
          {inFunction, "etc/polkit-1/rules.d", directory, true},
          {override, "etc/ssl/private", directory, true},
          {"setcap cap_net_raw+ep /bin/ping", "usr/bin/ping", regular, true}}) {
        ScriptMentions mentions;
        mentions.add(script, merged());
        EXPECT_EQ(mentions.mayConcernOwn(path, kind), isConcerned) << script << ' ' << path;
    }
}

TEST(TemporaryFileRules, ConcernWhatTheySet)
{
    TemporaryFileRules rules;
    rules.add(
        "# a comment\nd /run/a 1777 root root 10d -\nd /var/b - - -\nz /etc/c* 0600 - -\n"
        "Z /var/log/d 0750\nx /tmp/e 0700\nf+ \"/etc/f\" 0644 root root\n",
        {});
    for (const char* const path : {"run/a", "etc/cat", "var/log/d/deep/x", "etc/f"})
        EXPECT_TRUE(rules.concern(path)) << path;
    for (const char* const path : {"var/b", "etc/c/x", "tmp/e", "etc"})
        EXPECT_FALSE(rules.concern(path)) << path;
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
