// SPDX-License-Identifier: Apache-2.0
#include "orvane/desktop/toolkit/ColorScheme.h"
#include "orvane/desktop/toolkit/StyledLine.h"
#include "orvane/desktop/toolkit/Text.h"

#include <gtest/gtest.h>

namespace orvane::desktop {
namespace {

using contract::Color;
using contract::Font;
using contract::StyledText;
using contract::TextStyle;

qsizetype lengthOfRuns(const StyledLine& line)
{
    qsizetype length = 0;
    for (const StyledLine::Run& run : line.runs)
        length += run.length;
    return length;
}

TEST(Contrast, EveryColourOfTheLogIsReadableOnEveryPalette)
{
    for (const QColor& wanted : {QColor(255, 0, 0), QColor::fromRgbF(0, 0.8F, 0.2F),
                                 QColor(Qt::gray), QColor(Qt::black), QColor(Qt::white)})
        for (const char* background : {"#ffffff", "#efefef", "#1e1e1e", "#000000", "#777777"})
            EXPECT_GE(contrastRatio(background, readableOn(background, wanted)), readableContrast)
                << wanted.name().toStdString() << " on " << background;
    const QColor red = readableOn(Qt::white, Qt::red);
    EXPECT_GT(red.red(), 2 * red.green()) << "it is still red";
}

TEST(StyledLine, HostileTextIsOneHarmlessLine)
{
    struct Case {
        std::string_view text;
        const char* line;
        const char* because;
    };
    for (const Case& c : {Case{"Done\n\n", "Done", "line ends at the end are no rows"},
                          Case{"a\nb", "a b", "a label with a line end stays in its row"},
                          Case{"\x1b[31mred", "\uFFFD[31mred", "an escape is no escape"},
                          Case{"\xff", "\uFFFD", "no UTF-8"},
                          Case{"%s<b>", "%s<b>", "neither a format nor HTML"}}) {
        const StyledLine line = oneLine(StyledText::make(c.text));
        EXPECT_EQ(line.text, QString::fromUtf8(c.line)) << c.because;
        EXPECT_EQ(lengthOfRuns(line), line.text.size()) << c.because;
    }
}

TEST(StyledLine, FittedLineKeepsBothEndsInTheirStyles)
{
    const StyledText text = StyledText::make(std::string(200, 'a'), {Font::boldSystem(11), {}, {}});
    text.append(StyledText::make(std::string(200, 'b'), {Font::system(11), {}, {}}));
    contract::ParagraphStyle middle;
    middle.lineBreak = contract::LineBreak::TruncateMiddle;
    text.addAttributes({{}, {}, middle});
    const StyledLine line = oneLine(text);
    const QFontMetricsF metrics(widestFont(line, {}));
    const StyledLine shown = fitted(line, metrics, 300);
    EXPECT_LE(metrics.horizontalAdvance(shown.text), 300);
    EXPECT_TRUE(shown.text.startsWith(u'a') && shown.text.endsWith(u'b'));
    EXPECT_EQ(lengthOfRuns(shown), shown.text.size());
    EXPECT_TRUE(shown.runs.front().style->font->isBold);
    EXPECT_FALSE(shown.runs.back().style->font->isBold);
}

TEST(StyledLine, AMegabyteInOneLineIsCutInTheMiddle)
{
    const StyledLine line = oneLine(StyledText::make("<" + std::string(1 << 20, 'x') + ">\n"));
    EXPECT_LT(line.text.size(), 10000);
    EXPECT_TRUE(line.text.startsWith(u'<') && line.text.endsWith(u'>'));
    EXPECT_TRUE(line.text.contains(QChar(0x2026)));
    EXPECT_EQ(lengthOfRuns(line), line.text.size());
}

}  // namespace
}  // namespace orvane::desktop
