#include "typeset/TypesetSupport.h"

#include <algorithm>
#include <cmath>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <sstream>

using namespace Typeset;

std::string ToUtf8(std::u16string_view text)
{
    std::string utf8;
    for (std::size_t i = 0; i < text.size(); ++i) {
        char32_t character = text[i];
        if (character >= 0xD800 && character < 0xDC00 && i + 1 < text.size()) {
            character = 0x10000 + ((character - 0xD800) << 10) + (text[++i] - 0xDC00);
        }
        if (character < 0x80) {
            utf8 += static_cast<char>(character);
        } else if (character < 0x800) {
            utf8 += static_cast<char>(0xC0 | character >> 6);
            utf8 += static_cast<char>(0x80 | (character & 63));
        } else if (character < 0x10000) {
            utf8 += static_cast<char>(0xE0 | character >> 12);
            utf8 += static_cast<char>(0x80 | (character >> 6 & 63));
            utf8 += static_cast<char>(0x80 | (character & 63));
        } else {
            utf8 += static_cast<char>(0xF0 | character >> 18);
            utf8 += static_cast<char>(0x80 | (character >> 12 & 63));
            utf8 += static_cast<char>(0x80 | (character >> 6 & 63));
            utf8 += static_cast<char>(0x80 | (character & 63));
        }
    }
    return utf8;
}

std::u16string ToUtf16(std::string_view text)
{
    std::u16string utf16;
    for (std::size_t i = 0; i < text.size();) {
        auto const lead = static_cast<unsigned char>(text[i]);
        int const more = lead < 0x80 ? 0 : lead < 0xE0 ? 1 : lead < 0xF0 ? 2 : 3;
        char32_t character = more == 0 ? lead : lead & (0x3F >> more);
        for (int j = 1; j <= more && i + static_cast<std::size_t>(j) < text.size(); ++j) {
            character = character << 6 | (static_cast<unsigned char>(text[i + static_cast<std::size_t>(j)]) & 63);
        }
        i += static_cast<std::size_t>(more) + 1;
        if (character >= 0x10000) {
            utf16 += static_cast<char16_t>(0xD800 + ((character - 0x10000) >> 10));
            utf16 += static_cast<char16_t>(0xDC00 + (character & 0x3FF));
        } else {
            utf16 += static_cast<char16_t>(character);
        }
    }
    return utf16;
}

std::vector<std::u16string> ReadCorpus(std::string const & folder)
{
    std::filesystem::path const source(KORVANE_SOURCE_FOLDER);
    char const * own = std::getenv("KORVANE_CORPUS");
    std::vector<std::u16string> paragraphs;
    std::error_code error;
    std::filesystem::path root;
    for (std::filesystem::path const & place :
         {own ? std::filesystem::path(own) : source / "../shared/corpus", source / "../../shared/corpus"}) {
        if (std::filesystem::exists(place / folder, error)) {
            root = place / folder;
            break;
        }
    }
    std::vector<std::filesystem::path> files;
    for (auto const & entry : std::filesystem::directory_iterator(root, error)) {
        if (entry.path().extension() == ".md") {
            files.push_back(entry.path());
        }
    }
    std::sort(files.begin(), files.end());
    for (auto const & file : files) {
        std::ifstream stream(file);
        for (std::string line; std::getline(stream, line);) {
            if (!line.empty()) {
                paragraphs.push_back(ToUtf16(line));
            }
        }
    }
    return paragraphs;
}

SetParagraph::SetParagraph()
{
    m_Style.m_Families = {"EB Garamond"};
    m_Style.m_Language = "en";
    m_Style.m_Size = 10.5;
    m_Settings.m_Width = 250;
}

SetParagraph & SetParagraph::Set(std::u16string text)
{
    m_Text = std::move(text);
    m_Arena.Clear();
    Kernel::Counted<TextStyle const> const style(new TextStyle(m_Style));
    ParagraphInput input;
    input.m_Text = m_Text;
    input.m_Styles = std::span(&style, 1);
    input.m_Objects = m_Objects;
    input.m_Settings = &m_Settings;
    ParagraphBuilder builder;
    m_Lines = builder.Build(input, m_Arena);
    return *this;
}

std::vector<std::string> SetParagraph::Lines() const
{
    std::vector<std::string> lines;
    for (Line const & line : m_Arena.m_Lines) {
        std::u16string text = m_Text.substr(line.m_TextStart, line.m_TextEnd - line.m_TextStart);
        while (!text.empty() && (text.back() == u' ' || text.back() == u'\u2028')) {
            text.pop_back();
        }
        lines.push_back(ToUtf8(text) + (line.m_Flags & Line::Hyphenated ? "-" : ""));
    }
    return lines;
}

std::vector<std::uint32_t> SetParagraph::Clusters(std::size_t line) const
{
    std::vector<std::uint32_t> clusters;
    for (GlyphRun const & run : m_Arena.RunsOf(m_Arena.m_Lines[line])) {
        for (PlacedGlyph const & glyph : m_Arena.GlyphsOf(run)) {
            clusters.push_back(glyph.m_Cluster);
        }
    }
    return clusters;
}

std::string FindFault(LineArena const & arena, ParagraphLines const & lines, std::size_t textLength)
{
    std::ostringstream fault;
    std::uint32_t covered = 0;
    if (lines.m_LineCount == 0) {
        return "no line";
    }
    for (std::uint32_t i = 0; i < lines.m_LineCount; ++i) {
        Line const & line = arena.m_Lines[lines.m_FirstLine + i];
        if (line.m_TextStart != covered || line.m_TextEnd < line.m_TextStart) {
            fault << "line " << i << " covers " << line.m_TextStart << " to " << line.m_TextEnd << " after " << covered;
            return fault.str();
        }
        covered = line.m_TextEnd;
        if (line.m_FirstRun + line.m_RunCount > arena.m_Runs.size()) {
            return "runs beyond the array";
        }
        double x = line.m_X;
        for (GlyphRun const & run : arena.RunsOf(line)) {
            if (run.m_FirstGlyph + run.m_GlyphCount > arena.m_Glyphs.size()) {
                return "glyphs beyond the array";
            }
            if (run.m_GlyphCount && run.m_Face >= arena.m_Faces.size()) {
                return "face beyond the array";
            }
            double width = 0;
            for (PlacedGlyph const & glyph : arena.GlyphsOf(run)) {
                width += glyph.m_Advance;
                bool const standsForText = !(glyph.m_Flags & PlacedGlyph::Synthetic);
                if (standsForText && (glyph.m_Cluster < run.m_TextStart || glyph.m_Cluster >= run.m_TextEnd)) {
                    fault << "cluster " << glyph.m_Cluster << " in run " << run.m_TextStart << " to " << run.m_TextEnd;
                    return fault.str();
                }
                // What stands for one character of the text may be broken over two lines.
                bool const isWhole = run.m_Object == GlyphRun::NoObject && glyph.m_Cluster != line.m_TextEnd;
                if (standsForText && isWhole && (glyph.m_Cluster < line.m_TextStart || glyph.m_Cluster >= line.m_TextEnd)) {
                    return "cluster outside its line";
                }
                if (standsForText && glyph.m_Glyph >= arena.m_Faces[run.m_Face]->GetGlyphCount()) {
                    return "glyph beyond the face";
                }
            }
            // Leaders and the sign of wrapped code have places of their own.
            bool const isText = run.m_GlyphCount && !(arena.GlyphsOf(run)[0].m_Flags & PlacedGlyph::Synthetic);
            if (isText && !(std::abs(width - run.m_Width) < 0.01 + 1e-4 * std::abs(width))) {
                fault << "run of width " << run.m_Width << " has glyphs of " << width;
                return fault.str();
            }
            if (isText && run.m_X < x - 0.01 - 1e-4 * std::abs(x)) {
                fault << "run at " << run.m_X << " overlaps what ends at " << x;
                return fault.str();
            }
            x = static_cast<double>(run.m_X) + run.m_Width;
        }
    }
    if (covered != textLength) {
        fault << "text of " << textLength << " covered to " << covered;
    }
    return fault.str();
}

std::string Describe(LineArena const & arena)
{
    std::ostringstream text;
    text.precision(9);
    for (Line const & line : arena.m_Lines) {
        text << "line " << line.m_TextStart << ' ' << line.m_TextEnd << ' ' << line.m_X << ' ' << line.m_SetWidth << ' '
             << line.m_Flags << '\n';
        for (GlyphRun const & run : arena.RunsOf(line)) {
            text << ' ' << run.m_X << ' ' << run.m_Size << ' ' << arena.m_Faces[run.m_Face]->GetPostScriptName();
            for (PlacedGlyph const & glyph : arena.GlyphsOf(run)) {
                text << ' ' << glyph.m_Glyph << '@' << glyph.m_Cluster << '+' << glyph.m_Advance;
            }
            text << '\n';
        }
    }
    return text.str();
}
