#include "framework/story/PieceMaker.h"

#include <algorithm>

namespace Story::Flow
{

namespace
{

float AsFloat(double value)
{
    return static_cast<float>(value);
}

}

Kernel::SizeT<double> PieceMaker::FitPicture(PictureGlyph const & picture, double width, double height) const
{
    constexpr double missingWidth = 180;
    constexpr double missingHeight = 60;
    auto const & fields = picture.GetFields();
    bool const isKnown = !fields.m_IsMissing && fields.m_NaturalWidth > 0 && fields.m_NaturalHeight > 0;
    double const naturalWidth = isKnown ? fields.m_NaturalWidth : missingWidth;
    double const naturalHeight = isKnown ? fields.m_NaturalHeight : missingHeight;
    double wanted = naturalWidth;
    if (isKnown && fields.m_WantedWidth > 0) {
        wanted = fields.m_WantedWidth;
    } else if (isKnown && fields.m_WantedMeasurePart > 0) {
        wanted = width * fields.m_WantedMeasurePart;
    }
    double scale = std::min(wanted, std::max(width, 1.0)) / naturalWidth;
    if (height > 0) {
        scale = std::min(scale, height / naturalHeight);
    }
    return {std::max(naturalWidth * scale, 1.0), std::max(naturalHeight * scale, 1.0)};
}

void PieceMaker::MakePicture(Segment segment, PictureGlyph const & picture, ParagraphStyle const & style,
                             Context const & context, std::vector<Piece> & pieces)
{
    ParagraphFormat const & format = style.m_Format;
    Edges const edges =
        GetEdges(*segment.m_Story, segment.m_Story->GetParagraphIndex(segment.m_Begin), style, context);
    float const measure = std::max(context.m_Width - edges.m_Left - edges.m_Right, 1.0F);
    // A caption below needs room beside a tall picture.
    constexpr double captionLines = 4;
    double const reserve = format.m_KeepWithNext ? captionLines * format.m_Leading : 0;
    double const height = context.m_Height > 2 * reserve ? context.m_Height - reserve : context.m_Height;
    auto const size = FitPicture(picture, measure, height);

    Piece piece;
    piece.m_Kind = Piece::Kind::Picture;
    piece.m_IsFirst = true;
    piece.m_IsLast = true;
    piece.m_Picture = &picture;
    piece.m_Above = AsFloat(size.height);
    piece.m_Width = AsFloat(size.width);
    auto const alignment = context.m_Alignment.value_or(format.m_Alignment);
    float const rest = std::max(0.0F, measure - piece.m_Width);
    piece.m_Left = edges.m_Left + (alignment == ParagraphAtt::Centre  ? rest / 2
                                   : alignment == ParagraphAtt::Right ? rest
                                                                      : 0);
    piece.m_MainEnd = segment.m_MainBegin + (segment.m_IsMain ? 1 : 0);
    if (picture.GetFields().m_IsMissing) {
        // The reason is set in the box, so that a reader of the page sees what is wrong.
        auto const & fields = picture.GetFields();
        GlyphString text;
        text.AddText(fields.m_MissingReason.Empty() ? fields.m_Path : fields.m_MissingReason);
        text.AddChar32(ParagraphEnd);
        auto story = Kernel::MakeCounted<Story>();
        story->AppendText(text, nullptr, nullptr);
        m_Generated.push_back(story);
        Context inner;
        inner.m_Width = std::max(piece.m_Width - 12, 1.0F);
        inner.m_IsCell = true;
        inner.m_MainOffset = segment.m_MainBegin;
        inner.m_FallbackStyle = StyleSheet::MissingPictureStyle;
        inner.m_Role = LayoutItem::Role::Generated;
        inner.m_Alignment = ParagraphAtt::Left;
        Row & row = m_Rows.emplace_back();
        row.m_Cells.resize(1);
        auto pending = std::move(m_PendingMarks);
        m_PendingMarks.clear();
        MakeParagraph(*story, 0, inner, row.m_Cells[0].m_Pieces);
        m_PendingMarks = std::move(pending);
        piece.m_Row = &row;
    }
    piece.m_Segment = KeepSegment(std::move(segment));
    pieces.push_back(piece);
}

void PieceMaker::MakeRule(Segment segment, ParagraphStyle const & style, Context const & context,
                          std::vector<Piece> & pieces)
{
    constexpr float widthPart = 0.22F;
    Piece piece;
    piece.m_Kind = Piece::Kind::Rule;
    piece.m_IsFirst = true;
    piece.m_IsLast = true;
    piece.m_Above = AsFloat(style.m_Format.m_Leading);
    piece.m_Width = context.m_Width * widthPart;
    piece.m_Left = (context.m_Width - piece.m_Width) / 2;
    piece.m_MainEnd = segment.m_MainBegin + (segment.m_IsMain ? 1 : 0);
    segment.m_MarkerStyle = &m_Styles.GetRun(style, nullptr, RunPurpose::Marker);
    piece.m_Segment = KeepSegment(std::move(segment));
    pieces.push_back(piece);
}

}
