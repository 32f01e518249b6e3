// SPDX-License-Identifier: Apache-2.0
// What a translation must keep of the text that it stands for: the places that are filled in, the
// line ends around it, and the letter that a menu's entry is chosen by.

#include <gtest/gtest.h>

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <map>
#include <regex>
#include <set>
#include <string>
#include <vector>

namespace orvane::test {
namespace {

struct Entry {
    std::string key;
    std::string plural;
    std::vector<std::string> translations;
};

/// The text between the quotation marks of a line of a catalogue (gettext's manual, "The Format of
/// PO Files").
std::string unquoted(const std::string& line)
{
    std::string text;
    const std::size_t first = line.find('"');
    for (std::size_t i = first + 1; i + 1 < line.size(); ++i) {
        if (line[i] == '\\' && i + 2 < line.size())
            text += line[++i] == 'n' ? '\n' : line[i];
        else
            text += line[i];
    }
    return text;
}

std::vector<Entry> entriesOf(const std::filesystem::path& catalogue)
{
    std::vector<Entry> entries;
    std::string* last = nullptr;
    std::ifstream file(catalogue);
    for (std::string line; std::getline(file, line);) {
        if (line.starts_with("msgid_plural ")) {
            entries.back().plural = unquoted(line);
            last = &entries.back().plural;
        } else if (line.starts_with("msgid ")) {
            entries.push_back({unquoted(line), {}, {}});
            last = &entries.back().key;
        } else if (line.starts_with("msgstr")) {
            entries.back().translations.push_back(unquoted(line));
            last = &entries.back().translations.back();
        } else if (line.starts_with('"') && last != nullptr) {
            *last += unquoted(line);
        }
    }
    // The header has no key.
    std::erase_if(entries, [](const Entry& entry) { return entry.key.empty(); });
    return entries;
}

/// "%@" and the like, each with the number of the argument that fills it
/// (contract/foundation/Format.h): in a translation they may change places, with their numbers.
std::set<std::string> placesIn(const std::string& text)
{
    static const std::regex place("%(?:(\\d+)\\$)?(@|l?[du]|%)");
    std::set<std::string> places;
    int next = 0;
    for (std::sregex_iterator it(text.begin(), text.end(), place), end; it != end; ++it) {
        ++next;
        places.insert(((*it)[1].matched ? (*it)[1].str() : std::to_string(next)) + (*it)[2].str());
    }
    return places;
}

std::string lineEndsOf(const std::string& text)
{
    const std::size_t first = text.find_first_not_of('\n');
    const std::size_t last = text.find_last_not_of('\n');
    return std::string(first > 0 ? "some before, " : "none before, ") +
           std::to_string(text.size() - last - 1) + " behind";
}

long lettersIn(const std::string& text)
{
    static const std::regex letter("&[^& ]");
    return std::distance(std::sregex_iterator(text.begin(), text.end(), letter),
                         std::sregex_iterator());
}

std::size_t charactersIn(const std::string& text)
{
    return static_cast<std::size_t>(std::ranges::count_if(
        text, [](char byte) { return (static_cast<unsigned char>(byte) & 0xc0U) != 0x80U; }));
}

/// The locale directories of the host and the module.
const std::filesystem::path directories[]{HOST_TEXTS, MODULE_TEXTS};
constexpr const char* complete = "de";

class CatalogueTest : public testing::TestWithParam<const char*> {};

TEST_P(CatalogueTest, KeepsWhatTheProgramNeedsOfEachText)
{
    int looked = 0;
    for (const auto& directory : directories)
        for (const auto& catalogue : std::filesystem::directory_iterator(directory / GetParam()))
            for (const Entry& entry : entriesOf(catalogue.path())) {
                ++looked;
                ASSERT_FALSE(entry.translations.empty()) << entry.key;
                for (const std::string& text : entry.translations) {
                    const auto places = placesIn(text);
                    const bool fits = places == placesIn(entry.key) ||
                                      (!entry.plural.empty() && places == placesIn(entry.plural));
                    EXPECT_TRUE(fits) << entry.key << " -> " << text;
                    EXPECT_EQ(lineEndsOf(text), lineEndsOf(entry.key)) << text;
                    EXPECT_EQ(lettersIn(text), lettersIn(entry.key)) << text;
                    // A title that is far longer than the others finds no room.
                    if (lettersIn(entry.key) == 1) {
                        EXPECT_LE(charactersIn(text), 2 * charactersIn(entry.key) + 12) << text;
                    }
                }
            }
    EXPECT_GT(looked, 900);
}

TEST_P(CatalogueTest, HasEveryTextThatIsTranslated)
{
    for (const auto& directory : directories)
        for (const auto& catalogue : std::filesystem::directory_iterator(directory / complete)) {
            const auto file = directory / GetParam() / catalogue.path().filename();
            std::set<std::string> there;
            for (const Entry& entry : entriesOf(file))
                there.insert(entry.key);
            for (const Entry& entry : entriesOf(catalogue.path()))
                EXPECT_TRUE(there.erase(entry.key) == 1) << file << " lacks " << entry.key;
            EXPECT_TRUE(there.empty()) << file << " has, and nobody asks for, " << *there.begin();
        }
}

INSTANTIATE_TEST_SUITE_P(In, CatalogueTest, testing::Values("de", "es", "fr", "ja"),
                         [](const auto& language) { return std::string(language.param); });

}  // namespace
}  // namespace orvane::test
