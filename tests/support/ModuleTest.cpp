// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/modules/ModuleLoader.h"
#include "orvane/support/modules/ModuleSearch.h"
#include "tests/support/TestDirectory.h"

#include <gtest/gtest.h>

#include <unistd.h>

#include <functional>

namespace orvane {
namespace {

using test::TestDirectory;
namespace fs = std::filesystem;

fs::path makeBundle(const TestDirectory& directory, const char* library)
{
    const fs::path bundle = directory / "Test.ovmodule";
    test::write(bundle / "module.json", R"({"name": "Test", "library": "test.so"})");
    fs::copy_file(library, bundle / "test.so");
    for (const fs::path& path : {bundle, bundle / "test.so"})
        fs::permissions(path, fs::perms::owner_all);
    return bundle;
}

TEST(ModuleLoader, RefusesWithASentenceThatSaysWhy)
{
    struct Case {
        const char* library;
        std::function<void(const fs::path& bundle)> change;
        const char* sentence;
    };
    const auto nothing = [](const fs::path&) {
    };
    const auto opened = [](const char* name) {
        return [name](const fs::path& bundle) {
            fs::permissions(bundle / name, fs::perms::others_write, fs::perm_options::add);
        };
    };
    for (const Case& c :
         {Case{TEST_MODULE_WRONG, nothing, "of the module contract, and this program has version"},
          Case{TEST_MODULE_NO_ENTRY, nothing, "OVModuleEntry"},
          Case{TEST_MODULE_RIGHT, [](const fs::path& b) { fs::resize_file(b / "test.so", 100); },
               "cannot read file data"},
          Case{TEST_MODULE_RIGHT, opened("test.so"), "other users may change it"},
          Case{TEST_MODULE_RIGHT, opened("module.json"), "other users may change it"},
          Case{TEST_MODULE_RIGHT,
               [](const fs::path& b) {
                   fs::rename(b / "test.so", b / "real.so");
                   fs::create_symlink("real.so", b / "test.so");
               },
               "symbolic links"},
          Case{TEST_MODULE_RIGHT, [](const fs::path& b) { fs::remove(b / "module.json"); },
               "module.json’: No such file"},
          Case{TEST_MODULE_RIGHT,
               [](const fs::path& b) {
                   test::write(b / "module.json", R"({"name":"T","library":"../../evil.so"})");
               },
               "no library inside the bundle"},
          Case{TEST_MODULE_RIGHT,
               [](const fs::path& b) { test::write(b / "module.json", R"({"name": 3)"); },
               "does not name the module"}}) {
        const TestDirectory directory;
        const fs::path bundle = makeBundle(directory, c.library);
        c.change(bundle);
        const auto loaded = loadModule(bundle);
        ASSERT_FALSE(loaded) << c.sentence;
        EXPECT_NE(loaded.error().message.find(c.sentence), std::string::npos)
            << loaded.error().message;
    }
}

// Whoever owns a directory on the way can exchange what lies below it between two looks.
TEST(ModuleLoader, ForRootTheWayIsLookedAtAsWell)
{
    if (::geteuid() != 0)
        GTEST_SKIP() << "only root can give directories away";
    const TestDirectory directory;
    const fs::path bundle = makeBundle(directory, TEST_MODULE_RIGHT);
    constexpr uid_t somebody = 65534;
    const fs::path others = directory / "others";
    fs::create_directory(others);
    fs::rename(bundle, others / "Test.ovmodule");
    ASSERT_EQ(::chown(others.c_str(), somebody, 0), 0);
    const auto loaded = loadModule(others / "Test.ovmodule");
    ASSERT_FALSE(loaded);
    EXPECT_NE(loaded.error().message.find("on the way there: it belongs to another user"),
              std::string::npos)
        << loaded.error().message;
    std::string told;
    const auto directories =
        moduleDirectories([&](const char*) { return std::optional<std::string>(others.native()); },
                          {}, [&](const std::string& sentence) { told = sentence; });
    EXPECT_EQ(directories, std::vector<fs::path>{"/usr/lib/orvane/modules"});
    EXPECT_NE(told.find("ORVANE_MODULE_PATH"), std::string::npos) << told;
}

TEST(ModuleSearch, WhereModulesAreLookedFor)
{
    const auto directories = moduleDirectories(
        [](const char*) { return std::optional<std::string>("/a:relative::/b"); }, "/opt/bin/tool");
    const std::vector<fs::path> expected{"/a", "/b", "/opt/lib/orvane/modules", "/opt/modules",
                                         "/usr/lib/orvane/modules"};
    EXPECT_EQ(directories, expected);
}

TEST(ModuleSearch, TheCheckingModuleIsNotTheFirstThereIs)
{
    const TestDirectory directory;
    const std::vector<fs::path> directories{directory / "mine", directory / "system"};
    fs::create_directories(directory / "mine/Another.ovmodule");
    EXPECT_EQ(findModule(directories, checkingModule), fs::path());
    fs::create_directories(directory / "system/Fixwell.ovmodule");
    EXPECT_EQ(findModule(directories, checkingModule), directory / "system/Fixwell.ovmodule");
}

}  // namespace
}  // namespace orvane
