// SPDX-License-Identifier: Apache-2.0
#include "contract/foundation/Array.h"
#include "contract/foundation/Dictionary.h"
#include "contract/pellar/MessageKeys.h"
#include "orvane/privileges/HelperProtocol.h"

#include <gtest/gtest.h>

#include <sys/sysmacros.h>

namespace orvane {
namespace {

using pellar::Operation;
using pellar::Subject;

bool isKnownDevice(const std::filesystem::path& path)
{
    return path == "/dev/sdb1" || path == "/dev/mapper/a-b";
}

HelperRequest request(Subject subject, Operation operation)
{
    HelperRequest made;
    made.task = {subject, operation};
    made.disk.path = made.disk.identifier = "/dev/sdb1";
    made.disk.name = "Mein “Stick” \x1b[31m%n\xff";
    made.disk.filesystem = "ext4";
    made.disk.isWhole = subject == Subject::PartitionMap;
    made.languages = "de_DE:en";
    made.identity = {makedev(8, 17), 5, "6bd0-A1"};
    return made;
}

TEST(HelperRequest, ArrivesAsItWasMade)
{
    std::vector<HelperRequest> requests{request(Subject::Permissions, Operation::Repair)};
    requests.push_back(requests.back());
    requests.back().fetchesArchives = true;
    for (const Operation operation : {Operation::Verify, Operation::Repair}) {
        requests.push_back(request(Subject::PartitionMap, operation));
        requests.push_back(request(Subject::Filesystem, operation));
        requests.push_back(requests.back());
        requests.back().disk.path.clear();
        requests.back().disk.offset = 1U << 20U;
        requests.back().disk.length = std::uint64_t(1) << 40U;
        requests.back().image = 17;
    }
    for (const Subject subject : {Subject::Filesystem, Subject::PartitionMap})
        for (const Operation operation : {Operation::Undo, Operation::Finish})
            requests.push_back(request(subject, operation));
    requests.push_back(request(Subject::Permissions, Operation::Undo));
    constexpr bool keepsUndo = true;
    for (const pellar::RepairPolicy& policy :
         {pellar::RepairPolicy{true, false, false, !keepsUndo, true, {}},
          pellar::RepairPolicy{false, true, false, keepsUndo, false, {}},
          pellar::RepairPolicy{false, false, true, keepsUndo, false, {}}}) {
        requests.push_back(request(Subject::Filesystem, Operation::Repair));
        requests.back().policy = policy;
    }
    requests.push_back(request(Subject::Filesystem, Operation::Verify));
    requests.back().policy.isThorough = true;
    for (const HelperRequest& made : requests) {
        const auto read = readHelperArguments(argumentsOf(made), isKnownDevice);
        ASSERT_TRUE(read) << read.error();
        EXPECT_EQ(read->policy, made.policy);
        EXPECT_EQ(argumentsOf(*read), argumentsOf(made));
        EXPECT_EQ(read->task, made.task);
        EXPECT_EQ(read->disk.isWhole, made.disk.isWhole);
    }
}

// A wish for a language must not keep anybody from checking a disk.
TEST(HelperRequest, TheLanguagesOfAnyUserAreTaken)
{
    pellar::PrivilegedJob job{};
    job.disk = request(Subject::Filesystem, Operation::Verify).disk;
    for (const auto& [wanted, taken] :
         {std::pair<std::string, std::string>{"de/../x:%n::fr:", "fr"},
          {std::string(100, 'a') + ":lb:de", "lb:de"}}) {
        const auto read = readHelperArguments(argumentsOf(requestFor(job, wanted)), isKnownDevice);
        ASSERT_TRUE(read) << wanted;
        EXPECT_EQ(read->languages, taken);
    }
}

TEST(DiskIdentity, AnotherDiskUnderTheSameNameIsNoticed)
{
    const DiskIdentity asked{makedev(8, 17), 5, "6bd0"};
    struct Case {
        DiskIdentity now;
        bool isStill;
        std::string_view because;
    };
    for (const Case& c : {
             Case{asked, true, "the same"},
             Case{{makedev(8, 18), 5, "6bd0"}, false, "another device"},
             Case{{makedev(8, 17), 6, "6bd0"}, false, "taken out and put in, perhaps a copy"},
             Case{{makedev(8, 17), 5, "6bd1"}, false, "another file system"},
             Case{{makedev(8, 17), 0, "6bd0"}, true, "the kernel does not number disks"},
             Case{{makedev(8, 17), 5, ""}, true, "the superblock is what is to be repaired"},
         })
        EXPECT_EQ(asked.isStill(c.now), c.isStill) << c.because;
    EXPECT_FALSE(DiskIdentity().isStill({})) << "no disk at all";
}

/// What is changed in arguments that are taken, so that they are not.
struct Change {
    std::size_t place;
    std::string value;
    std::string_view because;
};

void expectRefusals(const std::vector<std::string>& good, const std::vector<Change>& changes)
{
    const auto isDevice = [](const std::filesystem::path& path) {
        return path != "/dev/null" && path != "/dev/";
    };
    ASSERT_TRUE(readHelperArguments(good, isDevice));
    for (const Change& c : changes) {
        std::vector<std::string> arguments = good;
        arguments[c.place] = c.value;
        EXPECT_FALSE(readHelperArguments(arguments, isDevice)) << c.because;
    }
    std::vector<std::string> arguments = good;
    for (arguments.push_back("x"); !arguments.empty(); arguments.pop_back())
        EXPECT_EQ(static_cast<bool>(readHelperArguments(arguments, isDevice)), arguments == good);
    EXPECT_FALSE(readHelperArguments({}, isDevice));
}

// Whoever may start the helper may give it any arguments.
TEST(HelperRequest, NothingButADeviceByItsOwnNameIsTaken)
{
    expectRefusals({"repair", "/dev/sdb1", "8:17:5:6bd0", "id", "name", "ext4", "de"},
                   {
                       {0, "erase", "no such operation"},
                       {1, "/etc/shadow", "a file of root's"},
                       {1, "sdb1", "not absolute"},
                       {1, "/dev/../etc/shadow", "out of /dev"},
                       {1, "/dev//sdb1", "not its own name"},
                       {1, "/dev/null", "no disk"},
                       {1, "/dev/", "a directory"},
                       {2, "8:17:5", "half of it"},
                       {2, "8:-17:5:", "no number"},
                       {2, "8:17:5:x\n", "no UUID"},
                       {4, std::string(2000, 'x'), "too long to be a name"},
                       {5, "ext4;reboot", "no name of a file system"},
                       {6, "../../../tmp/x", "no language, but a way to somebody's texts"},
                   });
}

// What an authorisation was given for is what is done.
TEST(HelperRequest, NoOptionIsTakenThatDoesNotGoWithTheRest)
{
    const auto isTaken = [](std::vector<std::string> first, std::vector<std::string> options) {
        for (const char* const text : {"id", "--preview", "ext4", "--direct"})
            first.emplace_back(text);
        first.insert(first.end(), options.begin(), options.end());
        const auto read = readHelperArguments(first, isKnownDevice);
        EXPECT_TRUE(!read || !options.empty() || read->policy == pellar::RepairPolicy())
            << "a name that looks like an option is a name";
        return static_cast<bool>(read);
    };
    const auto onDevice = [&](const char* task, std::vector<std::string> options) {
        return isTaken({task, "/dev/sdb1", "8:17:5:6bd0"}, std::move(options));
    };
    EXPECT_TRUE(onDevice("repair", {}));
    EXPECT_TRUE(onDevice("repair", {"--preview"}));
    EXPECT_TRUE(isTaken({"attach-repair", "7", "512", "1024"}, {"--direct", "--no-undo"}));
    struct Case {
        const char* task;
        std::vector<std::string> options;
        std::string_view because;
    };
    for (const Case& c : {Case{"repair", {"--preview", "--direct"}, "both writing and not"},
                          Case{"repair", {"--preview", "--no-undo"}, "nothing is to be undone"},
                          Case{"repair", {"--preview", "--preview"}, "once is enough"},
                          Case{"repair", {"--keep=/etc/shadow"}, "no file is written for a user"},
                          Case{"repair", {"--fetch-archives"}, "of permissions"},
                          Case{"verify", {"--direct"}, "a verification writes nothing"},
                          Case{"undo", {"--direct"}, "of repairs"},
                          Case{"repair-permissions", {"--preview"}, "it would be done for real"}})
        EXPECT_FALSE(onDevice(c.task, c.options)) << c.task << ": " << c.because;
    EXPECT_FALSE(isTaken({"attach-undo", "7", "512", "1024"}, {}))
        << "what is kept of an image is its user's";
}

TEST(HelperRequest, NothingButARegionOfAnOpenFileIsTaken)
{
    expectRefusals({"attach-verify", "7", "512", "1024", "id", "name", "vfat", "de"},
                   {
                       {0, "attach-verify-partition-map", "a part has no map"},
                       {0, "attach-", "no operation"},
                       {0, "attach", "an authorisation to look does not cover repairs"},
                       {1, "/etc/shadow", "a path is never opened"},
                       {1, "-1", "no descriptor"},
                       {1, "4294967303", "7, when it is cut to 32 bits"},
                       {2, " 512", "no number"},
                       {2, "18446744073709551615", "its end is beyond all numbers"},
                       {3, "0", "to the end, whatever that is"},
                       {6, "vfat -o x", "no name of a file system"},
                   });
}

TEST(HelperEvents, EventsComeBackAsTheyWere)
{
    const auto dictionary = contract::Dictionary::of(
        {{contract::kFsckMessageType, contract::kFsckError},
         {contract::kFsckMessageString, "line\nend \"quoted\" \xff\x1b"},
         {contract::kFsckVerbosity, -1},
         {contract::kFsckParameters, contract::Array::of({"x", 42, 1.5})}});
    for (const pellar::Event& event : std::initializer_list<pellar::Event>{
             pellar::Started{}, pellar::Message{"plain \xc3\x28\n", {}},
             pellar::Message{{}, dictionary}, pellar::Trace{"e2fsck -n"},
             pellar::Finished{-69701, 4, dictionary}, pellar::Finished{}}) {
        const std::string line = lineFromEvent(event);
        EXPECT_EQ(line.find('\n'), std::string::npos);
        const auto back = eventFromLine(line);
        ASSERT_TRUE(back) << line;
        EXPECT_EQ(lineFromEvent(*back), line);
    }
}

TEST(HelperEvents, WhatIsNoEventIsNone)
{
    for (const std::string_view line :
         {"", "x", "null", "[]", "{}", "[1]", "[\"message\"]", "[\"finished\",\"a\",0,null]",
          "[\"unknown\"]", "[\"started\"", "\xff\xfe"})
        EXPECT_FALSE(eventFromLine(line)) << line;
}

}  // namespace
}  // namespace orvane
