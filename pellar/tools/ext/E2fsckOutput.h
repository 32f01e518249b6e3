// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/outcome/Damage.h"
#include "pellar/tools/Tool.h"

#include <optional>
#include <string_view>
#include <vector>

namespace pellar {

/// Reads what e2fsck 1.47 prints in the C locale.
///
/// A problem is a line that ends in a question with its answer,
///     "Inode 16 ref count is 9, should be 1.  Fix? no"
/// or a few lines before a line that holds only these:
///     "Unattached inode 20"
///     "Connect to /lost+found? no"
/// so a line that says nothing by itself is kept back until the next one comes; its first line
/// then stands for the problem. "IGNORED." is an answer too. Empty lines only part paragraphs and
/// are not passed on.
class E2fsckOutput final : public OutputReader {
public:
    void read(std::string_view line, std::vector<ToolLine>& lines) override;
    void finish(std::vector<ToolLine>& lines) override;
    const Findings& findings() const override { return findings_; }

private:
    bool readLandmark(std::string_view line, std::vector<ToolLine>& lines);
    bool readTrouble(std::string_view line);
    bool readRemark(std::string_view line);
    void readAnswer(std::string_view line, bool isYes, std::vector<ToolLine>& lines);
    void countLosses(std::string_view problem, std::string_view answer);
    void keepBack(std::string_view line, std::vector<ToolLine>& lines);
    void releaseKept(ToolLine::Kind firstKind, std::vector<ToolLine>& lines);

    Findings findings_;
    std::vector<std::string> kept_;
    bool wasAnswered_ = false;  ///< the last line that was not empty was an answer
};

/// "2 7 13 /dev/sdb1": pass, done, of; weighed as e2fsck's own progress bar does. None for
/// anything else.
std::optional<double> e2fsckPercent(std::string_view progressLine);

/// What a problem that e2fsck names means. A line that is not known counts as damaged contents:
/// rather too grave than too light.
Damage e2fsckDamageOf(std::string_view problem);

}  // namespace pellar
