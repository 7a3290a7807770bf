#pragma once

#include "framework/kernel/Serialisable.h"
#include "framework/story/Formats.h"

#include <map>
#include <memory>
#include <mutex>
#include <string>
#include <vector>

namespace Story
{

class ByteReader;
class ByteWriter;

/// A named bundle of attributes. A paragraph style may set attributes of characters and of paragraphs, a character
/// style only those of characters.
struct TextStyle
{
    String m_Name;
    /// The style that this one starts from; empty for the sheet's defaults.
    String m_BasedOn;
    AttSet m_GlyphAtts;
    AttSet m_ParagraphAtts;
    friend bool operator==(TextStyle const &, TextStyle const &) = default;
};

/// A paragraph style with everything it is based on laid into it.
struct ResolvedStyle
{
    GlyphFormat m_Glyph;
    ParagraphFormat m_Paragraph;
};

/// The text styles of a document.
///
/// A style that is not there, or that is based on itself over some way round, resolves as far as it goes. Resolved
/// styles are kept until the next change. Reading is safe on any thread while nobody changes the sheet; documents
/// change a clone and put it in place.
class StyleSheet : public virtual Kernel::Serialisable
{
public:
    StyleSheet() = default;
    StyleSheet(StyleSheet const & other);
    StyleSheet & operator=(StyleSheet const &) = delete;

    /// Names of the styles that the layout makes use of by itself, where the sheet has them.
    static constexpr char const * NotesHeadingStyle = "Notes heading";
    static constexpr char const * NoteTextStyle = "Note text";
    static constexpr char const * NoteReferenceStyle = "Note reference";
    static constexpr char const * NoteNumberStyle = "Note number";
    static constexpr char const * TableTextStyle = "Table text";
    static constexpr char const * MissingPictureStyle = "Missing picture";

    /// Attributes of text without any style, which all styles start from.
    void SetDefaults(AttSet glyphAtts, AttSet paragraphAtts);
    /// Adds a style or replaces the one of that name.
    void SetParagraphStyle(TextStyle style);
    void SetCharacterStyle(TextStyle style);

    [[nodiscard]] AttSet const & GetDefaultGlyphAtts() const { return m_DefaultGlyphAtts; }
    [[nodiscard]] AttSet const & GetDefaultParagraphAtts() const { return m_DefaultParagraphAtts; }
    /// In the order in which they were added.
    [[nodiscard]] std::vector<TextStyle> const & GetParagraphStyles() const { return m_ParagraphStyles; }
    [[nodiscard]] std::vector<TextStyle> const & GetCharacterStyles() const { return m_CharacterStyles; }
    /// Null if there is none of that name. Good until the sheet changes.
    [[nodiscard]] TextStyle const * FindParagraphStyle(std::string_view name) const;
    [[nodiscard]] TextStyle const * FindCharacterStyle(std::string_view name) const;

    /// The style's own resolution; the defaults for an unknown or empty name. Good until the sheet changes.
    [[nodiscard]] ResolvedStyle const & ResolveParagraphStyle(std::string_view name) const;
    /// A character style with what it is based on, as one set to lay over text; empty for an unknown name.
    [[nodiscard]] AttSet const & ResolveCharacterStyle(std::string_view name) const;

    [[nodiscard]] Kernel::Counted<StyleSheet> Clone() const { return Kernel::MakeCounted<StyleSheet>(*this); }
    [[nodiscard]] bool IsEqual(StyleSheet const & other) const;

    void Save(Kernel::OutSerialiser & out) const override;
    bool Load(Kernel::InSerialiser const & in, Kernel::FileStore & store, unsigned short version) override;
    void AccumulateHash(Kernel::HashAccumulator & hash) const override;
    [[nodiscard]] Kernel::ClassProperties const & GetObjectClassProperties() const override;

    void SaveBytes(ByteWriter & out) const;
    [[nodiscard]] bool LoadBytes(ByteReader & in);

private:
    void DropCache();

    AttSet m_DefaultGlyphAtts;
    AttSet m_DefaultParagraphAtts;
    std::vector<TextStyle> m_ParagraphStyles;
    std::vector<TextStyle> m_CharacterStyles;

    mutable std::mutex m_CacheLock;
    mutable std::map<std::string, std::unique_ptr<ResolvedStyle const>, std::less<>> m_ResolvedParagraphs;
    mutable std::map<std::string, std::unique_ptr<AttSet const>, std::less<>> m_ResolvedCharacters;
};

}
