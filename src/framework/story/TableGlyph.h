#pragma once

#include "framework/story/Attributes.h"
#include "framework/story/Glyph.h"
#include "framework/story/Story.h"

#include <vector>

namespace Story
{

/// A table: a paragraph of its own. Every cell is a story with paragraph styles of its own.
class TableGlyph : public Glyph
{
public:
    static constexpr Kernel::ClassUID c_classUid{"GlTb"};

    struct Fields
    {
        std::uint32_t m_Rows = 0;
        std::uint32_t m_Columns = 0;
        /// So many rows from the top are the header, repeated wherever the table goes on in another frame.
        std::uint32_t m_HeaderRows = 0;
        /// For each column, over what the cells' styles say.
        std::vector<ParagraphAtt::AlignmentKind> m_Alignments;
        /// Row by row, `m_Rows` times `m_Columns`; a null cell is empty.
        std::vector<Kernel::Counted<Story const>> m_Cells;
    };

    /// Asserts that the counts agree.
    explicit TableGlyph(Fields fields);

    [[nodiscard]] std::uint32_t GetRowCount() const { return m_Fields.m_Rows; }
    [[nodiscard]] std::uint32_t GetColumnCount() const { return m_Fields.m_Columns; }
    [[nodiscard]] std::uint32_t GetHeaderRowCount() const { return m_Fields.m_HeaderRows; }
    [[nodiscard]] ParagraphAtt::AlignmentKind GetAlignment(std::uint32_t column) const;
    [[nodiscard]] Kernel::Counted<Story const> const & GetCell(std::uint32_t row, std::uint32_t column) const;
    [[nodiscard]] Fields const & GetFields() const { return m_Fields; }

    [[nodiscard]] Kernel::ClassUID GetClassUID() const override { return c_classUid; }
    [[nodiscard]] Kernel::Counted<Glyph> Clone(GlyphCloneContext & context) const override;
    [[nodiscard]] std::size_t GetStoryCount() const override { return m_Fields.m_Cells.size(); }
    [[nodiscard]] Kernel::Counted<Story const> GetStory(std::size_t index) const override;
    void Save(ByteWriter & out) const override;
    void AccumulateHash(Kernel::HashAccumulator & hash) const override;

private:
    Fields m_Fields;
};

}
