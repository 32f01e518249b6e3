// SPDX-License-Identifier: Apache-2.0
#include "pellar/tools/ToolOutput.h"

namespace pellar {

using Kind = ToolLine::Kind;

std::string_view versionBehind(std::string_view banner, std::string_view line)
{
    constexpr std::size_t longest = 24;
    if (banner.empty() || !line.starts_with(banner))
        return {};
    line.remove_prefix(banner.size());
    const std::size_t end = line.find_first_not_of(
        "0123456789.-+~abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ");
    const std::string_view version = line.substr(0, end);
    const bool isVersion = !version.empty() && version.size() <= longest &&
                           version.front() >= '0' && version.front() <= '9';
    return isVersion ? version : std::string_view();
}

void LineOutput::read(std::string_view line, std::vector<ToolLine>& lines)
{
    if (line.find_first_not_of(" \t") != std::string_view::npos)
        lines.push_back(tell(line));
}

ToolLine LineOutput::detail(std::string_view line)
{
    return {Kind::Detail, std::string(line), {}};
}

ToolLine LineOutput::phase(std::string_view line, std::string_view key)
{
    return {Kind::Phase, std::string(line), key};
}

ToolLine LineOutput::progress(double percent)
{
    return {Kind::Progress, {}, {}, percent};
}

void LineOutput::noteChange(FileChange change)
{
    constexpr std::size_t most = 100'000;
    if (findings_.changes.size() < most)
        findings_.changes.push_back(std::move(change));
}

void LineOutput::noteReadFault(const ReadFault& fault)
{
    if (!findings_.readFault || (findings_.readFault->isUnproven && !fault.isUnproven))
        findings_.readFault = fault;
}

ToolLine LineOutput::problem(std::string_view line, Damage damage)
{
    ++findings_.problems;
    findings_.damage.add(damage);
    return {Kind::Problem, std::string(line), {}};
}

}  // namespace pellar
