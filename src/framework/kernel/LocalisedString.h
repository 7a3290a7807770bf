#pragma once

#include "framework/kernel/StringT.h"

#include <cstddef>

namespace Kernel
{

/// A text for the user's eyes with its context, both literals at the place of use. The pair is the key of a
/// translation: the text is the gettext msgid, the context its msgctxt. Translated when it is turned into a `String`,
/// not when it is made. Copying is cheap.
class LocalisedString
{
public:
    /// Empty.
    LocalisedString() = default;

    /// Lengths in bytes, without closing zeros. The texts must outlive the object: literals do.
    LocalisedString(char const * text, std::size_t textLength, char const * context, std::size_t contextLength)
        : m_Text(text),
          m_TextLength(textLength),
          m_Context(context),
          m_ContextLength(contextLength)
    {
    }

    /// LocalisedString("Export to PDF", "Book Commands")
    template <std::size_t TextSize, std::size_t ContextSize>
    LocalisedString(char const (&text)[TextSize], char const (&context)[ContextSize])
        : LocalisedString(text, TextSize - 1, context, ContextSize - 1)
    {
    }

    /// Wraps text that is final already, such as a formatted message: it is never looked up.
    [[nodiscard]] static LocalisedString CreateFakeFromString(String const & text);

    /// In the user's language, or the text itself where there is no translation. Safe on any thread.
    [[nodiscard]] String ToString() const;
    operator String() const { return ToString(); }

    [[nodiscard]] bool Empty() const { return m_TextLength == 0 && m_Final.Empty(); }
    /// The untranslated text.
    [[nodiscard]] std::string_view SourceText() const;
    [[nodiscard]] std::string_view Context() const { return {m_Context, m_ContextLength}; }

    /// Same text and same context; translations are not compared.
    friend bool operator==(LocalisedString const & a, LocalisedString const & b)
    {
        return a.SourceText() == b.SourceText() && a.Context() == b.Context();
    }

private:
    char const * m_Text = "";
    std::size_t m_TextLength = 0;
    char const * m_Context = "";
    std::size_t m_ContextLength = 0;
    String m_Final;
};

/// The gettext domain of all texts. Translations are looked for in the folder that `SetTranslationFolder` named.
inline constexpr char const * TranslationDomain = "korvane-book";

/// Names the folder of the message catalogues (`<folder>/<language>/LC_MESSAGES/korvane-book.mo`). Once, at start.
void SetTranslationFolder(String const & folder);

}
