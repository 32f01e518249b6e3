// SPDX-License-Identifier: Apache-2.0
// Other modules than the checking one, in a terminal.

#include "tests/support/LoopDevice.h"
#include "tests/terminal/ProgramTest.h"

#include <sys/mount.h>

#include <filesystem>

namespace orvane::test {
namespace {

class ShowTest : public ProgramTest {
protected:
    ShowTest() { environment_["ORVANE_MODULE_PATH"] = EXAMPLE_MODULES; }
};

/// Somewhere, until the end.
class Mount {
public:
    Mount(const std::string& device, std::filesystem::path place) : place_(std::move(place))
    {
        std::filesystem::create_directories(place_);
        isMounted_ = ::mount(device.c_str(), place_.c_str(), "ext2", 0, nullptr) == 0 ||
                     ::mount(device.c_str(), place_.c_str(), "ext4", 0, nullptr) == 0;
    }
    Mount(const Mount&) = delete;
    Mount& operator=(const Mount&) = delete;
    ~Mount()
    {
        if (isMounted_)
            ::umount(place_.c_str());
    }
    bool isMounted() const { return isMounted_; }

private:
    std::filesystem::path place_;
    bool isMounted_ = false;
};

TEST_F(ShowTest, ListsModulesAndWhyOneIsRefused)
{
    const auto own = path("modules");
    write(own / "Broken.ovmodule/module.json", "{}");
    environment_["ORVANE_MODULE_PATH"] = own.native() + ":" + EXAMPLE_MODULES;
    const RunResult result = run({"modules", "--json"});
    EXPECT_EQ(result.status, 8);
    std::map<std::string, nlohmann::json> refusals;
    for (const auto& module : Events(result.output).named("module"))
        refusals[module["module"]] = module["refusal"];
    EXPECT_TRUE(refusals.at("Fixwell").is_null());
    EXPECT_TRUE(refusals.at("DiskUsage").is_null());
    const std::string why = refusals.at("Broken");
    EXPECT_NE(why.find("does not name the module"), std::string::npos) << why;
    EXPECT_EQ(run({"show", "Broken", "nothing.img"}).status, 8);
}

TEST_F(ShowTest, SaysWhyAButtonCannotBePressed)
{
    makeVolume("image");
    const RunResult shown = run({"show", "DiskUsage", "image"});
    EXPECT_EQ(shown.status, 0);
    EXPECT_NE(shown.output.find("an image file that is not attached"), std::string::npos);
    const RunResult pressed = run({"show", "DiskUsage", "--press", "measure", "image"});
    EXPECT_EQ(pressed.status, 8);
    EXPECT_NE(pressed.errors.find("cannot press ‘measure’: Not available because nothing that is "
                                  "selected is mounted."),
              std::string::npos)
        << pressed.errors;
    EXPECT_NE(run({"show", "DiskUsage", "--press", "other", "image"})
                  .errors.find("DiskUsage has no such button"),
              std::string::npos);
    EXPECT_EQ(run({"show", "DiskUsage", "not-there"}).status, 8);
}

TEST_F(ShowTest, PressesAButtonAndWaitsForWhatItFinds)
{
    if (const char* const obstacle = LoopDevice::obstacle())
        GTEST_SKIP() << obstacle;
    const LoopDevice device(makeVolume("image", 8 * mebibyte, {"-L", "Holidays"}));
    const Mount mount(device.name(), path("place"));
    if (!mount.isMounted())
        GTEST_SKIP() << "a loop device cannot be mounted here";
    write(path("place") / "\x1b[31mpictures\n/one", std::string(300 << 10, 'x'));
    const RunResult result = run({"show", "DiskUsage", "--press", "measure", device.name()});
    EXPECT_EQ(result.status, 0) << result.errors;
    EXPECT_NE(result.output.find("\uFFFD[31mpictures\uFFFD/\n"), std::string::npos)
        << result.output;
    EXPECT_NE(result.output.find(" used ("), std::string::npos);
    EXPECT_FALSE(holdsControls(result.output));
}

}  // namespace
}  // namespace orvane::test
