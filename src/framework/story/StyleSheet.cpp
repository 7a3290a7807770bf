#include "framework/story/StyleSheet.h"

#include "framework/kernel/HashAccumulator.h"
#include "framework/story/ByteStream.h"

#include <algorithm>

namespace Story
{

namespace
{

constexpr std::uint16_t FormatVersion = 1;

TextStyle const * Find(std::vector<TextStyle> const & styles, std::string_view name)
{
    auto const place = std::find_if(styles.begin(), styles.end(),
                                    [&](TextStyle const & style) { return style.m_Name == name; });
    return place == styles.end() ? nullptr : &*place;
}

void Put(std::vector<TextStyle> & styles, TextStyle style)
{
    auto const place = std::find_if(styles.begin(), styles.end(),
                                    [&](TextStyle const & other) { return other.m_Name == style.m_Name; });
    if (place == styles.end()) {
        styles.push_back(std::move(style));
    } else {
        *place = std::move(style);
    }
}

/// The style of that name and what it is based on, the outermost first. Ends where a style is missing or comes again.
std::vector<TextStyle const *> ChainOf(std::vector<TextStyle> const & styles, std::string_view name)
{
    std::vector<TextStyle const *> chain;
    for (auto const * style = Find(styles, name); style && std::find(chain.begin(), chain.end(), style) == chain.end();
         style = Find(styles, style->m_BasedOn)) {
        chain.push_back(style);
        if (style->m_BasedOn.Empty()) {
            break;
        }
    }
    std::reverse(chain.begin(), chain.end());
    return chain;
}

void SaveStyles(ByteWriter & out, std::vector<TextStyle> const & styles)
{
    out.Write(static_cast<std::uint32_t>(styles.size()));
    for (TextStyle const & style : styles) {
        out.WriteString(style.m_Name);
        out.WriteString(style.m_BasedOn);
        style.m_GlyphAtts.Save(out);
        style.m_ParagraphAtts.Save(out);
    }
}

std::vector<TextStyle> LoadStyles(ByteReader & in)
{
    constexpr std::size_t leastStyle = 12;
    std::vector<TextStyle> styles;
    for (auto count = in.ReadCount(leastStyle); count > 0 && !in.HasFailed(); --count) {
        TextStyle style;
        style.m_Name = in.ReadString();
        style.m_BasedOn = in.ReadString();
        static_cast<void>(style.m_GlyphAtts.Load(in));
        static_cast<void>(style.m_ParagraphAtts.Load(in));
        styles.push_back(std::move(style));
    }
    return styles;
}

void HashStyles(Kernel::HashAccumulator & hash, std::vector<TextStyle> const & styles)
{
    hash.Add(static_cast<std::uint64_t>(styles.size()));
    for (TextStyle const & style : styles) {
        hash.Add(style.m_Name);
        hash.Add(style.m_BasedOn);
        style.m_GlyphAtts.AccumulateHash(hash);
        style.m_ParagraphAtts.AccumulateHash(hash);
    }
}

}

StyleSheet::StyleSheet(StyleSheet const & other)
    : Kernel::Countable(other), Kernel::Serialisable(other), m_DefaultGlyphAtts(other.m_DefaultGlyphAtts),
      m_DefaultParagraphAtts(other.m_DefaultParagraphAtts),
      m_ParagraphStyles(other.m_ParagraphStyles), m_CharacterStyles(other.m_CharacterStyles)
{
}

void StyleSheet::SetDefaults(AttSet glyphAtts, AttSet paragraphAtts)
{
    m_DefaultGlyphAtts = std::move(glyphAtts);
    m_DefaultParagraphAtts = std::move(paragraphAtts);
    DropCache();
}

void StyleSheet::SetParagraphStyle(TextStyle style)
{
    Put(m_ParagraphStyles, std::move(style));
    DropCache();
}

void StyleSheet::SetCharacterStyle(TextStyle style)
{
    Put(m_CharacterStyles, std::move(style));
    DropCache();
}

TextStyle const * StyleSheet::FindParagraphStyle(std::string_view name) const
{
    return Find(m_ParagraphStyles, name);
}

TextStyle const * StyleSheet::FindCharacterStyle(std::string_view name) const
{
    return Find(m_CharacterStyles, name);
}

ResolvedStyle const & StyleSheet::ResolveParagraphStyle(std::string_view name) const
{
    std::lock_guard const lock(m_CacheLock);
    if (auto const place = m_ResolvedParagraphs.find(name); place != m_ResolvedParagraphs.end()) {
        return *place->second;
    }
    auto resolved = std::make_unique<ResolvedStyle>();
    resolved->m_Glyph.Apply(m_DefaultGlyphAtts);
    resolved->m_Paragraph.Apply(m_DefaultParagraphAtts);
    for (TextStyle const * style : ChainOf(m_ParagraphStyles, name)) {
        resolved->m_Glyph.Apply(style->m_GlyphAtts);
        resolved->m_Paragraph.Apply(style->m_ParagraphAtts);
    }
    return *m_ResolvedParagraphs.emplace(std::string(name), std::move(resolved)).first->second;
}

AttSet const & StyleSheet::ResolveCharacterStyle(std::string_view name) const
{
    std::lock_guard const lock(m_CacheLock);
    if (auto const place = m_ResolvedCharacters.find(name); place != m_ResolvedCharacters.end()) {
        return *place->second;
    }
    auto resolved = std::make_unique<AttSet>();
    for (TextStyle const * style : ChainOf(m_CharacterStyles, name)) {
        resolved->Merge(style->m_GlyphAtts);
    }
    return *m_ResolvedCharacters.emplace(std::string(name), std::move(resolved)).first->second;
}

bool StyleSheet::IsEqual(StyleSheet const & other) const
{
    return m_DefaultGlyphAtts == other.m_DefaultGlyphAtts && m_DefaultParagraphAtts == other.m_DefaultParagraphAtts &&
           m_ParagraphStyles == other.m_ParagraphStyles && m_CharacterStyles == other.m_CharacterStyles;
}

void StyleSheet::SaveBytes(ByteWriter & out) const
{
    out.Write(FormatVersion);
    m_DefaultGlyphAtts.Save(out);
    m_DefaultParagraphAtts.Save(out);
    SaveStyles(out, m_ParagraphStyles);
    SaveStyles(out, m_CharacterStyles);
}

bool StyleSheet::LoadBytes(ByteReader & in)
{
    if (in.Read<std::uint16_t>() != FormatVersion) {
        in.Fail();
    }
    AttSet glyphAtts;
    AttSet paragraphAtts;
    static_cast<void>(glyphAtts.Load(in));
    static_cast<void>(paragraphAtts.Load(in));
    auto paragraphStyles = LoadStyles(in);
    auto characterStyles = LoadStyles(in);
    if (in.HasFailed()) {
        return false;
    }
    m_DefaultGlyphAtts = std::move(glyphAtts);
    m_DefaultParagraphAtts = std::move(paragraphAtts);
    m_ParagraphStyles = std::move(paragraphStyles);
    m_CharacterStyles = std::move(characterStyles);
    DropCache();
    return true;
}

void StyleSheet::AccumulateHash(Kernel::HashAccumulator & hash) const
{
    m_DefaultGlyphAtts.AccumulateHash(hash);
    m_DefaultParagraphAtts.AccumulateHash(hash);
    HashStyles(hash, m_ParagraphStyles);
    HashStyles(hash, m_CharacterStyles);
}

void StyleSheet::DropCache()
{
    std::lock_guard const lock(m_CacheLock);
    m_ResolvedParagraphs.clear();
    m_ResolvedCharacters.clear();
}

}
