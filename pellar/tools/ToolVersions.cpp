// SPDX-License-Identifier: Apache-2.0
#include "pellar/tools/ToolVersions.h"

#include "pellar/tools/ToolOutput.h"
#include "pellar/tools/ToolTable.h"

#include <algorithm>
#include <array>

namespace pellar {
namespace {

/// How a tool tells its version, and what stands before it in that line.
struct VersionReading {
    std::string_view name;
    std::vector<std::string> arguments;
    std::string_view banner;
};

const auto& readings()
{
    static const std::array table{
        VersionReading{"e2fsck", {"-V"}, "e2fsck "},
        // It has no option for this, and says it before it finds that the device is none.
        VersionReading{"fsck.fat", {"-n", "/dev/null"}, "fsck.fat "},
        VersionReading{"fsck.exfat", {"-V"}, "exfatprogs version : "},
        VersionReading{"ntfsresize", {"--version"}, "ntfsresize v"},
        VersionReading{"xfs_repair", {"-V"}, "xfs_repair version "},
        VersionReading{"btrfs", {"--version"}, "btrfs-progs v"},
        VersionReading{"fsck.f2fs", {"-V"}, "fsck.f2fs "},
    };
    return table;
}

class VersionListener final : public RunListener {
public:
    explicit VersionListener(std::string_view banner) : banner_(banner) {}

    void line(std::string_view line, bool /*isCut*/) override
    {
        if (version.empty())
            version = versionBehind(banner_, line);
    }
    void progressLine(std::string_view /*line*/) override {}
    void lineLimitReached() override {}
    void pause() override {}
    void tick() override {}

    std::string version;

private:
    const std::string_view banner_;
};

std::string versionOf(const VersionReading& reading, const std::filesystem::path& program,
                      StopSwitch& stop)
{
    RunRequest request;
    request.command = {program, reading.arguments};
    request.limits = {100, 64U << 10U};
    request.silenceLimit = std::chrono::seconds(2);
    request.graceTimes = graceTimesFor(Access::ReadOnly);
    VersionListener listener(reading.banner);
    static_cast<void>(runTool(request, stop, listener));
    return listener.version;
}

}  // namespace

std::vector<InstalledTool> installedTools(std::string_view toolPath, StopSwitch& stop)
{
    std::vector<InstalledTool> tools;
    for (const Tool* const tool : allTools()) {
        InstalledTool found{tool->name, tool->package};
        const auto program = findProgram(tool->name, toolPath);
        found.isInstalled = !program.empty();
        const auto reading = std::ranges::find(readings(), tool->name, &VersionReading::name);
        if (found.isInstalled && reading != readings().end())
            found.version = versionOf(*reading, program, stop);
        tools.push_back(std::move(found));
    }
    return tools;
}

}  // namespace pellar
