#include "framework/render/PdfContent.h"

#include <cmath>

namespace Renderer::RenderTree
{

namespace
{

/// Differences between where a reader's pen stands and where the composer wants it are let be up to this, in hundredths
/// of a thousandth of the em: they are not seen, do not add up, and each would cost a number.
constexpr std::int64_t LetBe = 150;

/// One TJ operator in the making.
class Shower
{
public:
    explicit Shower(std::string & text) : m_Text(text) {}

    void Adjust(std::int64_t thousandths)
    {
        CloseString();
        OpenArray();
        AppendInteger(m_Text, thousandths);
    }

    void Glyph(std::uint16_t glyph)
    {
        if (!m_InString) {
            OpenArray();
            m_Text += '(';
            m_InString = true;
        }
        Byte(static_cast<unsigned char>(glyph >> 8));
        Byte(static_cast<unsigned char>(glyph & 0xFF));
    }

    void End()
    {
        CloseString();
        if (m_InArray) {
            m_Text += "]TJ\n";
            m_InArray = false;
        }
    }

private:
    /// Readers take a bare carriage return in a string for a line feed, so it is escaped as brackets are.
    void Byte(unsigned char byte)
    {
        if (byte == '(' || byte == ')' || byte == '\\') {
            m_Text += '\\';
            m_Text += static_cast<char>(byte);
        } else if (byte == '\r') {
            m_Text += "\\r";
        } else {
            m_Text += static_cast<char>(byte);
        }
    }
    void OpenArray()
    {
        if (!m_InArray) {
            m_Text += '[';
            m_InArray = true;
        }
    }
    void CloseString()
    {
        if (m_InString) {
            m_Text += ')';
            m_InString = false;
        }
    }

    std::string & m_Text;
    bool m_InArray = false;
    bool m_InString = false;
};

bool IsBlank(char16_t unit)
{
    return unit == u' ' || unit == u'\n' || unit == u'\t' || unit == u'\r' || unit == u'\u2028';
}

/// Characters that say something about line breaking and show nothing.
bool IsBreakControl(char16_t unit)
{
    return unit == u'\u00AD' || unit == u'\u200B' || unit == u'\u2060' || unit == u'\uFEFF';
}

/// Splits a run into clusters: glyphs that stand together for one stretch of text.
class ClusterWalk
{
public:
    ClusterWalk(GlyphRun const & run, std::span<Typeset::PlacedGlyph const> glyphs, std::u16string_view text)
        : m_Glyphs(glyphs), m_Text(text), m_First(run.m_FirstCluster),
          m_TextEnd(run.m_FirstCluster + static_cast<std::uint32_t>(text.size())), m_RightToLeft((run.m_Level & 1) != 0),
          m_Previous(m_TextEnd)
    {
    }

    /// The next cluster: its glyphs from `begin` to `end`, and its text, empty if it stands for none.
    bool Next(std::size_t & begin, std::size_t & end, std::u16string_view & text)
    {
        if (m_Next == m_Glyphs.size()) {
            return false;
        }
        begin = m_Next;
        std::uint32_t const cluster = m_Glyphs[begin].m_Cluster;
        bool const synthetic = IsSynthetic(begin);
        while (m_Next < m_Glyphs.size() && m_Glyphs[m_Next].m_Cluster == cluster && IsSynthetic(m_Next) == synthetic) {
            ++m_Next;
        }
        end = m_Next;
        text = {};
        if (!synthetic) {
            std::uint32_t textEnd = m_RightToLeft ? m_Previous : m_TextEnd;
            if (!m_RightToLeft && m_Next < m_Glyphs.size() && !IsSynthetic(m_Next)) {
                textEnd = m_Glyphs[m_Next].m_Cluster;
            }
            m_Previous = cluster;
            if (cluster >= m_First && cluster < textEnd && textEnd <= m_TextEnd) {
                text = m_Text.substr(cluster - m_First, textEnd - cluster);
            }
            // Spaces at a line's end hang on its last cluster.
            while (text.size() > 1 && IsBlank(text.back())) {
                text.remove_suffix(1);
            }
        }
        return true;
    }

private:
    [[nodiscard]] bool IsSynthetic(std::size_t i) const
    {
        return (m_Glyphs[i].m_Flags & Typeset::PlacedGlyph::Synthetic) != 0;
    }

    std::span<Typeset::PlacedGlyph const> m_Glyphs;
    std::u16string_view m_Text;
    std::uint32_t m_First;
    std::uint32_t m_TextEnd;
    bool m_RightToLeft;
    std::uint32_t m_Previous;
    std::size_t m_Next = 0;
};

/// Maps a letter and its marks one by one, if each has its own glyph; better for readers than a text beside them all.
bool MapEach(PdfFont & font, std::span<Typeset::PlacedGlyph const> glyphs, std::u16string_view text)
{
    bool each = glyphs.size() == text.size();
    for (std::size_t i = 0; each && i < glyphs.size(); ++i) {
        each = font.GetFace().GetGlyph(text[i]) == glyphs[i].m_Glyph;
    }
    for (std::size_t i = 0; each && i < glyphs.size(); ++i) {
        each = font.Map(font.Checked(glyphs[i].m_Glyph), text[i]);
    }
    return each;
}

/// Receives an outline as part of a path: glyphs of a face that may not go into the file.
class PathSink : public Typeset::OutlineSink
{
public:
    PathSink(Path & path, double scale, double slant) : m_Path(path), m_Scale(scale), m_Slant(slant) {}

    void SetOrigin(Kernel::Point const & origin) { m_Origin = origin; }

    void MoveTo(double x, double y) override { m_Path.MoveTo(X(x, y), Y(y)); Keep(x, y); }
    void LineTo(double x, double y) override { m_Path.LineTo(X(x, y), Y(y)); Keep(x, y); }
    void QuadTo(double controlX, double controlY, double x, double y) override
    {
        CubicTo(m_Last.x + (controlX - m_Last.x) * 2 / 3, m_Last.y + (controlY - m_Last.y) * 2 / 3,
                x + (controlX - x) * 2 / 3, y + (controlY - y) * 2 / 3, x, y);
    }
    void CubicTo(double x1, double y1, double x2, double y2, double x, double y) override
    {
        m_Path.CurveTo(X(x1, y1), Y(y1), X(x2, y2), Y(y2), X(x, y), Y(y));
        Keep(x, y);
    }
    void Close() override { m_Path.Close(); }

private:
    [[nodiscard]] double X(double x, double y) const { return m_Origin.x + (x + m_Slant * y) * m_Scale; }
    [[nodiscard]] double Y(double y) const { return m_Origin.y - y * m_Scale; }
    void Keep(double x, double y) { m_Last = {x, y}; }

    Path & m_Path;
    double m_Scale;
    double m_Slant;
    Kernel::Point m_Origin;
    Kernel::Point m_Last;
};

}

void PdfContent::BeginText()
{
    if (!m_InText) {
        m_Text += "BT\n";
        m_InText = true;
        m_LineX = 0;
        m_LineY = 0;
        m_Slant = 0;
    }
}

void PdfContent::EndText()
{
    if (m_InText) {
        m_Text += "ET\n";
        m_InText = false;
    }
}

void PdfContent::SetFont(PdfFont & font, std::uint32_t number, double size)
{
    Thousandths const wanted = ToThousandths(size);
    if (m_State.m_Font == &font && m_State.m_Size == wanted) {
        return;
    }
    m_State.m_Font = &font;
    m_State.m_Size = wanted;
    m_Uses.m_Fonts.insert(number);
    m_Text += '/';
    m_Text += font.GetName();
    m_Text += ' ';
    AppendThousandths(m_Text, wanted);
    m_Text += " Tf\n";
}

void PdfContent::MoveText(Kernel::Point const & origin, double slant)
{
    Kernel::Point const place = m_ToPage.Map(origin);
    Thousandths const x = ToThousandths(place.x);
    Thousandths const y = ToThousandths(place.y);
    if (slant != 0 || m_Slant != 0) {
        AppendMatrix(m_Text, {1, 0, slant, 1, place.x, place.y});
        m_Text += "Tm\n";
    } else {
        AppendThousandths(m_Text, x - m_LineX);
        m_Text += ' ';
        AppendThousandths(m_Text, y - m_LineY);
        m_Text += " Td\n";
    }
    m_Slant = slant;
    m_LineX = x;
    m_LineY = y;
}

void PdfContent::Glyphs(DisplayList const & list, GlyphRun const & run)
{
    if (run.m_GlyphCount == 0 || !(run.m_Size > 0)) {
        return;
    }
    std::uint32_t number = 0;
    PdfFont & font = m_Resources.FontFor(run.m_Face, number);
    if (!font.IsEmbedded()) {
        if (font.IsForbidden()) {
            m_ForbiddenFonts.insert(run.m_Face.Get());
        }
        Outlines(list, run);
        return;
    }
    BeginText();
    SetColour(run.m_Colour, false);
    SetFont(font, number, run.m_Size);
    MoveText(run.m_Origin, run.m_Slant);
    ShowRun(font, run, list.GlyphsOf(run), list.TextOf(run));
}

void PdfContent::ShowRun(PdfFont & font, GlyphRun const & run, std::span<Typeset::PlacedGlyph const> glyphs,
                         std::u16string_view text)
{
    Shower shower(m_Text);
    ClusterWalk walk(run, glyphs, text);
    double const unitsPerPoint = PdfFont::EmWidth / run.m_Size;
    double pen = 0;
    std::int64_t readerPen = 0;
    Thousandths rise = 0;
    std::size_t begin = 0;
    std::size_t end = 0;
    std::u16string_view stands;
    while (walk.Next(begin, end, stands)) {
        std::uint16_t const first = font.Checked(glyphs[begin].m_Glyph);
        bool const single = end == begin + 1;
        char16_t character = stands.size() == 1 ? stands[0] : u'\0';
        bool said = false;
        if (single && character != 0) {
            if (IsBreakControl(character)) {
                pen += static_cast<double>(glyphs[begin].m_Advance);
                continue;
            }
            // A space that does not break looks the same and has the same glyph.
            character = character == u'\u00A0' ? u' ' : character;
            said = font.Map(first, character);
        } else if (single && !stands.empty()) {
            said = font.Map(first, stands);
        } else if (single) {
            // A hyphen that the composer put in reads as one, so that readers can join the word; leaders and the like
            // read as nothing.
            bool const hyphen = font.GetFace().GetGlyph(u'-') == first || font.GetFace().GetGlyph(0x2010) == first;
            stands = hyphen ? std::u16string_view(u"-") : std::u16string_view();
            said = hyphen && font.Map(first, u'-');
        }
        // From right to left, readers would take a mark that stands left of its letter for the next letter's.
        if (!single && !stands.empty() && (run.m_Level & 1) == 0) {
            said = MapEach(font, glyphs.subspan(begin, end - begin), stands);
        }
        if (!said) {
            shower.End();
            m_Text += "/Span<</ActualText";
            AppendHexText(m_Text, stands);
            m_Text += ">>BDC\n";
        }
        for (std::size_t i = begin; i < end; ++i) {
            Typeset::PlacedGlyph const & glyph = glyphs[i];
            std::uint16_t const id = font.Checked(glyph.m_Glyph);
            m_HadMissingGlyph = m_HadMissingGlyph || (glyph.m_Flags & Typeset::PlacedGlyph::Missing) != 0;
            Thousandths const wantedRise = glyph.m_OffsetY == 0 ? 0 : ToThousandths(-static_cast<double>(glyph.m_OffsetY));
            if (wantedRise != rise) {
                shower.End();
                AppendThousandths(m_Text, wantedRise);
                m_Text += " Ts\n";
                rise = wantedRise;
            }
            double const wanted = (pen + static_cast<double>(glyph.m_OffsetX)) * unitsPerPoint;
            std::int64_t const off = std::llround(wanted) - readerPen;
            if (off >= LetBe || off <= -LetBe) {
                std::int64_t const thousandths = std::llround(static_cast<double>(off) / 100);
                shower.Adjust(-thousandths);
                readerPen += thousandths * 100;
            }
            shower.Glyph(id);
            readerPen += font.Use(id);
            pen += static_cast<double>(glyph.m_Advance);
        }
        if (!said) {
            shower.End();
            m_Text += "EMC\n";
        }
    }
    shower.End();
    if (rise != 0) {
        m_Text += "0 Ts\n";
    }
}

void PdfContent::Outlines(DisplayList const & list, GlyphRun const & run)
{
    Path path;
    PathSink sink(path, run.m_Size / run.m_Face->GetUnitsPerEm(), run.m_Slant);
    double pen = run.m_Origin.x;
    for (Typeset::PlacedGlyph const & glyph : list.GlyphsOf(run)) {
        sink.SetOrigin({pen + static_cast<double>(glyph.m_OffsetX),
                        run.m_Origin.y + static_cast<double>(glyph.m_OffsetY)});
        run.m_Face->DrawGlyph(glyph.m_Glyph, sink);
        pen += static_cast<double>(glyph.m_Advance);
    }
    EndText();
    m_Text += "/Span<</ActualText";
    AppendHexText(m_Text, list.TextOf(run));
    m_Text += ">>BDC\n";
    Fill({path, run.m_Colour, FillRule::NonZero});
    m_Text += "EMC\n";
}

}
