#include "framework/kernel/HashAccumulator.h"
#include "framework/story/ByteStream.h"
#include "framework/story/Story.h"

#include <algorithm>
#include <unordered_map>

namespace Story
{

namespace
{

constexpr std::uint16_t FormatVersion = 1;

/// Numbers the distinct objects of a story in the order in which they are met; 0 stands for null.
template <typename T>
class Numbering
{
public:
    std::uint32_t NumberOf(T const * object)
    {
        if (!object) {
            return 0;
        }
        if (object == m_Last) {
            return m_LastNumber;
        }
        auto const [place, isNew] = m_Numbers.try_emplace(object, static_cast<std::uint32_t>(m_Objects.size() + 1));
        if (isNew) {
            m_Objects.push_back(object);
        }
        m_Last = object;
        m_LastNumber = place->second;
        return m_LastNumber;
    }
    [[nodiscard]] std::vector<T const *> const & Objects() const { return m_Objects; }

private:
    std::unordered_map<T const *, std::uint32_t> m_Numbers;
    std::vector<T const *> m_Objects;
    T const * m_Last = nullptr;
    std::uint32_t m_LastNumber = 0;
};

template <typename T>
T const * AtNumber(std::vector<T> const & objects, std::uint32_t number, ByteReader & in)
{
    if (number > objects.size()) {
        in.Fail();
        return nullptr;
    }
    return number == 0 ? nullptr : &objects[number - 1];
}

struct SpanRecord
{
    std::uint32_t m_End;
    std::uint32_t m_Atts;
};

template <typename TSpan, typename TAtts>
std::vector<SpanRecord> MakeRecords(std::vector<TSpan> const & spans, Numbering<TAtts> & numbering)
{
    std::vector<SpanRecord> records;
    records.reserve(spans.size());
    for (TSpan const & span : spans) {
        records.push_back({span.m_End, numbering.NumberOf(span.m_Atts.Get())});
    }
    return records;
}

/// Reads spans that ascend and together cover `length` units.
template <typename TSpan, typename THandle>
void ReadSpans(ByteReader & in, std::vector<THandle> const & atts, std::size_t length, std::vector<TSpan> & spans)
{
    std::vector<SpanRecord> records;
    in.ReadArrayInto(records);
    spans.reserve(records.size());
    std::uint32_t before = 0;
    for (SpanRecord const & record : records) {
        if (record.m_End <= before || record.m_End > length) {
            in.Fail();
            return;
        }
        auto const * handle = AtNumber(atts, record.m_Atts, in);
        spans.push_back({record.m_End, handle ? *handle : THandle()});
        before = record.m_End;
    }
    if (before != length) {
        in.Fail();
    }
}

}

void Story::SaveBytes(ByteWriter & out) const
{
    Numbering<GlyphAtts> glyphAtts;
    Numbering<ParagraphAtts> paragraphAtts;
    auto const runs = MakeRecords(m_Runs, glyphAtts);
    auto const paragraphs = MakeRecords(m_Paragraphs, paragraphAtts);
    Numbering<HyperlinkData> links;
    for (GlyphAtts const * atts : glyphAtts.Objects()) {
        static_cast<void>(links.NumberOf(atts->GetHyperlink().Get()));
    }

    out.Write(FormatVersion);
    out.WriteArray(std::span<char16_t const>(m_Text));
    out.Write(static_cast<std::uint32_t>(links.Objects().size()));
    for (HyperlinkData const * link : links.Objects()) {
        link->Save(out);
    }
    out.Write(static_cast<std::uint32_t>(glyphAtts.Objects().size()));
    for (GlyphAtts const * atts : glyphAtts.Objects()) {
        atts->GetAtts().Save(out);
        out.Write(links.NumberOf(atts->GetHyperlink().Get()));
    }
    out.Write(static_cast<std::uint32_t>(paragraphAtts.Objects().size()));
    for (ParagraphAtts const * atts : paragraphAtts.Objects()) {
        atts->GetAtts().Save(out);
        atts->GetGlyphAtts().Save(out);
        auto const list = atts->GetListAtt();
        out.WriteBool(static_cast<bool>(list));
        if (list) {
            list->Save(out);
        }
    }
    out.WriteArray(std::span<SpanRecord const>(runs));
    out.WriteArray(std::span<SpanRecord const>(paragraphs));
    out.Write(static_cast<std::uint32_t>(m_Objects.size()));
    for (Object const & object : m_Objects) {
        out.Write(object.m_Offset);
        object.m_Glyph->SaveWithClass(out);
    }
}

bool Story::LoadBytes(ByteReader & in)
{
    Story loaded;
    if (!in.Enter() || in.Read<std::uint16_t>() != FormatVersion) {
        in.Fail();
        return false;
    }
    std::vector<char16_t> text;
    in.ReadArrayInto(text);
    loaded.m_Text.assign(text.begin(), text.end());

    constexpr std::size_t leastLink = 31;
    constexpr std::size_t leastAtts = 5;
    constexpr std::size_t leastObject = 8;
    std::vector<Kernel::Counted<HyperlinkData const>> links;
    for (auto count = in.ReadCount(leastLink); count > 0 && !in.HasFailed(); --count) {
        links.push_back(HyperlinkData::Load(in));
    }
    std::vector<Kernel::Counted<GlyphAtts const>> glyphAtts;
    for (auto count = in.ReadCount(leastAtts); count > 0 && !in.HasFailed(); --count) {
        AttSet atts;
        static_cast<void>(atts.Load(in));
        auto const * link = AtNumber(links, in.Read<std::uint32_t>(), in);
        glyphAtts.push_back(Kernel::MakeCounted<GlyphAtts const>(
            std::move(atts), link ? *link : Kernel::Counted<HyperlinkData const>()));
    }
    std::vector<Kernel::Counted<ParagraphAtts const>> paragraphAtts;
    for (auto count = in.ReadCount(leastAtts); count > 0 && !in.HasFailed(); --count) {
        AttSet atts;
        AttSet forGlyphs;
        static_cast<void>(atts.Load(in));
        static_cast<void>(forGlyphs.Load(in));
        auto list = in.ReadBool() ? ListAtt::Load(in) : nullptr;
        paragraphAtts.push_back(
            Kernel::MakeCounted<ParagraphAtts const>(std::move(atts), std::move(forGlyphs), std::move(list)));
    }
    ReadSpans(in, glyphAtts, loaded.m_Text.size(), loaded.m_Runs);
    ReadSpans(in, paragraphAtts, loaded.m_Text.size(), loaded.m_Paragraphs);
    auto const objectCount = in.ReadCount(leastObject);
    loaded.m_Objects.reserve(objectCount);
    for (std::uint32_t i = 0; i < objectCount && !in.HasFailed(); ++i) {
        auto const offset = in.Read<std::uint32_t>();
        loaded.m_Objects.push_back({offset, Glyph::LoadWithClass(in)});
    }
    in.Leave();
    if (in.HasFailed() || !loaded.HoldsTogether()) {
        in.Fail();
        return false;
    }
    SwapContent(loaded);
    return true;
}

bool Story::HoldsTogether() const
{
    std::size_t paragraph = 0;
    std::size_t object = 0;
    for (std::size_t i = 0; i < m_Text.size(); ++i) {
        char16_t const unit = m_Text[i];
        if (unit == ParagraphEnd) {
            if (paragraph >= m_Paragraphs.size() || m_Paragraphs[paragraph].m_End != i + 1) {
                return false;
            }
            ++paragraph;
        } else if (unit == ObjectCharacter) {
            if (object >= m_Objects.size() || m_Objects[object].m_Offset != i) {
                return false;
            }
            ++object;
        }
    }
    bool const isOpen = !m_Text.empty() && m_Text.back() != ParagraphEnd;
    return object == m_Objects.size() && paragraph + (isOpen ? 1 : 0) == m_Paragraphs.size();
}

void Story::AccumulateHash(Kernel::HashAccumulator & hash) const
{
    // Attributes are hashed by content and once for each object: two stories that share differently are equal.
    std::unordered_map<void const *, Kernel::Hash128> known;
    auto const hashOf = [&](auto const * atts, auto const & accumulate) {
        if (!atts) {
            return Kernel::Hash128();
        }
        auto const [place, isNew] = known.try_emplace(atts);
        if (isNew) {
            Kernel::HashAccumulator own;
            accumulate(own, *atts);
            place->second = own.Get128();
        }
        return place->second;
    };

    hash.AddArray(std::span<char16_t const>(m_Text));
    for (GlyphRun const & run : m_Runs) {
        hash.Add(run.m_End);
        hash.Add(hashOf(run.m_Atts.Get(), [](Kernel::HashAccumulator & own, GlyphAtts const & atts) {
            atts.GetAtts().AccumulateHash(own);
            if (atts.GetHyperlink()) {
                atts.GetHyperlink()->AccumulateHash(own);
            }
        }));
    }
    for (Paragraph const & paragraph : m_Paragraphs) {
        hash.Add(hashOf(paragraph.m_Atts.Get(), [](Kernel::HashAccumulator & own, ParagraphAtts const & atts) {
            atts.GetAtts().AccumulateHash(own);
            atts.GetGlyphAtts().AccumulateHash(own);
            if (auto const list = atts.GetListAtt()) {
                list->AccumulateHash(own);
            }
        }));
    }
    for (Object const & object : m_Objects) {
        hash.Add(object.m_Glyph->GetClassUID().Value());
        object.m_Glyph->AccumulateHash(hash);
    }
}

}
