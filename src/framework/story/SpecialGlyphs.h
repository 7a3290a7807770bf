#pragma once

#include "framework/story/AnchorData.h"
#include "framework/story/Glyph.h"

#include <string>

namespace Story
{

class IndexTopic;

/// A named place in the text, without width: links lead to the line that it stands on.
class AnchorGlyph : public Glyph
{
public:
    static constexpr Kernel::ClassUID c_classUid{"GlAn"};
    explicit AnchorGlyph(Kernel::Counted<AnchorData> data) : m_Data(std::move(data)) {}

    /// Never null. The data has identity and may be given its uid later.
    [[nodiscard]] Kernel::Counted<AnchorData> const & GetAnchorData() const { return m_Data; }

    [[nodiscard]] Kernel::ClassUID GetClassUID() const override { return c_classUid; }
    [[nodiscard]] Kernel::Counted<Glyph> Clone(GlyphCloneContext & context) const override;
    void Save(ByteWriter & out) const override;
    void AccumulateHash(Kernel::HashAccumulator & hash) const override;

private:
    Kernel::Counted<AnchorData> m_Data;
};

/// Marks a place for the index, without width. The topic is named in full (`IndexTopic::GetNameWithParents`) and found
/// in the document's index by that name; so a mark outlives changes of the topic's identity.
class IndexMarkGlyph : public Glyph
{
public:
    static constexpr Kernel::ClassUID c_classUid{"GlIx"};
    explicit IndexMarkGlyph(String topicNameWithParents) : m_Topic(std::move(topicNameWithParents)) {}

    [[nodiscard]] String const & GetTopicNameWithParents() const { return m_Topic; }

    [[nodiscard]] Kernel::ClassUID GetClassUID() const override { return c_classUid; }
    [[nodiscard]] Kernel::Counted<Glyph> Clone(GlyphCloneContext & context) const override;
    void Save(ByteWriter & out) const override;
    void AccumulateHash(Kernel::HashAccumulator & hash) const override;

private:
    String m_Topic;
};

/// Text that is worked out where it stands: a folio or a running title.
class FieldGlyph : public Glyph
{
public:
    static constexpr Kernel::ClassUID c_classUid{"GlFd"};
    /// The numbers are written in files.
    enum class Kind : std::uint8_t
    {
        PageNumber = 0,
        BookTitle = 1,
        ChapterTitle = 2,
        RunningText = 3 ///< Text of the last paragraph of the style `GetArgument` on or before the page.
    };
    FieldGlyph(Kind kind, String argument) : m_Argument(std::move(argument)), m_Kind(kind) {}

    [[nodiscard]] Kind GetKind() const { return m_Kind; }
    [[nodiscard]] String const & GetArgument() const { return m_Argument; }

    [[nodiscard]] Kernel::ClassUID GetClassUID() const override { return c_classUid; }
    [[nodiscard]] Kernel::Counted<Glyph> Clone(GlyphCloneContext & context) const override;
    void Save(ByteWriter & out) const override;
    void AccumulateHash(Kernel::HashAccumulator & hash) const override;

private:
    String m_Argument;
    Kind m_Kind;
};

/// Ends a frame: what follows begins in the next one.
class BreakGlyph : public Glyph
{
public:
    static constexpr Kernel::ClassUID c_classUid{"GlBk"};

    [[nodiscard]] Kernel::ClassUID GetClassUID() const override { return c_classUid; }
    [[nodiscard]] Kernel::Counted<Glyph> Clone(GlyphCloneContext & context) const override;
    void Save(ByteWriter & out) const override;
    void AccumulateHash(Kernel::HashAccumulator & hash) const override;
};

/// A thematic break: a paragraph of its own, drawn as a short centred rule in the text colour.
class RuleGlyph : public Glyph
{
public:
    static constexpr Kernel::ClassUID c_classUid{"GlRu"};

    [[nodiscard]] Kernel::ClassUID GetClassUID() const override { return c_classUid; }
    [[nodiscard]] Kernel::Counted<Glyph> Clone(GlyphCloneContext & context) const override;
    void Save(ByteWriter & out) const override;
    void AccumulateHash(Kernel::HashAccumulator & hash) const override;
};

}
