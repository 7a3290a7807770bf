#pragma once

#include "framework/story/Story.h"

#include <string_view>

namespace Story
{

/// Writes a story from front to back: what importers use. Linear in what is appended.
///
/// Equal attribute objects are made one as they come in, so a caller may make a new object for every piece.
class StoryBuilder
{
public:
    StoryBuilder();
    ~StoryBuilder();
    StoryBuilder(StoryBuilder const &) = delete;
    StoryBuilder & operator=(StoryBuilder const &) = delete;

    /// Appends UTF-8 to the paragraph that is open. U+000A and U+2029 in it become spaces, other control characters
    /// but the tab are left out, U+FFFC becomes U+FFFD, ill-formed bytes too. `atts` may be null.
    void AppendText(std::string_view utf8, Kernel::Counted<GlyphAtts const> const & atts);
    /// Appends a special element.
    void AppendObject(Kernel::Counted<Glyph const> glyph, Kernel::Counted<GlyphAtts const> const & atts);
    /// A line break inside of the paragraph.
    void AppendLineBreak(Kernel::Counted<GlyphAtts const> const & atts);
    /// Ends the paragraph that is open, which may be empty. `atts` may be null.
    void EndParagraph(Kernel::Counted<ParagraphAtts const> const & atts);

    /// Offset at which the next piece will stand.
    [[nodiscard]] std::size_t GetLength() const;
    /// Nothing since the last paragraph end.
    [[nodiscard]] bool IsAtParagraphBegin() const;

    /// The finished story. An open paragraph stays without its end. The builder is empty again.
    [[nodiscard]] Kernel::Counted<Story> Finish();

private:
    struct Pools;

    void ExtendRun(Kernel::Counted<GlyphAtts const> const & atts);

    Kernel::Counted<Story> m_Story;
    std::unique_ptr<Pools> m_Pools;
};

}
