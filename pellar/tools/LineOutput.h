// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "pellar/tools/Tool.h"

namespace pellar {

/// Reads a tool of which each line says by itself what it is. Empty lines are not passed on.
class LineOutput : public OutputReader {
public:
    void read(std::string_view line, std::vector<ToolLine>& lines) final;
    void finish(std::vector<ToolLine>&) final {}
    const Findings& findings() const final { return findings_; }

protected:
    /// Notes in `findings_` what the line says.
    virtual ToolLine tell(std::string_view line) = 0;

    static ToolLine detail(std::string_view line);
    static ToolLine phase(std::string_view line, std::string_view key);
    static ToolLine progress(double percent);
    ToolLine problem(std::string_view line, Damage damage);
    /// Kept unless there is one, or one that is less sure.
    void noteReadFault(const ReadFault& fault);

    Findings findings_;
};

/// A phase that a tool announces by a line of its own, or by how one begins.
struct PhaseSign {
    std::string_view start;
    std::string_view key;  ///< its English text, a literal
};

/// A sort of damage and the words by which a line tells of it.
struct DamageSign {
    std::string_view text;
    Damage::Kind kind;
};

/// The first sign whose start the line has; null for none.
template <class Signs>
const PhaseSign* phaseIn(const Signs& signs, std::string_view line)
{
    for (const PhaseSign& sign : signs)
        if (line.starts_with(sign.start))
            return &sign;
    return nullptr;
}

/// The first sign that occurs in the line; null for none.
template <class Signs>
const DamageSign* damageIn(const Signs& signs, std::string_view line)
{
    for (const DamageSign& sign : signs)
        if (line.find(sign.text) != std::string_view::npos)
            return &sign;
    return nullptr;
}

}  // namespace pellar
