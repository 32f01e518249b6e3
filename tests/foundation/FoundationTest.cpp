// SPDX-License-Identifier: Apache-2.0
#include "contract/foundation/Array.h"
#include "contract/foundation/Dictionary.h"
#include "contract/foundation/Format.h"
#include "contract/foundation/PhraseMatcher.h"
#include "contract/foundation/RunLoop.h"
#include "contract/foundation/StyledText.h"
#include "contract/foundation/UTF8.h"

#include <gtest/gtest.h>

#include <cmath>
#include <limits>

#include <random>

namespace contract {
namespace {

struct Counted final : Object {
    static inline int alive = 0;
    Counted() { ++alive; }
    ~Counted() override { --alive; }
};

}  // namespace

TEST(Values, ReadTheNeutralValueWhereTheKindDoesNotFit)
{
    const Value none;
    const Value text("42");
    EXPECT_EQ(none.integer(), 0);
    EXPECT_EQ(text.integer(), 0) << "a string is no number";
    EXPECT_FALSE(text.array());
    EXPECT_TRUE(text.array().isEmpty());
    EXPECT_EQ(Value(-2.9).integer(), -2);
    EXPECT_EQ(Value(4e24).integer(), std::numeric_limits<std::int64_t>::max());
    EXPECT_EQ(Value(-4e24).integer(), std::numeric_limits<std::int64_t>::min());
    EXPECT_EQ(Value(std::nan("")).integer(), 0);
    EXPECT_EQ(Value(1'000'000'007).integer(), 1'000'000'007) << "beyond the shared numbers";
    EXPECT_NE(Value(1), Value("1"));
    EXPECT_EQ(Value(1), Value(1.0));
    EXPECT_TRUE(Value(std::shared_ptr<Object>()).isNone());
}

TEST(Values, GiveBackWhatTheyHold)
{
    {
        const Dictionary dictionary = Dictionary::make();
        const Array array = Array::of({std::make_shared<Counted>(), dictionary});
        dictionary.set(Name("object"), std::make_shared<Counted>());
        dictionary.set(Name("object"), std::make_shared<Counted>());
        EXPECT_EQ(Counted::alive, 2) << "the replaced one is gone";
        Value copy = array;
        copy = copy.array().at(1);
        EXPECT_TRUE(copy.dictionary().isSameAs(dictionary)) << "handles share";
    }
    EXPECT_EQ(Counted::alive, 0);
}

TEST(Dictionaries, KeepTheOrderOfInsertionThroughGrowthAndRemoval)
{
    const Dictionary dictionary = Dictionary::make();
    for (int i = 0; i < 40; ++i)
        dictionary.set(Name("key" + std::to_string(i)), i);
    for (int i = 0; i < 40; i += 2)
        dictionary.remove(Name("key" + std::to_string(i)));
    dictionary.set(Name("key1"), "changed in place");
    dictionary.set(Name("key3"), Value());
    std::string keys;
    for (const auto& [key, value] : dictionary.entries())
        keys += std::string(key.text()).substr(3) + " ";
    EXPECT_EQ(keys, "1 5 7 9 11 13 15 17 19 21 23 25 27 29 31 33 35 37 39 ");
    EXPECT_EQ(dictionary.string(Name("key1")), "changed in place");
    const Dictionary copy = dictionary.mutableCopy();
    copy.set(Name("key1"), 0);
    EXPECT_EQ(dictionary.string(Name("key1")), "changed in place") << "a copy is another one";
    EXPECT_EQ(Value(Dictionary::of({{Name("a"), 1}, {Name("b"), Array::of({"x"})}})).description(),
              "{a = 1, b = (x)}");
}

TEST(Formats, FillPlaceholdersAndNeverReadAnArgument)
{
    struct Case {
        std::string_view text;
        std::vector<FormatArgument> arguments;
        std::string_view expected;
    };
    const auto fill = [](const Case& c) {
        switch (c.arguments.size()) {
            case 0: return format(c.text, {});
            case 1: return format(c.text, {c.arguments[0]});
            default: return format(c.text, {c.arguments[0], c.arguments[1]});
        }
    };
    for (const Case& c : {
             Case{"“%@”", {"%@ %s %n"}, "“%@ %s %n”"},
             Case{"%2$@ %1$@", {"a", "b"}, "b a"},
             Case{"%@ %@", {"only"}, "only %@"},
             Case{"%ld %d", {-5, 7}, "-5 7"},
             Case{"%.1f%%", {49.96}, "50.0%"},
             Case{"%%%ld$@", {3}, "%3$@"},
             Case{"%q %@ 100%", {"x"}, "%q x 100%"},
             Case{"%@", {std::string_view("nul\0byte", 8)}, std::string_view("nul\0byte", 8)},
             Case{"%99999999999999$@", {"x"}, "%99999999999999$@"},
             Case{"%s %@", {1.5, 12}, "1.5 12"},
         })
        EXPECT_EQ(fill(c), c.expected) << c.text;
}

TEST(PhraseMatching, AgreesWithAPlainSearchOnRandomLines)
{
    std::mt19937 random(20240917);
    const std::string letters = "aAbBcC. ÄäЖж";
    const auto text = [&](std::size_t length) {
        std::string made;
        for (std::size_t i = 0; i < length; ++i)
            made += letters[random() % letters.size()];  // cuts letters in two as well
        return made;
    };
    const auto plainFirst = [](const std::vector<std::string>& phrases, const std::string& line) {
        for (std::size_t i = 0; i < phrases.size(); ++i)
            if (!phrases[i].empty() &&
                foldedCase(line).find(foldedCase(phrases[i])) != std::string::npos)
                return i;
        return PhraseMatcher::none;
    };
    int found = 0;
    for (int round = 0; round < 300; ++round) {
        std::vector<std::string> phrases;
        for (int i = 0; i < 11; ++i)
            phrases.push_back(text(random() % 6));
        const PhraseMatcher matcher(phrases);
        for (int i = 0; i < 20; ++i) {
            const std::string line = text(random() % 30);
            const std::size_t expected = plainFirst(phrases, line);
            ASSERT_EQ(matcher.firstIn(line), expected) << line;
            found += expected != PhraseMatcher::none;
        }
    }
    EXPECT_GT(found, 1000) << "the rounds must put something to the test";
}

TEST(PhraseMatching, IgnoresTheCaseOfLettersInSeveralScripts)
{
    for (const auto& [upper, lower] :
         std::vector<std::pair<std::string, std::string>>{{"ÜBERPRÜFUNG", "überprüfung"},
                                                          {"ПРОВЕРКА Ё", "проверка ё"},
                                                          {"ΕΛΕΓΧΟΣ ΌΛΗΣ", "ελεγχοσ όλησ"},
                                                          {"ПЕРЕВІРКА ҐҚӀ", "перевірка ґқӏ"},
                                                          {"ŁÓDŹ ĀĊŻ", "łódź āċż"}}) {
        EXPECT_EQ(foldedCase(upper), lower);
        EXPECT_EQ(PhraseMatcher(std::vector{lower}).firstIn("x " + upper + " y"), 0U);
    }
    EXPECT_EQ(foldedCase("×÷"), "×÷") << "signs are no letters";
}

TEST(UTF8, HostileTextBecomesHarmless)
{
    struct Case {
        std::string_view text;
        std::string_view shown;
        std::string_view because;
    };
    for (const Case& c : {
             Case{"Größe ﬁ 漢 🖴", "Größe ﬁ 漢 🖴", "text of the world"},
             Case{"\x1b[31mred\a\n\r", "�[31mred���", "control characters"},
             Case{"a\tb", "a b", "a tab is a space"},
             Case{"\xc2\x9b"
                  "31m",
                  "�31m", "the one-byte escape sequence introducer"},
             Case{"\xc0\xaf", "��", "an overlong form"},
             Case{"\xed\xa0\x80", "���", "a surrogate"},
             Case{"\xf4\x90\x80\x80", "����", "beyond the last character"},
             Case{"cut \xe2\x82", "cut ��", "cut off"},
             Case{"\xe2\x80\xae"
                  "gnp.exe",
                  "�gnp.exe", "turned writing direction"},
         })
        EXPECT_EQ(printable(c.text), c.shown) << c.because;
}

TEST(StyledTexts, JoinAndStyleTheirRuns)
{
    const TextStyle bold{Font::boldSystem(11), {}, {}};
    const TextStyle red{{}, Color{1, 0, 0, 1}, {}};
    const StyledText text = StyledText::make("ab", bold);
    text.append("c");
    text.append(StyledText::make("d", bold));
    EXPECT_EQ(text.runs().size(), 1U) << "one look, one run";
    text.append(StyledText::make("é", red));
    text.append("!");
    ASSERT_EQ(text.runs().size(), 2U);
    EXPECT_EQ(*text.runs()[1].style, red);
    text.append(text);
    EXPECT_EQ(text.characters(), "abcdé!abcdé!");
    EXPECT_EQ(text.runs().size(), 4U);
    const StyledText copy = text.copy();
    copy.addAttributes(TextStyle{{}, Color{0, 1, 0, 1}, {}});
    EXPECT_EQ(copy.runs()[0].style->font, Font::boldSystem(11)) << "what it had stays";
    EXPECT_EQ(text.runs()[1].style->color, (Color{1, 0, 0, 1})) << "the other text is untouched";
}

TEST(StyledTexts, GrowAsStringsDo)
{
    for (const std::size_t size : {0, 1, 22, 23, 24, 65408, 65409, 65535, 65536}) {
        std::string expected(size, 'x');
        const StyledText text = StyledText::make(expected);
        for (int i = 0; i < 40; ++i) {
            text.append(i % 2 == 0 ? "\n" : "added");
            expected += i % 2 == 0 ? "\n" : "added";
            ASSERT_EQ(text.characters(), expected) << size << " bytes, addition " << i;
        }
        text.append(text.characters());
        EXPECT_EQ(text.characters(), expected + expected) << size;
        EXPECT_EQ(text.copy().characters(), text.characters()) << size;
    }
    const StyledText small = StyledText::make("twice");
    small.append(small.characters());
    small.append(small);
    EXPECT_EQ(small.characters(), "twicetwicetwicetwice");
}

TEST(RichText, EscapesEverythingThatRTFWouldObey)
{
    const StyledText text =
        StyledText::make("a\\b{c}\td\n", {Font::boldSystem(11), Color{1, 0, 0, 1}, {}});
    text.append(StyledText::make("é漢🖴\x1b[0m\xff", {Font::system(11), {}, {}}));
    const std::string made = rtf(text);
    EXPECT_NE(made.find("{\\colortbl;\\red255\\green0\\blue0;}"), std::string::npos);
    EXPECT_NE(made.find("{\\f0\\b\\fs22\\cf1 a\\\\b\\{c\\}\\tab d\\par\n}"), std::string::npos);
    EXPECT_NE(made.find("\\u233?\\u28450?\\u-10179?\\u-8780?[0m\\u-3?"), std::string::npos) << made;
    EXPECT_EQ(made.find('\x1b'), std::string::npos);
    const Color beyond{4e24, -1, std::nan(""), 1};
    EXPECT_NE(rtf(StyledText::make("x", {{}, beyond, {}})).find("\\red255\\green0\\blue0;"),
              std::string::npos);
}

}  // namespace contract
