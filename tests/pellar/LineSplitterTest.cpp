// SPDX-License-Identifier: Apache-2.0
#include "pellar/process/ProcessOutput.h"

#include <gtest/gtest.h>

#include <vector>

namespace {

using Lines = std::vector<std::string>;

Lines split(const std::vector<std::string>& pieces, std::size_t longest = 8)
{
    Lines lines;
    pellar::LineSplitter splitter(longest, [&lines](std::string_view line, bool isCut) {
        lines.push_back(std::string(line) + (isCut ? "[cut]" : ""));
    });
    for (const std::string& piece : pieces)
        splitter.take(piece);
    splitter.finish();
    return lines;
}

TEST(LineSplitter, CutsAtEveryLineEnd)
{
    using namespace std::string_literals;
    struct Case {
        std::vector<std::string> pieces;
        Lines lines;
        std::string_view because;
    };
    for (const Case& c :
         {Case{{"a\nb\n"}, {"a", "b"}, "the last end makes no empty line"},
          Case{{"a\r\nb\rc"}, {"a", "b", "c"}, "three kinds of ends, and none"},
          Case{{"a\r", "\nb"}, {"a", "b"}, "one end, torn apart"},
          Case{{"a\r", "", "\n\nb"}, {"a", "", "b"}, "an end and an empty line"},
          Case{{"a\r\r\nb"}, {"a", "", "b"}, "two ends"},
          Case{{"a\0\xFF\n"s}, {"a\0\xFF"s}, "any bytes"},
          Case{{"12345678\n"}, {"12345678"}, "just as long as may be"},
          Case{{"123456789", "more\nb\n"}, {"12345678[cut]", "b"}, "the rest is dropped"},
          Case{{"12345678", "9"}, {"12345678[cut]"}, "cut at the very end"},
          Case{{}, {}, "nothing"}})
        EXPECT_EQ(split(c.pieces), c.lines) << c.because;
}

}  // namespace
