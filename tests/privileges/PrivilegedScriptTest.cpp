// SPDX-License-Identifier: Apache-2.0
// The asking side of the helper, with programs in the helper's place.

#include "contract/pellar/ErrorCodes.h"
#include "contract/pellar/MessageKeys.h"
#include "orvane/privileges/PrivilegedScript.h"
#include "pellar/jobs/Job.h"
#include "tests/pellar/JobFixture.h"
#include "tests/support/LoopDevice.h"

#include <gtest/gtest.h>

#include <fstream>

namespace orvane {
namespace {

class PrivilegedScriptTest : public testing::Test {
protected:
    /// What the launched program does, as a shell script, after the arguments were seen.
    void launch(const std::string& script, const pellar::PrivilegedJob& job)
    {
        job_.reset();
        listener_ = {};
        asking_.clear();
        const auto launcher = workshop_.path("launcher");
        std::ofstream(launcher) << "#!/bin/sh\n" << script << "\n";
        std::filesystem::permissions(launcher, std::filesystem::perms::owner_all);
        const HelperLaunch how{
            {launcher.native()},
            "",
            {[this] { asking_ += "begins "; },
             [this] {
                 asking_ += "ends ";
             }},
            {[](const contract::DiskReference& disk) { return "type: undo " + disk.name; },
             {},
             {},
             {}}};
        job_ = std::make_unique<pellar::Job>(
            [this, how, job](pellar::StopSwitch& stop, pellar::EventQueue& road) {
                return std::make_unique<PrivilegedScript>(how, job, texts_, stop, road);
            },
            pellar::EventReceiver{&listener_,
                                  pellar::test::reference("/dev/sdz9"),
                                  {},
                                  [] {
                                  }},
            loop_);
    }
    void launch(const std::string& script, pellar::Operation operation = pellar::Operation::Verify)
    {
        launch(script, jobOn("/dev/sdz9", operation));
    }
    static pellar::PrivilegedJob jobOn(const std::string& device, pellar::Operation operation)
    {
        return {{pellar::Subject::Filesystem, operation},
                *pellar::test::reference(device, "ext4", "Stick"),
                nullptr,
                false};
    }
    [[nodiscard]] bool finishes()
    {
        return loop_.runUntil([this] { return listener_.finished == 1; });
    }

    pellar::test::TestDirectory workshop_;
    pellar::test::TestLoop loop_;
    pellar::test::EnglishTexts texts_;
    pellar::test::Listener listener_;
    std::string asking_;  ///< written by the job's thread before its end is heard of
    std::unique_ptr<pellar::Job> job_;
};

TEST_F(PrivilegedScriptTest, HandsOnWhatTheHelperTells)
{
    launch(R"(printf '["started"]\n["mess'
sleep 0.1
printf 'age","The volume “Stick” appears to be OK.\\n",null]\nnot an event\n'
printf '["finished",0,0,{"dictionary":[["kPLVerdict","sound"],["kPLMessage","'"$1 $2"'"]]}]\n')");
    ASSERT_TRUE(finishes());
    EXPECT_EQ(listener_.started, 1);
    EXPECT_EQ(listener_.verdict, "sound");
    EXPECT_EQ(listener_.message, "verify /dev/sdz9");
    EXPECT_EQ(asking_, "begins ends ");
    EXPECT_TRUE(listener_.hasPlainLine("The volume “Stick” appears to be OK.\n"));
}

TEST_F(PrivilegedScriptTest, AdviceIsInTheWordsOfTheProgramThatAsked)
{
    const std::string end = "printf '[\"finished\",0,0,null]\\n'";
    launch("cat <<'X'\n" + lineFromEvent(messageOf(Advice::Undo)) + "\n" +
           lineFromEvent(messageOf(Advice::Apply)) + "\nX\n" + end);
    ASSERT_TRUE(finishes());
    ASSERT_EQ(listener_.dictionaries.size(), 1U)
        << "what this program has no words for is not told";
    EXPECT_EQ(listener_.dictionaries.front().string(contract::kFsckMessageString),
              "type: undo Stick");
}

// The helper writes no file for a user; and it never repairs where only a preview is wanted.
TEST_F(PrivilegedScriptTest, NoRepairedVolumeIsKeptWithMoreRights)
{
    auto job = jobOn("/dev/sdz9", pellar::Operation::Repair);
    job.policy.isPreview = true;
    launch("echo \"$*\" >" + workshop_.path("asked").native(), job);
    ASSERT_TRUE(finishes());
    EXPECT_NE(test::contentsOf(workshop_.path("asked")).find("--preview"), std::string::npos);
    std::filesystem::remove(workshop_.path("asked"));
    job.policy.keptImage = workshop_.path("kept");
    launch("touch " + workshop_.path("asked").native(), job);
    ASSERT_TRUE(finishes());
    EXPECT_EQ(listener_.error, contract::kPLErrorNotAuthorized);
    EXPECT_FALSE(std::filesystem::exists(workshop_.path("asked"))) << "nobody is asked for it";
}

TEST_F(PrivilegedScriptTest, WhatWasNotAllowedIsSaidAndEnds)
{
    struct Case {
        const char* script;
        contract::ErrorCode error;
        std::string_view message;
    };
    for (const Case& c : {
             Case{"exit 126", contract::kPLErrorCancelled, "authorisation was not given"},
             Case{"exit 127", contract::kPLErrorNotAuthorized, "you are not authorised"},
             Case{"exit 2", contract::kPLErrorNotAuthorized, "could not be asked for"},
             Case{"printf '[\"started\"]\\n'; kill -9 $$", contract::kPLErrorToolFailed,
                  "ended unexpectedly"},
         }) {
        launch(c.script, pellar::Operation::Repair);
        ASSERT_TRUE(finishes()) << c.script;
        EXPECT_EQ(listener_.started, 1) << c.script;
        EXPECT_EQ(listener_.error, c.error) << c.script;
        EXPECT_NE(listener_.message.find(c.message), std::string::npos) << listener_.message;
    }
}

TEST_F(PrivilegedScriptTest, StopIsPassedOnAndLeavingEndsTheHelper)
{
    const auto ended = workshop_.path("ended");
    launch(
        "printf '[\"started\"]\\n'\nread word\n"
        "printf '[\"finished\",-69884,0,{\"dictionary\":[[\"kPLMessage\",\"'$word'\"]]}]\\n'");
    ASSERT_TRUE(loop_.runUntil([this] { return listener_.started == 1; }));
    job_->stop();
    ASSERT_TRUE(finishes());
    EXPECT_EQ(listener_.message, "stop");

    launch("printf '[\"started\"]\\n'\ncat >/dev/null\n: >'" + ended.native() + "'");
    ASSERT_TRUE(loop_.runUntil([this] { return listener_.started == 1; }));
    job_.reset();  // waits: nobody is left behind
    EXPECT_TRUE(std::filesystem::exists(ended));
}

/// A part of an image, as whoever makes the job has it.
pellar::PrivilegedJob jobOnImage(const std::filesystem::path& image)
{
    pellar::PrivilegedJob job;
    job.disk = *pellar::test::reference(image, "vfat", "Stick");
    job.disk.offset = 4096;
    job.disk.length = 8192;
    auto claim = pellar::DiskClaim::take(job.disk, pellar::Access::ReadOnly, {});
    job.image = std::make_shared<const pellar::DiskClaim>(*std::move(claim));
    return job;
}

TEST_F(PrivilegedScriptTest, AnImageIsHandedOverAsAnOpenFile)
{
    const auto image = workshop_.path("image");
    workshop_.write("image", std::string(16384, 'x'));
    // What the helper's parent has open under the number is the image.
    const std::string script =
        "printf '[\"started\"]\\n'\nfile=$(readlink /proc/$PPID/fd/$2)\n"
        "printf '[\"finished\",0,0,{\"dictionary\":[[\"kPLMessage\",\"%s %s %s %s\"]]}]\\n' "
        "$1 \"$file\" $3 $4\n";
    launch(script, jobOnImage(image));
    ASSERT_TRUE(finishes());
    EXPECT_EQ(listener_.message, "attach-verify " + image.native() + " 4096 8192");
}

// A device on it does not show that it was deleted.
TEST_F(PrivilegedScriptTest, AnImageThatWasDeletedGetsNoResult)
{
    const std::string script =
        "printf '[\"started\"]\\n[\"message\",\"Pass 1\\\\n\",null]\\n'\n"
        "printf '[\"message\",\"The volume “Stick” appears to be OK.\\\\n\",null]\\n'\n"
        "printf '[\"trace\",\"result\"]\\n'\nwhile ! [ -e '" +
        workshop_.path("end").native() +
        "' ]; do sleep 0.02; done\nprintf '[\"finished\",0,0,null]\\n'";
    for (const bool isDeleted : {false, true}) {
        const auto image = workshop_.path("image");
        workshop_.write("image", std::string(16384, 'x'));
        launch(script, jobOnImage(image));
        ASSERT_TRUE(loop_.runUntil([this] { return listener_.hasPlainLine("Pass 1"); }));
        if (isDeleted)
            std::filesystem::remove(image);
        workshop_.write("end", "");
        ASSERT_TRUE(finishes());
        EXPECT_EQ(listener_.error, isDeleted ? contract::kPLErrorDiskChanged : 0);
        EXPECT_EQ(listener_.hasPlainLine("appears to be OK."), !isDeleted);
        job_.reset();
        std::filesystem::remove(workshop_.path("end"));
    }
}

// Between the question for a password and the answer there is time.
TEST_F(PrivilegedScriptTest, AnotherDiskUnderTheNameIsRefused)
{
    if (const char* const obstacle = test::LoopDevice::obstacle())
        GTEST_SKIP() << obstacle;
    test::LoopDevice device(workshop_.makeExt("disk", 4U << 20U));
    const std::string other = workshop_.makeExt("other", 4U << 20U);
    struct Case {
        std::string meanwhile;
        contract::ErrorCode error;
        std::string_view verdict;
    };
    for (const Case& c :
         {Case{"ulimit -S -n 16", 0, "sound"},
          Case{"losetup -d " + device.name() + "\nlosetup " + device.name() + " '" + other + "'",
               contract::kPLErrorDiskChanged, "failed"}}) {
        launch(c.meanwhile + "\nexec " PELLAR_HELPER " \"$@\"",
               jobOn(device.name(), pellar::Operation::Verify));
        ASSERT_TRUE(finishes());
        EXPECT_EQ(listener_.error, c.error) << listener_.message;
        EXPECT_EQ(listener_.verdict, c.verdict) << listener_.message;
    }
}

}  // namespace
}  // namespace orvane
