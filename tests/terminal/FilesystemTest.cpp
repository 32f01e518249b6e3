// SPDX-License-Identifier: Apache-2.0
#include "tests/support/ToolRun.h"
#include "tests/support/VolumeStates.h"
#include "tests/terminal/ProgramTest.h"

#include <algorithm>

namespace orvane::test {
namespace {

int statusFor(std::string_view verdict)
{
    if (verdict == "sound")
        return 0;
    if (verdict == "repaired")
        return 1;
    return verdict == "damaged" ? 4 : 8;
}

std::string_view phraseFor(std::string_view verdict, std::string_view command, bool isRepairedHere)
{
    if (verdict == "sound")
        return "appears to be OK.";
    if (verdict == "repaired")
        return "was repaired successfully.";
    if (verdict == "damaged")
        return command == "verify" ? (isRepairedHere ? "needs to be repaired." : "is damaged.")
                                   : "could not be repaired.";
    return command == "verify" ? "cannot verify" : "cannot repair";
}

class FilesystemTest : public ProgramTest, public ::testing::WithParamInterface<VolumeState> {
protected:
    void SetUp() override
    {
        ProgramTest::SetUp();
        const auto& makers = volumeMakers();
        const auto maker =
            std::find_if(makers.begin(), makers.end(), [](const VolumeMaker& candidate) {
                return candidate.filesystem == GetParam().filesystem;
            });
        write(path("image"), {});
        std::filesystem::resize_file(path("image"), maker->bytes);
        if (runOnImage(maker->command) == -1)
            GTEST_SKIP() << maker->command.front() << " is not installed (package "
                         << maker->package << ")";
    }

    int runOnImage(std::vector<std::string> command) const
    {
        command.push_back(path("image"));
        return runTool(command);
    }

    void expect(std::string_view command, std::string_view verdict) const
    {
        const RunResult result = run({std::string(command), "image"});
        EXPECT_EQ(result.status, statusFor(verdict)) << command << "\n"
                                                     << result.output << result.errors;
        EXPECT_NE(result.output.find(phraseFor(verdict, command, GetParam().filesystem != "btrfs")),
                  std::string::npos)
            << command << "\n"
            << result.output;
        EXPECT_TRUE(verdict == "sound" ||
                    result.output.find("appears to be OK.") == std::string::npos)
            << command << "\n"
            << result.output;
    }
};

TEST_P(FilesystemTest, StatusAndWordsTellWhatIsTrue)
{
    const VolumeState& state = GetParam();
    if (state.state == "sound") {
        const auto disks = Events(run({"list", "--json", "image"}).output).named("disk");
        ASSERT_EQ(disks.size(), 1U);
        EXPECT_EQ(disks.front()["filesystem"], state.filesystem);
    }
    for (const Patch& change : state.patches)
        patch(path("image"), change.offset, change.bytes);
    ASSERT_TRUE(state.command.empty() || runOnImage(state.command) == 0);
    expect("verify", state.verified);
    expect("repair", state.repaired);
    expect("verify", state.afterwards);
}

std::string stateName(const ::testing::TestParamInfo<VolumeState>& info)
{
    std::string name = std::string(info.param.filesystem) + "_" + std::string(info.param.state);
    std::replace(name.begin(), name.end(), ' ', '_');
    return name;
}

INSTANTIATE_TEST_SUITE_P(EachState, FilesystemTest, ::testing::ValuesIn(volumeStates()), stateName);

}  // namespace
}  // namespace orvane::test
