#pragma once

#include "framework/kernel/Counted.h"
#include "framework/story/AttSet.h"
#include "framework/story/Attributes.h"
#include "framework/story/HyperlinkData.h"

namespace Story
{

/// Attributes of a run of characters: a character style, what is set over it, and the link that the run belongs to.
///
/// Immutable and shared by runs and stories, on any thread. Null stands for "none set" wherever one is taken.
class GlyphAtts : public virtual Kernel::Countable
{
public:
    GlyphAtts() = default;
    explicit GlyphAtts(AttSet atts, Kernel::Counted<HyperlinkData const> link = nullptr)
        : m_Atts(std::move(atts)), m_Hyperlink(std::move(link))
    {
    }

    /// Only the style, by name.
    [[nodiscard]] static Kernel::Counted<GlyphAtts const> FromStyle(String const & style);

    [[nodiscard]] AttSet const & GetAtts() const { return m_Atts; }
    /// The character style's name, empty if there is none.
    [[nodiscard]] String Get(GlyphAtt::String att) const;
    /// Null outside of links. Runs of one link share one object.
    [[nodiscard]] Kernel::Counted<HyperlinkData const> const & GetHyperlink() const { return m_Hyperlink; }

    /// Same attributes and the same link object.
    [[nodiscard]] bool IsEqual(GlyphAtts const & other) const
    {
        return m_Hyperlink == other.m_Hyperlink && m_Atts == other.m_Atts;
    }

private:
    AttSet m_Atts;
    Kernel::Counted<HyperlinkData const> m_Hyperlink;
};

}
