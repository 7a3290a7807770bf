#pragma once

#include <functional>
#include <set>
#include <string>
#include <vector>

#include "framework/render/DisplayList.h"
#include "framework/render/PdfResources.h"
#include "framework/render/PdfText.h"
#include "framework/render/Schema.h"

namespace Renderer::RenderTree
{

struct PlacedForm;

/// Turns display lists into content streams (ISO 32000-2, 7.8.2). One object serves all pages of a file, one after the
/// other.
class PdfContent
{
public:
    /// Gets the bytes of a form's content and says what it was stored as.
    using FormStore = std::function<SpillRange(std::string content)>;
    /// Gives the image for a placed picture that covers this many points, its number in `resources`; false if there is
    /// none, when a marked box is drawn.
    using ImageSource = std::function<bool(PlacedPicture const & picture, Kernel::Size const & size, std::uint32_t & image)>;

    /// Gives the form for a drawing, its number; false if there is none, when a marked box is drawn.
    using DrawingSource = std::function<bool(PlacedDrawing const & drawing, std::uint32_t & form)>;

    PdfContent(Schema const & schema, PdfResources & resources, FormStore storeForm, ImageSource images,
               DrawingSource drawings);

    /// From the coordinates of a form's list to those of its content stream.
    static constexpr Raster::AffineTransform::Params ToForm{1, 0, 0, -1, 0, 0};

    /// The content stream of a page that shows these forms, and these lists one over the other. `toPage` goes from the
    /// list's coordinates to PDF's, y up. What it uses is in `uses`.
    [[nodiscard]] std::string Write(std::vector<PlacedForm> const & forms,
                                    std::initializer_list<DisplayList const *> lists,
                                    Raster::AffineTransform::Params const & toPage, PdfUses & uses);

    /// Fonts of the last page whose licence forbids embedding, each once a page.
    [[nodiscard]] std::set<Typeset::FontFace const *> const & GetForbiddenFonts() const { return m_ForbiddenFonts; }
    /// Whether the last page had a glyph for "no such character".
    [[nodiscard]] bool HadMissingGlyph() const { return m_HadMissingGlyph; }

private:
    /// What the operators so far have set.
    struct GraphicsState
    {
        /// The operators; empty if nothing is known of the colour.
        std::string m_Fill = "0 g\n";
        std::string m_StrokeColour = "0 G\n";
        std::uint32_t m_Opacity = 1000;
        PdfFont * m_Font = nullptr;
        Thousandths m_Size = 0;
        Thousandths m_Width = 1000;
        LineCap m_Cap = LineCap::Butt;
        LineJoin m_Join = LineJoin::Miter;
        Thousandths m_MiterLimit = 10000;
        std::string m_Dashes = "[]0 d\n";
    };

    /// A group that has begun. With an opacity its content goes into a form, and what was written so far waits here.
    struct OpenGroup
    {
        bool m_IsForm = false;
        double m_Opacity = 1;
        std::string m_OuterText;
        PdfUses m_OuterUses;
        GraphicsState m_OuterState;
    };

    void Place(PlacedForm const & form);
    void WriteList(DisplayList const & list);
    void BeginGroup(Group const & group);
    void EndGroup();
    void BeginMark(Mark const & mark);
    void EndMark();
    void Fill(DisplayList::FilledPath const & fill);
    void StrokePath(DisplayList::StrokedPath const & stroke);
    void Picture(PlacedPicture const & picture);
    void Drawing(PlacedVectors const & placed);
    void MissingPicture(Raster::AffineTransform::Params const & placement);
    void Glyphs(DisplayList const & list, GlyphRun const & run);
    void Outlines(DisplayList const & list, GlyphRun const & run);
    void ShowRun(PdfFont & font, GlyphRun const & run, std::span<Typeset::PlacedGlyph const> glyphs,
                 std::u16string_view text);

    void AppendPath(Path const & path);
    void SetStrokeStyle(Stroke const & stroke);
    void SetOpacity(double opacity);
    void SetColour(Raster::Colour const & colour, bool stroke);
    void BeginText();
    void EndText();
    void MoveText(Kernel::Point const & origin, double slant);
    void SetFont(PdfFont & font, std::uint32_t number, double size);

    Schema const & m_Schema;
    PdfResources & m_Resources;
    FormStore m_StoreForm;
    ImageSource m_Images;
    DrawingSource m_Drawings;
    Raster::AffineTransform::Params m_ToPage;
    Raster::AffineTransform::Params m_FromPage;
    std::string m_Text;
    PdfUses m_Uses;
    GraphicsState m_State;
    std::vector<OpenGroup> m_Open;
    std::vector<bool> m_Marks;
    std::set<Typeset::FontFace const *> m_ForbiddenFonts;
    bool m_HadMissingGlyph = false;
    /// Between BT and ET; where the current line begins.
    bool m_InText = false;
    Thousandths m_LineX = 0;
    Thousandths m_LineY = 0;
    double m_Slant = 0;
    /// The colours last asked for, [1] for strokes, and their operators: most runs ask for the same again.
    struct KnownColour
    {
        Raster::Colour m_Colour;
        std::string m_Operator;
    };
    KnownColour m_Known[2];
};

}
