// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/tools/ext/E2fsckOutput.h"

#include <filesystem>
#include <fstream>
#include <stdexcept>
#include <string>
#include <vector>

namespace pellar::test {

/// What e2fsck 1.47.0 really printed, standard output and standard error as they came; 1.47.2
/// prints the same.
inline std::vector<std::string> recordedLines(std::string_view name)
{
    std::ifstream file(std::filesystem::path(PELLAR_RECORDED_DIRECTORY) /
                       (std::string(name) + ".txt"));
    if (!file)
        throw std::runtime_error("no recording " + std::string(name));
    std::vector<std::string> lines;
    for (std::string line; std::getline(file, line);)
        lines.push_back(line);
    return lines;
}

inline std::vector<std::string> recordings()
{
    std::vector<std::string> names;
    for (const auto& entry : std::filesystem::directory_iterator(PELLAR_RECORDED_DIRECTORY))
        if (entry.path().extension() == ".txt")
            names.push_back(entry.path().stem());
    return names;
}

struct Reading {
    std::vector<ToolLine> lines;
    Findings findings;
};

inline Reading readAll(const std::vector<std::string>& lines)
{
    E2fsckOutput output;
    Reading reading;
    for (const std::string& line : lines)
        output.read(line, reading.lines);
    output.finish(reading.lines);
    reading.findings = output.findings();
    return reading;
}

}  // namespace pellar::test
