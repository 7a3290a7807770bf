#include "import/StyleReader.h"

#include <array>
#include <charconv>

namespace Import
{

namespace
{

int HexDigit(char c)
{
    return '0' <= c && c <= '9'   ? c - '0'
           : 'a' <= c && c <= 'f' ? c - 'a' + 10
           : 'A' <= c && c <= 'F' ? c - 'A' + 10
                                  : -1;
}

/// "0.1, 0.2)" into numbers from 0 to 1; how many there were, or -1.
int ReadComponents(std::string_view text, std::array<float, 4> & values)
{
    int count = 0;
    for (;;) {
        while (text.starts_with(' ')) {
            text.remove_prefix(1);
        }
        float value = 0;
        auto const [end, error] = std::from_chars(text.data(), text.data() + text.size(), value);
        if (std::errc() != error || value < 0 || 1 < value || 4 == count) {
            return -1;
        }
        values[static_cast<std::size_t>(count++)] = value;
        text.remove_prefix(static_cast<std::size_t>(end - text.data()));
        while (text.starts_with(' ')) {
            text.remove_prefix(1);
        }
        if (")" == text) {
            return count;
        }
        if (!text.starts_with(',')) {
            return -1;
        }
        text.remove_prefix(1);
    }
}

void SetColour(TomlReader & reader, std::string_view key, ColourTable const & colours, Story::AttSet & atts, int id)
{
    std::string text;
    if (!reader.Text(key, text)) {
        return;
    }
    if (auto const colour = ReadColour(text, colours)) {
        atts.SetColour(id, *colour);
    } else {
        reader.Refuse(
            *reader.Find(key), key,
            "a colour such as \"#8a1c1c\", \"grey(0.4)\" or \"cmyk(0, 0.9, 0.8, 0.2)\", or a name from [colours]");
    }
}

void SetSwitch(TomlReader & reader, std::string_view key, Story::AttSet & atts, int id)
{
    bool value = false;
    if (reader.Switch(key, value)) {
        atts.SetInt(id, value ? 1 : 0);
    }
}

void SetLength(TomlReader & reader, std::string_view key, Story::AttSet & atts, int id)
{
    double value = 0;
    if (reader.Length(key, value)) {
        atts.SetDouble(id, value);
    }
}

void SetInteger(TomlReader & reader, std::string_view key, Story::AttSet & atts, int id, int least, int most)
{
    int value = 0;
    if (reader.Integer(key, value, least, most)) {
        atts.SetInt(id, value);
    }
}

void ReadGlyphAttributes(TomlReader & reader, ColourTable const & colours, Story::AttSet & atts)
{
    namespace Att = Story::GlyphAtt;
    std::vector<std::string> families;
    if (reader.Texts("font", families)) {
        std::string list;
        for (std::string const & family : families) {
            list += (list.empty() ? "" : ",") + family;
        }
        atts.SetString(Att::Families, String(list));
    }
    std::string text;
    if (reader.Text("features", text)) {
        atts.SetString(Att::Features, String(text));
    }
    if (reader.Text("lang", text)) {
        atts.SetString(Att::Language, String(text));
    }
    double number = 0;
    if (reader.Number("tracking", number)) {
        atts.SetDouble(Att::Tracking, number);
    }
    if (reader.Number("size-factor", number)) {
        atts.SetDouble(Att::SizeFactor, number);
    }
    int choice = 0;
    if (reader.Choice("position", {"baseline", "superscript", "subscript"}, choice)) {
        atts.SetInt(Att::Position, choice);
    }
    SetLength(reader, "size", atts, Att::Size);
    SetInteger(reader, "weight", atts, Att::Weight, 100, 900);
    SetSwitch(reader, "italic", atts, Att::Italic);
    SetSwitch(reader, "underline", atts, Att::Underline);
    SetSwitch(reader, "strike", atts, Att::Strike);
    SetSwitch(reader, "ligatures", atts, Att::Ligatures);
    SetSwitch(reader, "small-caps", atts, Att::SmallCaps);
    SetColour(reader, "colour", colours, atts, Att::Text);
}

void ReadParagraphAttributes(TomlReader & reader, ColourTable const & colours, Story::AttSet & atts)
{
    namespace Att = Story::ParagraphAtt;
    int choice = 0;
    if (reader.Choice("align", {"left", "centre", "right", "justify"}, choice)) {
        atts.SetInt(Att::Alignment, choice);
    }
    SetLength(reader, "leading", atts, Att::Leading);
    SetLength(reader, "left", atts, Att::LeftIndent);
    SetLength(reader, "right", atts, Att::RightIndent);
    SetLength(reader, "indent", atts, Att::FirstLineIndent);
    SetLength(reader, "before", atts, Att::SpaceBefore);
    SetLength(reader, "after", atts, Att::SpaceAfter);
    SetLength(reader, "padding", atts, Att::Padding);
    SetLength(reader, "list-indent", atts, Att::ListIndent);
    SetLength(reader, "border-width", atts, Att::BorderWidth);
    SetSwitch(reader, "keep-with-next", atts, Att::KeepWithNext);
    SetSwitch(reader, "keep-with-previous", atts, Att::KeepWithPrevious);
    SetSwitch(reader, "keep-together", atts, Att::KeepTogether);
    SetSwitch(reader, "hyphenate", atts, Att::Hyphenate);
    SetSwitch(reader, "grid", atts, Att::AlignToGrid);
    SetSwitch(reader, "page-break", atts, Att::PageBreakBefore);
    SetSwitch(reader, "mark-wraps", atts, Att::MarkWraps);
    SetInteger(reader, "orphans", atts, Att::Orphans, 1, 20);
    SetInteger(reader, "widows", atts, Att::Widows, 1, 20);
    SetInteger(reader, "outline", atts, Att::OutlineLevel, 0, 6);
    SetInteger(reader, "tab-size", atts, Att::TabSize, 1, 16);
    SetColour(reader, "background", colours, atts, Att::Background);
    SetColour(reader, "border-colour", colours, atts, Att::Border);
    std::vector<std::string> sides;
    if (reader.Texts("border", sides)) {
        int bits = 0;
        for (std::string const & side : sides) {
            int const bit = "left" == side     ? Att::BorderLeft
                            : "top" == side    ? Att::BorderTop
                            : "right" == side  ? Att::BorderRight
                            : "bottom" == side ? Att::BorderBottom
                                               : 0;
            if (0 == bit) {
                reader.Refuse(*reader.Find("border"), "border",
                              "a list of \"left\", \"top\", \"right\" and \"bottom\"");
            }
            bits |= bit;
        }
        atts.SetInt(Att::BorderSides, bits);
    }
}

}

std::optional<Story::Colour> ReadColour(std::string_view text, ColourTable const & colours)
{
    if (auto const named = colours.find(text); named != colours.end()) {
        return named->second;
    }
    if (text.starts_with('#') && 7 == text.size()) {
        std::array<float, 3> parts{};
        for (std::size_t at = 0; at < 3; ++at) {
            int const high = HexDigit(text[1 + 2 * at]);
            int const low = HexDigit(text[2 + 2 * at]);
            if (high < 0 || low < 0) {
                return std::nullopt;
            }
            parts[at] = static_cast<float>(high * 16 + low) / 255.0f;
        }
        return Story::Colour::RGB(parts[0], parts[1], parts[2]);
    }
    std::size_t const open = text.find('(');
    if (std::string_view::npos == open) {
        return std::nullopt;
    }
    std::string_view const space = text.substr(0, open);
    std::array<float, 4> c{};
    int const count = ReadComponents(text.substr(open + 1), c);
    if (("grey" == space || "gray" == space) && 1 == count) {
        return Story::Colour::Grey(c[0]);
    }
    if ("rgb" == space && 3 == count) {
        return Story::Colour::RGB(c[0], c[1], c[2]);
    }
    if ("cmyk" == space && 4 == count) {
        return Story::Colour::CMYK(c[0], c[1], c[2], c[3]);
    }
    return std::nullopt;
}

void ReadStyleAttributes(TomlReader & reader, ColourTable const & colours, Story::AttSet & glyphAtts,
                         Story::AttSet * paragraphAtts)
{
    ReadGlyphAttributes(reader, colours, glyphAtts);
    if (paragraphAtts) {
        ReadParagraphAttributes(reader, colours, *paragraphAtts);
        return;
    }
    SetColour(reader, "background", colours, glyphAtts, Story::GlyphAtt::Background);
    bool hyphenate = true;
    if (reader.Switch("hyphenate", hyphenate)) {
        glyphAtts.SetInt(Story::GlyphAtt::Hyphenate, hyphenate ? 1 : 0);
    }
}

}
