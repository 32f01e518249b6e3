// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <map>
#include <set>
#include <string>
#include <vector>

// The folders are the architecture (docs/architecture.md): includes go one way between the houses,
// and between the folders inside each.

namespace {

namespace fs = std::filesystem;

/// Which project files each file includes, by their paths from the top.
using Includes = std::map<std::string, std::set<std::string>>;

const fs::path top = PROJECT_DIRECTORY;

/// What each house may include besides itself. A longer name is a house within a house.
const std::map<std::string, std::set<std::string>> housesBelow{
    {"contract", {}},
    {"fixwell", {"contract"}},
    {"pellar", {"contract"}},
    {"orvane/support", {"contract", "pellar"}},
    {"orvane/jobs", {"contract", "pellar", "orvane/support"}},
    {"orvane/privileges", {"contract", "pellar", "orvane/support", "orvane/jobs"}},
    {"orvane/terminal",
     {"contract", "pellar", "orvane/support", "orvane/jobs", "orvane/privileges"}},
    {"orvane/desktop",
     {"contract", "pellar", "orvane/support", "orvane/jobs", "orvane/privileges"}},
};

std::string folderOf(const std::string& file)
{
    return fs::path(file).parent_path().string();
}

std::string houseOf(const std::string& file)
{
    for (const auto& [house, below] : housesBelow)
        if (file.starts_with(house + "/"))
            return house;
    return {};
}

/// The controller's own parts may include its header, from every folder of the module.
bool isOwnController(const std::string& file, const std::string& included)
{
    return file.starts_with("fixwell/") && included == "fixwell/module/OVFXW.h";
}

void findUpwardArrows(const Includes& includes, std::vector<std::string>& faults)
{
    for (const auto& [file, included] : includes)
        for (const std::string& other : included) {
            const std::string from = houseOf(file);
            const std::string to = houseOf(other);
            if (to.empty() || (from != to && !housesBelow.at(from).contains(to)))
                faults.push_back(file + " may not include " + other);
        }
}

/// Walks on from the end of `path`; a folder that is met again closes a circle.
void findCircles(const Includes& folders, std::vector<std::string>& path,
                 std::set<std::string>& finished, std::vector<std::string>& faults)
{
    const auto next = folders.find(path.back());
    for (const std::string& folder :
         next == folders.end() ? std::set<std::string>() : next->second) {
        const auto met = std::find(path.begin(), path.end(), folder);
        if (met != path.end()) {
            std::string circle;
            for (auto step = met; step != path.end(); ++step)
                circle += *step + " -> ";
            faults.push_back("a circle of folders: " + circle + folder);
        } else if (!finished.contains(folder)) {
            path.push_back(folder);
            findCircles(folders, path, finished, faults);
            path.pop_back();
        }
    }
    finished.insert(path.back());
}

std::vector<std::string> faultsIn(const Includes& includes)
{
    std::vector<std::string> faults;
    findUpwardArrows(includes, faults);
    Includes folders;
    for (const auto& [file, included] : includes)
        for (const std::string& other : included)
            if (folderOf(file) != folderOf(other) && !isOwnController(file, other))
                folders[folderOf(file)].insert(folderOf(other));
    std::set<std::string> finished;
    for (const auto& [folder, others] : folders) {
        std::vector<std::string> path{folder};
        if (!finished.contains(folder))
            findCircles(folders, path, finished, faults);
    }
    return faults;
}

Includes includesOfTheProject()
{
    Includes includes;
    for (const auto& [house, below] : housesBelow)
        for (const auto& entry : fs::recursive_directory_iterator(top / house)) {
            if (entry.path().extension() != ".h" && entry.path().extension() != ".cpp")
                continue;
            std::set<std::string>& included = includes[fs::relative(entry.path(), top).string()];
            std::ifstream file(entry.path());
            const std::string word = "#include \"";
            for (std::string line; std::getline(file, line);)
                if (line.starts_with(word))
                    included.insert(line.substr(word.size(), line.rfind('"') - word.size()));
        }
    return includes;
}

TEST(Includes, GoOneWay)
{
    const Includes includes = includesOfTheProject();
    ASSERT_GT(includes.size(), 100U);
    for (const std::string& fault : faultsIn(includes))
        ADD_FAILURE() << fault;
}

TEST(Includes, AFaultIsFound)
{
    struct Case {
        Includes planted;
        std::size_t faults;
        std::string_view because;
    };
    for (const Case& c : {
             Case{
                 {{"pellar/a/x.cpp", {"pellar/a/x.h", "pellar/b/y.h", "contract/z.h"}}}, 0, "fine"},
             Case{{{"pellar/a/x.h", {"orvane/support/y.h"}}}, 1, "up"},
             Case{{{"orvane/terminal/x.h", {"orvane/desktop/y.h"}}}, 1, "sideways"},
             Case{{{"orvane/terminal/x.h", {"fixwell/module/OVFXW.h"}}}, 1, "into the module"},
             Case{{{"fixwell/jobs/x.h", {"pellar/Manager.h"}}}, 1, "out of the module"},
             Case{{{"pellar/a/x.h", {"pellar/b/y.h"}}, {"pellar/b/z.h", {"pellar/a/w.h"}}},
                  1,
                  "a circle of two folders"},
             Case{{{"pellar/a/x.h", {"pellar/b/y.h"}},
                   {"pellar/b/z.h", {"pellar/c/w.h"}},
                   {"pellar/c/w.h", {"pellar/a/v.h"}}},
                  1,
                  "of three"},
             Case{{{"pellar/x.h", {"pellar/a/y.h"}}, {"pellar/a/y.h", {"pellar/z.h"}}},
                  1,
                  "with the folder above"},
             Case{{{"fixwell/module/OVFXW.h", {"fixwell/jobs/x.h"}},
                   {"fixwell/jobs/y.cpp", {"fixwell/module/OVFXW.h"}}},
                  0,
                  "the controller's part"},
         })
        EXPECT_EQ(faultsIn(c.planted).size(), c.faults) << c.because;
}

}  // namespace
