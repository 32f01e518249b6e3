// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/ProgramStart.h"
#include "orvane/terminal/ManualCommands.h"
#include "orvane/terminal/manual/PlainText.h"
#include "pellar/tools/ToolVersions.h"

namespace orvane {
namespace {

std::string versionText(const pellar::InstalledTool& tool, const Translator& texts)
{
    if (!tool.isInstalled)
        return texts.sentence("not installed: package %@", {tool.package});
    return tool.version.empty() ? texts.text("unknown") : tool.version;
}

}  // namespace

int runVersion(const std::string& toolPath, const Translator& texts, const TerminalLook& look)
{
    pellar::StopSwitch stop;
    manual::Document page;
    const auto add = [&page](std::string_view name, std::string explanation) {
        page.blocks.push_back({manual::Block::Kind::Row,
                               {{manual::Span::Look::Plain, std::string(name)}},
                               {{manual::Span::Look::Plain, std::move(explanation)}}});
    };
    for (const pellar::InstalledTool& tool : pellar::installedTools(toolPath, stop))
        add(tool.name, versionText(tool, texts));
    return writePage("fixwell " + std::string(programVersion()) + "\n" +
                         manual::plainText(page, {look.columns, false}),
                     texts);
}

}  // namespace orvane
