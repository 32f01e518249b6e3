// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "contract/foundation/Value.h"

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace contract {

/// Red, green, blue and opacity, each from 0.0 to 1.0.
struct Color {
    double red = 0;
    double green = 0;
    double blue = 0;
    double alpha = 1;

    friend bool operator==(const Color&, const Color&) = default;
};

/// The system's interface font in one weight and size (in points).
struct Font {
    bool isBold = false;
    double points = 0;

    static Font system(double points) { return {false, points}; }
    static Font boldSystem(double points) { return {true, points}; }

    friend bool operator==(const Font&, const Font&) = default;
};

/// The toolkit's modes of fitting a line that is too long.
enum class LineBreak : std::uint8_t {
    WordWrap = 0,
    CharacterWrap = 1,
    Clip = 2,
    TruncateHead = 3,
    TruncateTail = 4,
    TruncateMiddle = 5,
};

struct ParagraphStyle {
    LineBreak lineBreak = LineBreak::WordWrap;
    double firstLineIndent = 0;  ///< points
    double headIndent = 0;       ///< points, from the second line on
    double spacingAfter = 0;     ///< points

    friend bool operator==(const ParagraphStyle&, const ParagraphStyle&) = default;
};

/// What a stretch of text looks like. What is absent is the view's default.
struct TextStyle {
    std::optional<Font> font;
    std::optional<Color> color;
    std::optional<ParagraphStyle> paragraph;

    /// This style with every attribute that `other` has.
    TextStyle with(const TextStyle& other) const;

    friend bool operator==(const TextStyle&, const TextStyle&) = default;
};

/// A handle to a mutable text (UTF-8, any bytes allowed) with styles. Copies of the handle share
/// the text; a handle made by default holds none and reads as empty.
///
/// Styles are interned: a million red lines share one style, and a text in one style carries no
/// list of runs.
class StyledText {
public:
    /// A stretch of bytes in one style.
    struct Run {
        std::size_t length;
        const TextStyle* style;  ///< interned, lives as long as the process
    };

    StyledText() noexcept = default;
    static StyledText make(std::string_view characters = {}, const TextStyle& style = {});
    StyledText copy() const;

    explicit operator bool() const noexcept { return static_cast<bool>(node_); }

    /// Valid until the text is next changed.
    std::string_view characters() const noexcept;
    bool isEmpty() const noexcept { return characters().empty(); }
    /// The runs in order; none for an empty text.
    std::vector<Run> runs() const;
    /// The style of the first character (of the whole text when it is in one style).
    const TextStyle& style() const noexcept;

    /// Adds plain characters in the style of the text's end, as typing there would.
    void append(std::string_view characters) const;
    void append(const StyledText& other) const;
    /// Puts every attribute that `style` has over the whole text.
    void addAttributes(const TextStyle& style) const;

private:
    friend class Value;
    friend struct Node;
    struct Storage;
    explicit StyledText(NodePointer<Node> node) noexcept : node_(std::move(node)) {}
    Storage* storage() const noexcept;

    NodePointer<Node> node_;
};

/// The text as RTF (Rich Text Format Specification 1.9.1): fonts, sizes, colours and paragraph
/// ends, every character outside ASCII as an escape. Bytes that are no UTF-8 become U+FFFD, and
/// control characters other than tab and line feed are left out.
std::string rtf(const StyledText& text);

/// The text as RTFD: the RTF and its attachments. A log has no attachments, so this is the RTF.
std::string rtfd(const StyledText& text);

}  // namespace contract
