#include "framework/story/StoryBuilder.h"

#include "framework/kernel/Assert.h"
#include "framework/kernel/Utf.h"

#include <algorithm>
#include <unordered_map>

namespace Story
{

namespace
{

constexpr char16_t Replacement = u'\uFFFD';
constexpr char16_t LastControl = 0x1F;

bool IsLeftOut(char16_t unit)
{
    return (unit <= LastControl && unit != u'\t' && unit != u'\n') || (unit >= 0x7F && unit <= 0x9F);
}

std::size_t Mix(std::size_t a, std::size_t b)
{
    return a ^ (b + 0x9E3779B97F4A7C15ULL + (a << 6) + (a >> 2));
}

std::size_t HashOf(AttSet const & atts)
{
    std::size_t hash = atts.Entries().size();
    for (AttSet::Entry const & entry : atts.Entries()) {
        hash = Mix(hash, entry.m_Key);
        if (auto const * number = std::get_if<std::int32_t>(&entry.m_Value)) {
            hash = Mix(hash, static_cast<std::size_t>(*number));
        } else if (auto const * real = std::get_if<double>(&entry.m_Value)) {
            hash = Mix(hash, std::hash<double>()(*real));
        } else if (auto const * text = std::get_if<String>(&entry.m_Value)) {
            hash = Mix(hash, std::hash<String>()(*text));
        }
    }
    return hash;
}

std::size_t HashOf(GlyphAtts const & atts)
{
    return Mix(HashOf(atts.GetAtts()), std::hash<void const *>()(atts.GetHyperlink().Get()));
}

std::size_t HashOf(ParagraphAtts const & atts)
{
    auto const list = atts.GetListAtt();
    std::size_t const listHash = list ? Mix(static_cast<std::size_t>(list->GetLevel()),
                                            static_cast<std::size_t>(list->GetStartNumberingAt()))
                                      : 0;
    return Mix(Mix(HashOf(atts.GetAtts()), HashOf(atts.GetGlyphAtts())), listHash);
}

/// One object for each content.
template <typename TAtts>
class Pool
{
public:
    using Handle = Kernel::Counted<TAtts const>;

    Handle const & Shared(Handle const & atts)
    {
        if (!atts || atts == m_LastAsked) {
            return atts ? m_LastGiven : m_Null;
        }
        m_LastAsked = atts;
        m_LastGiven = atts;
        auto & bucket = m_Buckets[HashOf(*atts)];
        auto const place = std::find_if(bucket.begin(), bucket.end(),
                                        [&](Handle const & known) { return known->IsEqual(*atts); });
        if (place == bucket.end()) {
            bucket.push_back(atts);
        } else {
            m_LastGiven = *place;
        }
        return m_LastGiven;
    }

private:
    std::unordered_map<std::size_t, std::vector<Handle>> m_Buckets;
    Handle m_LastAsked;
    Handle m_LastGiven;
    Handle m_Null;
};

}

struct StoryBuilder::Pools
{
    Pool<GlyphAtts> m_GlyphAtts;
    Pool<ParagraphAtts> m_ParagraphAtts;
};

StoryBuilder::StoryBuilder() : m_Story(Kernel::MakeCounted<Story>()), m_Pools(std::make_unique<Pools>()) {}

StoryBuilder::~StoryBuilder() = default;

void StoryBuilder::ExtendRun(Kernel::Counted<GlyphAtts const> const & atts)
{
    auto const & shared = m_Pools->m_GlyphAtts.Shared(atts);
    auto const end = static_cast<std::uint32_t>(m_Story->m_Text.size());
    auto & runs = m_Story->m_Runs;
    if (!runs.empty() && runs.back().m_Atts == shared) {
        runs.back().m_End = end;
    } else {
        runs.push_back({end, shared});
    }
}

void StoryBuilder::AppendText(std::string_view utf8, Kernel::Counted<GlyphAtts const> const & atts)
{
    auto & text = m_Story->m_Text;
    auto const begin = static_cast<std::ptrdiff_t>(text.size());
    Kernel::AppendUtf16(text, utf8);
    text.erase(std::remove_if(text.begin() + begin, text.end(), IsLeftOut), text.end());
    for (auto unit = text.begin() + begin; unit != text.end(); ++unit) {
        if (*unit == ParagraphEnd || *unit == u'\u2029') {
            *unit = u' ';
        } else if (*unit == ObjectCharacter) {
            *unit = Replacement;
        }
    }
    if (text.begin() + begin != text.end()) {
        ExtendRun(atts);
    }
}

void StoryBuilder::AppendObject(Kernel::Counted<Glyph const> glyph, Kernel::Counted<GlyphAtts const> const & atts)
{
    KORVANE_ASSERT(glyph);
    m_Story->m_Objects.push_back({static_cast<std::uint32_t>(m_Story->m_Text.size()), std::move(glyph)});
    m_Story->m_Text.push_back(ObjectCharacter);
    ExtendRun(atts);
}

void StoryBuilder::AppendLineBreak(Kernel::Counted<GlyphAtts const> const & atts)
{
    m_Story->m_Text.push_back(LineSeparator);
    ExtendRun(atts);
}

void StoryBuilder::EndParagraph(Kernel::Counted<ParagraphAtts const> const & atts)
{
    // The end unit looks like the text before it, so that a paragraph in one style is one run.
    Kernel::Counted<GlyphAtts const> endAtts;
    if (!IsAtParagraphBegin()) {
        endAtts = m_Story->m_Runs.back().m_Atts;
    }
    m_Story->m_Text.push_back(ParagraphEnd);
    auto const end = static_cast<std::uint32_t>(m_Story->m_Text.size());
    if (!m_Story->m_Runs.empty() && m_Story->m_Runs.back().m_Atts == endAtts) {
        m_Story->m_Runs.back().m_End = end;
    } else {
        m_Story->m_Runs.push_back({end, endAtts});
    }
    m_Story->m_Paragraphs.push_back({end, m_Pools->m_ParagraphAtts.Shared(atts)});
}

std::size_t StoryBuilder::GetLength() const
{
    return m_Story->m_Text.size();
}

bool StoryBuilder::IsAtParagraphBegin() const
{
    return m_Story->m_Text.empty() || m_Story->m_Text.back() == ParagraphEnd;
}

Kernel::Counted<Story> StoryBuilder::Finish()
{
    if (!IsAtParagraphBegin()) {
        m_Story->m_Paragraphs.push_back({static_cast<std::uint32_t>(m_Story->m_Text.size()), nullptr});
    }
    auto story = std::move(m_Story);
    m_Story = Kernel::MakeCounted<Story>();
    return story;
}

}
