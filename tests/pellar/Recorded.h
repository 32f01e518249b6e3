// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/process/ProcessOutput.h"
#include "pellar/tools/ToolTable.h"

#include <filesystem>
#include <fstream>
#include <iterator>
#include <stdexcept>
#include <string>
#include <vector>

namespace pellar::test {

/// What a tool really printed, standard output and standard error as they came, in the lines that a
/// run would tell: what a tool writes over itself is two lines.
inline std::vector<std::string> recordedLines(std::string_view name)
{
    std::ifstream file(
        std::filesystem::path(PELLAR_RECORDED_DIRECTORY) / (std::string(name) + ".txt"),
        std::ios::binary);
    if (!file)
        throw std::runtime_error("no recording " + std::string(name));
    std::vector<std::string> lines;
    LineSplitter splitter(4096,
                          [&lines](std::string_view line, bool) { lines.emplace_back(line); });
    splitter.take(std::string(std::istreambuf_iterator<char>(file), {}));
    splitter.finish();
    return lines;
}

/// The names of all that e2fsck has printed.
inline std::vector<std::string> recordingsOfE2fsck()
{
    std::vector<std::string> names;
    for (const auto& entry : std::filesystem::directory_iterator(
             std::filesystem::path(PELLAR_RECORDED_DIRECTORY) / "e2fsck"))
        names.push_back("e2fsck/" + entry.path().stem().native());
    return names;
}

struct ReadOutput {
    std::vector<ToolLine> lines;
    Findings findings;

    std::vector<std::string> problems() const
    {
        std::vector<std::string> problems;
        for (const ToolLine& line : lines)
            if (line.kind == ToolLine::Kind::Problem)
                problems.push_back(line.text);
        return problems;
    }
};

inline ReadOutput readAll(const Tool& tool, const std::vector<std::string>& lines)
{
    const auto reader = tool.makeReader();
    ReadOutput output;
    for (const std::string& line : lines)
        reader->read(line, output.lines);
    reader->finish(output.lines);
    output.findings = reader->findings();
    return output;
}

}  // namespace pellar::test
