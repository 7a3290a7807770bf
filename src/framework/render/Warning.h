#pragma once

#include "framework/kernel/StringT.h"

namespace Renderer::RenderTree
{

/// Something about a page that came out, but not quite as asked. A plain value.
struct Warning
{
    enum class Code
    {
        /// A picture could not be read; a marked box stands in its place.
        PictureMissing,
        /// A placed PDF can't be opened without its password; a marked box stands in its place.
        PictureLocked,
        /// A placed PDF is damaged and was put right as far as it goes.
        PictureRepaired,
        /// A placed PDF can't be shown as pixels here; a marked box stands in its place.
        PictureNotDrawn,
        /// A picture has fewer pixels to the inch than the options ask for.
        PictureResolution,
        /// The file's content is of another kind than its name says.
        PictureWrongExtension,
        /// A font's licence bits forbid embedding; the text is drawn as outlines.
        FontNotEmbeddable,
        /// A glyph that no installed font has.
        GlyphMissing,
        /// A link leads to a page that is not in the file, and was left out.
        LinkTargetMissing,
        /// A profile could not be used; the default stands in for it.
        ProfileUnusable,
    };

    Code m_Code = Code::PictureMissing;
    /// Output page from 1, 0 if it concerns the whole file.
    int m_Page = 0;
    /// The file that it is about, if there is one.
    String m_Path;
    /// One sentence for the user.
    String m_Text;
};

}
