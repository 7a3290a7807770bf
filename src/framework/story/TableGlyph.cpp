#include "framework/story/TableGlyph.h"

#include "framework/kernel/Assert.h"
#include "framework/kernel/HashAccumulator.h"
#include "framework/story/ByteStream.h"
#include "framework/story/GlyphCloneContext.h"

namespace Story
{

TableGlyph::TableGlyph(Fields fields) : m_Fields(std::move(fields))
{
    KORVANE_ASSERT(m_Fields.m_Cells.size() == static_cast<std::size_t>(m_Fields.m_Rows) * m_Fields.m_Columns);
    KORVANE_ASSERT(m_Fields.m_HeaderRows <= m_Fields.m_Rows);
    m_Fields.m_Alignments.resize(m_Fields.m_Columns, ParagraphAtt::Left);
}

ParagraphAtt::AlignmentKind TableGlyph::GetAlignment(std::uint32_t column) const
{
    return m_Fields.m_Alignments[column];
}

Kernel::Counted<Story const> const & TableGlyph::GetCell(std::uint32_t row, std::uint32_t column) const
{
    return m_Fields.m_Cells[static_cast<std::size_t>(row) * m_Fields.m_Columns + column];
}

Kernel::Counted<Story const> TableGlyph::GetStory(std::size_t index) const
{
    return m_Fields.m_Cells[index];
}

Kernel::Counted<Glyph> TableGlyph::Clone(GlyphCloneContext & context) const
{
    Fields fields = m_Fields;
    for (auto & cell : fields.m_Cells) {
        if (cell) {
            auto copy = Kernel::MakeCounted<Story>();
            copy->AppendText(cell->GetAll(), context);
            cell = copy;
        }
    }
    return Kernel::MakeCounted<TableGlyph>(std::move(fields));
}

void TableGlyph::Save(ByteWriter & out) const
{
    out.Write(m_Fields.m_Rows);
    out.Write(m_Fields.m_Columns);
    out.Write(m_Fields.m_HeaderRows);
    for (auto const alignment : m_Fields.m_Alignments) {
        out.Write(static_cast<std::uint8_t>(alignment));
    }
    for (auto const & cell : m_Fields.m_Cells) {
        out.WriteBool(static_cast<bool>(cell));
        if (cell) {
            cell->SaveBytes(out);
        }
    }
}

void TableGlyph::AccumulateHash(Kernel::HashAccumulator & hash) const
{
    hash.Add(m_Fields.m_Rows);
    hash.Add(m_Fields.m_Columns);
    hash.Add(m_Fields.m_HeaderRows);
    for (auto const alignment : m_Fields.m_Alignments) {
        hash.Add(alignment);
    }
    for (auto const & cell : m_Fields.m_Cells) {
        hash.Add(static_cast<bool>(cell));
        if (cell) {
            cell->AccumulateHash(hash);
        }
    }
}

}
