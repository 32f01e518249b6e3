// SPDX-License-Identifier: Apache-2.0
#include "pellar/tools/ToolVersions.h"

#include "pellar/tools/ToolOutput.h"
#include "pellar/tools/ToolTable.h"

namespace pellar {
namespace {

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

std::string versionOf(const VersionQuestion& question, const std::filesystem::path& program,
                      StopSwitch& stop)
{
    RunRequest request;
    request.command = {program, question.arguments};
    request.limits = {100, 64U << 10U};
    request.silenceLimit = std::chrono::seconds(2);
    request.graceTimes = graceTimesFor(Access::ReadOnly);
    VersionListener listener(question.banner);
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
        if (found.isInstalled && !tool->version.arguments.empty())
            found.version = versionOf(tool->version, program, stop);
        tools.push_back(std::move(found));
    }
    return tools;
}

}  // namespace pellar
