// SPDX-License-Identifier: Apache-2.0
// A tool that misbehaves, as the whole program bears it.

#include "tests/terminal/ProgramTest.h"

namespace orvane::test {
namespace {

// What a user of a small machine can spare.
#if defined(__SANITIZE_ADDRESS__)
constexpr long mostMemoryInKiB = 1200 * 1024;
#else
constexpr long mostMemoryInKiB = 600 * 1024;
#endif

using ToolFaultTest = ProgramTest;

TEST_F(ToolFaultTest, OutputWithoutEndIsEndedInLittleMemory)
{
    makeVolume("image");
    for (const auto& [script, status] : {std::pair{"flood-bytes", 8}, {"flood-lines", 4}}) {
        useTool(script);
        const RunResult result = run({"verify", "image"});
        EXPECT_EQ(result.status, status) << result.output.substr(0, 2000) << result.errors;
        EXPECT_EQ(countOf("e2fsck printed more than a check can need", result.output), 1U);
        EXPECT_LT(linesOf(result.output).size(), 100U) << "the brief log stays readable";
        EXPECT_LT(result.mostMemoryInKiB, mostMemoryInKiB);
    }
}

}  // namespace
}  // namespace orvane::test
