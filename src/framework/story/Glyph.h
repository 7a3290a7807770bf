#pragma once

#include "framework/kernel/Counted.h"
#include "framework/kernel/IDTag.h"

#include <cstdint>

namespace Kernel
{
class HashAccumulator;
}

namespace Story
{

class ByteReader;
class ByteWriter;
class GlyphCloneContext;
class Story;

/// A special element of the text: what stands where the buffer has U+FFFC.
///
/// Immutable once it is in a story, with the exceptions that a class names; a story changes an element by replacing
/// it. Shared between a story and its clones. The class uid names the class in files.
class Glyph : public virtual Kernel::Countable
{
public:
    [[nodiscard]] virtual Kernel::ClassUID GetClassUID() const = 0;
    /// A copy for another place in the text; what has identity gets a new one or keeps it, as `context` says.
    [[nodiscard]] virtual Kernel::Counted<Glyph> Clone(GlyphCloneContext & context) const = 0;
    /// Number of stories that hang on this element, as the cells of a table; `GetStory` gives them by index.
    [[nodiscard]] virtual std::size_t GetStoryCount() const { return 0; }
    [[nodiscard]] virtual Kernel::Counted<Story const> GetStory(std::size_t index) const;

    /// Writes and reads everything but the class uid.
    virtual void Save(ByteWriter & out) const = 0;
    virtual void AccumulateHash(Kernel::HashAccumulator & hash) const = 0;

    void SaveWithClass(ByteWriter & out) const;
    /// An element that `SaveWithClass` wrote. Null if the class is not known or the bytes are no such element; then the
    /// reader has failed. Nested stories are read to a bounded depth.
    [[nodiscard]] static Kernel::Counted<Glyph> LoadWithClass(ByteReader & in);
};

/// The unit that stands in the text for a special element.
inline constexpr char16_t ObjectCharacter = u'\uFFFC';
/// The unit that ends a paragraph.
inline constexpr char16_t ParagraphEnd = u'\n';
/// The unit that ends a line inside of a paragraph.
inline constexpr char16_t LineSeparator = u'\u2028';

}
