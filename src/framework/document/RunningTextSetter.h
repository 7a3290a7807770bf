#pragma once

#include "framework/document/RunningTextNode.h"
#include "framework/render/DisplayList.h"
#include "framework/story/StyleSheet.h"
#include "framework/typeset/ParagraphBuilder.h"

#include <map>

/// Sets running heads and folios, in one line each, when a page is drawn: so a page that only moves has its text
/// untouched.
///
/// One thread at a time; keeps what it needs to set the next page quickly.
class RunningTextSetter
{
public:
    /// The styles to set in from now on.
    void SetStyleSheet(Kernel::Counted<Story::StyleSheet const> const & styles);

    /// What the fields of one page show.
    struct Fields
    {
        String m_PageNumber;
        String m_PublicationTitle;
        String m_DocumentTitle;
    };

    /// Draws the line into the list, in the coordinates of the node, moved by `offset`.
    void Draw(RunningTextNode const & node, Fields const & fields, Kernel::PointT<double> offset,
              Renderer::RenderTree::DisplayList & list);

private:
    struct Style
    {
        Kernel::Counted<Typeset::TextStyle const> m_Style;
        Raster::Colour m_Colour;
    };
    [[nodiscard]] Style const & GetStyle(String const & name);
    /// The line and its width.
    double Set(std::u16string const & text, Style const & style);
    /// The line and its width; where it is wider than `room`, `text` loses words at its end, and the line has an ellipsis.
    double SetWithin(double room, std::u16string & text, Style const & style);

    Kernel::Counted<Story::StyleSheet const> m_Styles;
    std::map<String, Style> m_TextStyles;
    Typeset::ParagraphBuilder m_Builder;
    Typeset::LineArena m_Arena;
};

/// A colour of text as drawing takes it.
[[nodiscard]] Raster::Colour ToRasterColour(Story::Colour const & colour);
