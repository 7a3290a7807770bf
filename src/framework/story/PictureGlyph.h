#pragma once

#include "framework/kernel/StringT.h"
#include "framework/story/Glyph.h"

namespace Story
{

/// A picture in the text. Alone in its paragraph it is a block, set in the paragraph's alignment; otherwise it stands
/// on the baseline of its line. The pixels are not here: `GetDataId` names the document's picture item, `GetPath` the
/// file that it came from.
class PictureGlyph : public Glyph
{
public:
    static constexpr Kernel::ClassUID c_classUid{"GlPi"};

    struct Fields
    {
        /// Item of the document that holds the picture; empty if the picture could not be had.
        String m_DataId;
        /// The source file as the author named it, for messages.
        String m_Path;
        /// Text for readers who do not see the picture.
        String m_AltText;
        /// Size of the picture as it is, in points at its own resolution; 0 if it is not known.
        double m_NaturalWidth = 0;
        double m_NaturalHeight = 0;
        /// Wanted width in points, or a part of the measure, or 0 for neither: then the natural size. Whatever is
        /// wanted, the picture shrinks to fit the measure and the frame, and keeps its proportions.
        double m_WantedWidth = 0;
        double m_WantedMeasurePart = 0;
        /// The picture is missing or unusable: a marked box shows in its place, with the reason in it.
        bool m_IsMissing = false;
        String m_MissingReason;
        friend bool operator==(Fields const &, Fields const &) = default;
    };

    explicit PictureGlyph(Fields fields) : m_Fields(std::move(fields)) {}

    [[nodiscard]] Fields const & GetFields() const { return m_Fields; }

    [[nodiscard]] Kernel::ClassUID GetClassUID() const override { return c_classUid; }
    [[nodiscard]] Kernel::Counted<Glyph> Clone(GlyphCloneContext & context) const override;
    void Save(ByteWriter & out) const override;
    void AccumulateHash(Kernel::HashAccumulator & hash) const override;

private:
    Fields m_Fields;
};

}
