#include "framework/typeset/Pieces.h"

#include "framework/typeset/ParagraphInput.h"

#include <unicode/utf16.h>

#include <algorithm>

namespace Typeset
{

namespace
{

// Longer stretches are shaped in parts, so that no buffer grows without bound.
constexpr std::size_t longestStretch = 2048;
// Up to here, a part at a line's edge is looked up among the words.
constexpr std::size_t longestWord = 40;

/// The end of a stretch that starts at `start`: `end`, or a place for a cut before it.
std::size_t EndOfStretch(std::u16string_view text, std::size_t start, std::size_t end)
{
    if (end - start <= longestStretch) {
        return end;
    }
    std::size_t const limit = start + longestStretch;
    std::size_t const space = text.rfind(u' ', limit);
    if (space != std::u16string_view::npos && space > start + longestStretch / 2) {
        return space;
    }
    return U16_IS_TRAIL(text[limit]) ? limit - 1 : limit;
}

}

void PieceMaker::Make(std::span<InlineObject const> objects, std::vector<Piece> & pieces)
{
    for (std::uint32_t index = 0; index < m_Items.size(); ++index) {
        TextItem const & item = m_Items[index];
        Piece piece;
        piece.m_Start = item.m_Start;
        piece.m_End = item.m_End;
        piece.m_Item = index;
        switch (item.m_Kind) {
        case TextItem::Kind::Text:
            if (!item.m_Context) {
                pieces.push_back(piece);
            } else if (item.m_Context->GetMode() == ShapingMode::WholeRuns) {
                MakeFromRuns(index, pieces);
            } else {
                MakeWords(index, pieces);
            }
            break;
        case TextItem::Kind::Tab:
            piece.m_Kind = Piece::Kind::Tab;
            pieces.push_back(piece);
            break;
        case TextItem::Kind::Box:
            piece.m_Kind = Piece::Kind::Box;
            piece.m_Width = item.m_Object < objects.size() ? std::max(objects[item.m_Object].m_Width, 0.0) : 0;
            pieces.push_back(piece);
            break;
        case TextItem::Kind::LineEnd:
            piece.m_Kind = Piece::Kind::LineEnd;
            pieces.push_back(piece);
            break;
        }
    }
}

void PieceMaker::MakeWords(std::uint32_t index, std::vector<Piece> & pieces)
{
    TextItem const & item = m_Items[index];
    ShapingContext & context = *item.m_Context;
    std::size_t const firstPiece = pieces.size();
    m_Keys.clear();
    // End of the word at hand: found once, however many stretches a long one comes in.
    std::uint32_t wordEnd = item.m_Start;
    for (std::uint32_t at = item.m_Start; at < item.m_End;) {
        Piece & piece = pieces.emplace_back();
        piece.m_Start = at;
        piece.m_Item = index;
        piece.m_ShapeStart = at;
        char16_t const first = m_Text[at++];
        if (IsWordSpace(first)) {
            while (at < item.m_End && m_Text[at] == first) {
                ++at;
            }
            piece.m_Kind = Piece::Kind::Space;
            m_Keys.push_back(0);
        } else {
            wordEnd = std::max(wordEnd, at);
            while (wordEnd < item.m_End && !IsWordSpace(m_Text[wordEnd])) {
                ++wordEnd;
            }
            at = wordEnd;
            if (at - piece.m_Start <= longestWord) {
                bool const spaceBefore = piece.m_Start > item.m_Start && IsWordSpace(m_Text[piece.m_Start - 1]);
                m_Keys.push_back(context.GetKey(m_Text.substr(piece.m_Start, at - piece.m_Start), spaceBefore,
                                                at < item.m_End));
            } else {
                at = static_cast<std::uint32_t>(EndOfStretch(m_Text, piece.m_Start, at));
                m_Keys.push_back(0);
            }
        }
        piece.m_End = at;
    }

    constexpr std::size_t ahead = 6;
    double const spaceWidth = context.GetSpaceAdvance() * item.m_Scale + item.m_Tracking;
    std::int32_t trailKern = 0;
    for (std::size_t i = 0; i < m_Keys.size(); ++i) {
        if (i + ahead < m_Keys.size()) {
            context.BringNear(m_Keys[i + ahead]);
        }
        Piece & piece = pieces[firstPiece + i];
        if (piece.m_Kind == Piece::Kind::Space) {
            piece.m_Clusters = piece.m_End - piece.m_Start;
            piece.m_Width = piece.m_Clusters * spaceWidth + trailKern * item.m_Scale;
            trailKern = 0;
            continue;
        }
        if (piece.m_End - piece.m_Start <= longestWord) {
            piece.m_Shape = context.GetWord(m_Text.substr(piece.m_Start, piece.m_End - piece.m_Start), m_Keys[i],
                                            m_Scratch);
        } else {
            piece.m_Shape = context.ShapeStretch(m_Text, piece.m_Start, piece.m_End, m_Scratch);
        }
        if (piece.m_Shape->m_LeadKern) {
            pieces[firstPiece + i - 1].m_Width += piece.m_Shape->m_LeadKern * item.m_Scale;
        }
        trailKern = piece.m_Shape->m_TrailKern;
        piece.m_LastGlyph = piece.m_Shape->m_GlyphCount;
        piece.m_Clusters = piece.m_Shape->m_Clusters;
        piece.m_Width = piece.m_Shape->m_Width * item.m_Scale + piece.m_Clusters * item.m_Tracking;
    }
}

void PieceMaker::MakeFromRuns(std::uint32_t index, std::vector<Piece> & pieces)
{
    TextItem const & item = m_Items[index];
    for (std::size_t start = item.m_Start; start < item.m_End;) {
        std::size_t const end = EndOfStretch(m_Text, start, item.m_End);
        CutShape(index, item.m_Context->ShapeStretch(m_Text, start, end, m_Scratch), start, end, pieces);
        start = end;
    }
}

void PieceMaker::CutShape(std::uint32_t index, Shape * shape, std::size_t start, std::size_t end,
                          std::vector<Piece> & pieces)
{
    TextItem const & item = m_Items[index];
    Piece whole;
    whole.m_Item = index;
    whole.m_Shape = shape;
    whole.m_ShapeStart = static_cast<std::uint32_t>(start);
    whole.m_LastGlyph = shape->m_GlyphCount;
    bool const rightToLeft = item.m_Context->IsRightToLeft();
    ClusterWalk walk(whole, rightToLeft);
    for (std::size_t at = start; at < end;) {
        bool const isSpace = IsWordSpace(m_Text[at]);
        std::size_t stop = at + 1;
        while (stop < end && (isSpace ? m_Text[stop] == m_Text[at] : !IsWordSpace(m_Text[stop]))) {
            ++stop;
        }
        // A ligature over the edge belongs to the piece in which it starts.
        std::uint32_t const firstBefore = walk.GetFirst();
        std::uint32_t const lastBefore = walk.GetLast();
        std::int64_t const advanceBefore = walk.GetAdvance();
        std::uint32_t const clustersBefore = walk.GetClusters();
        walk.StepTo(static_cast<std::uint32_t>(stop));
        Piece & piece = pieces.emplace_back(whole);
        piece.m_Start = static_cast<std::uint32_t>(at);
        piece.m_End = static_cast<std::uint32_t>(stop);
        piece.m_Kind = isSpace ? Piece::Kind::Space : Piece::Kind::Text;
        piece.m_IsWhole = at == start && stop == end;
        piece.m_FirstGlyph = rightToLeft ? walk.GetLast() : firstBefore;
        piece.m_LastGlyph = rightToLeft ? lastBefore : walk.GetFirst();
        piece.m_Clusters = walk.GetClusters() - clustersBefore;
        piece.m_Width = static_cast<double>(walk.GetAdvance() - advanceBefore) * item.m_Scale +
                        piece.m_Clusters * item.m_Tracking;
        at = stop;
    }
}

Shape * PieceMaker::MakeBare(Piece const & piece)
{
    return m_Items[piece.m_Item].m_Context->GetWord(m_Text.substr(piece.m_Start, piece.m_End - piece.m_Start), false,
                                                    false, m_Scratch);
}

Piece PieceMaker::MakePart(Piece const & piece, std::uint32_t from, std::uint32_t to, bool hyphen)
{
    TextItem const & item = m_Items[piece.m_Item];
    Piece part;
    part.m_Start = from;
    part.m_End = to;
    part.m_Item = piece.m_Item;
    part.m_ShapeStart = from;
    if (!item.m_Context) {
        return part;
    }
    ShapingContext & context = *item.m_Context;
    if (hyphen) {
        m_Hyphenated.assign(m_Text.substr(from, to - from));
        m_Hyphenated.push_back(context.GetHyphen());
        part.m_Shape = context.GetWord(m_Hyphenated, false, false, m_Scratch);
    } else {
        // The shape as it is, where nothing reaches over the edges.
        ClusterWalk walk(piece, context.IsRightToLeft());
        walk.Seek(from);
        std::uint32_t const firstBefore = walk.GetFirst();
        std::uint32_t const lastBefore = walk.GetLast();
        std::int64_t const advanceBefore = walk.GetAdvance();
        std::uint32_t const clustersBefore = walk.GetClusters();
        bool const startsClean = from == piece.m_Start || (!walk.IsAtEnd() && walk.GetPosition() == from && walk.IsSafe());
        walk.StepTo(to);
        bool const endsClean = to == piece.m_End || (!walk.IsAtEnd() && walk.GetPosition() == to && walk.IsSafe());
        if (startsClean && endsClean) {
            part.m_Shape = piece.m_Shape;
            part.m_ShapeStart = piece.m_ShapeStart;
            part.m_FirstGlyph = context.IsRightToLeft() ? walk.GetLast() : firstBefore;
            part.m_LastGlyph = context.IsRightToLeft() ? lastBefore : walk.GetFirst();
            part.m_Clusters = walk.GetClusters() - clustersBefore;
            part.m_IsWhole = false;
            part.m_Width = static_cast<double>(walk.GetAdvance() - advanceBefore) * item.m_Scale +
                           part.m_Clusters * item.m_Tracking;
            return part;
        }
        if (to - from <= longestWord && context.GetMode() != ShapingMode::WholeRuns && !context.IsRightToLeft()) {
            part.m_Shape = context.GetWord(m_Text.substr(from, to - from), false, false, m_Scratch);
        } else {
            part.m_Shape = context.ShapeStretch(m_Text, from, to, m_Scratch);
        }
    }
    part.m_LastGlyph = part.m_Shape->m_GlyphCount;
    part.m_Clusters = part.m_Shape->m_Clusters;
    part.m_Width = part.m_Shape->m_Width * item.m_Scale + part.m_Clusters * item.m_Tracking;
    return part;
}

}
