// SPDX-License-Identifier: Apache-2.0
#include "orvane/support/history/RecordPage.h"

namespace orvane {
namespace {

constexpr unsigned bitsOfByte = 7;
constexpr unsigned goesOn = 1U << bitsOfByte;

void addNumber(std::string& page, std::uint64_t number)
{
    for (; number >= goesOn; number >>= bitsOfByte)
        page += static_cast<char>(number | goesOn);
    page += static_cast<char>(number);
}

void addText(std::string& page, std::string_view text)
{
    addNumber(page, text.size());
    page += text;
}

/// Reads what the page has; a page that ends too soon is damaged from then on.
class PageReader {
public:
    explicit PageReader(std::string_view page) : rest_(page) {}

    std::uint64_t number()
    {
        std::uint64_t number = 0;
        for (unsigned bits = 0; bits < 64; bits += bitsOfByte) {
            const std::string_view byte = bytes(1);
            if (byte.empty())
                return 0;
            const auto value = static_cast<unsigned char>(byte.front());
            number |= std::uint64_t{value & (goesOn - 1)} << bits;
            if (value < goesOn)
                return number;
        }
        isDamaged_ = true;
        return 0;
    }
    std::string_view text() { return bytes(number()); }

    bool isDamaged() const { return isDamaged_; }
    std::string_view rest() const { return rest_; }

private:
    std::string_view bytes(std::uint64_t count)
    {
        isDamaged_ = isDamaged_ || count > rest_.size();
        if (isDamaged_)
            return {};
        const std::string_view taken = rest_.substr(0, count);
        rest_.remove_prefix(count);
        return taken;
    }

    std::string_view rest_;
    bool isDamaged_ = false;
};

// Small numbers of either sign are small: 0, -1, 1, -2 become 0, 1, 2, 3.
std::uint64_t withoutSign(std::int64_t number)
{
    return (static_cast<std::uint64_t>(number) << 1U) ^ static_cast<std::uint64_t>(number >> 63U);
}

std::int64_t withSign(std::uint64_t number)
{
    return static_cast<std::int64_t>((number >> 1U) ^ (~(number & 1U) + 1));
}

}  // namespace

void addToPage(std::string& page, const NumberedColumns& record)
{
    addNumber(page, static_cast<std::uint64_t>(record.shape));
    addNumber(page, static_cast<std::uint64_t>(record.style));
    addNumber(page, withoutSign(record.columns.verbosity));
    for (const std::string_view text :
         {record.columns.type, record.columns.message, record.columns.text, record.columns.extra})
        addText(page, text);
}

std::optional<NumberedColumns> takeFromPage(std::string_view& page)
{
    PageReader reader(page);
    NumberedColumns record;
    record.shape = static_cast<std::int64_t>(reader.number());
    record.style = static_cast<std::int64_t>(reader.number());
    record.columns.verbosity = withSign(reader.number());
    for (std::string_view* const text : {&record.columns.type, &record.columns.message,
                                         &record.columns.text, &record.columns.extra})
        *text = reader.text();
    page = reader.rest();
    return reader.isDamaged() ? std::nullopt : std::optional(record);
}

}  // namespace orvane
