#include "framework/kernel/LocalisedString.h"

#include <libintl.h>
#include <string>

namespace Kernel
{

LocalisedString LocalisedString::CreateFakeFromString(String const & text)
{
    LocalisedString result;
    result.m_Final = text;
    return result;
}

std::string_view LocalisedString::SourceText() const
{
    return m_TextLength == 0 ? m_Final.View() : std::string_view(m_Text, m_TextLength);
}

String LocalisedString::ToString() const
{
    if (m_TextLength == 0) {
        // Also keeps the empty text from gettext, which answers it with the catalogue's header.
        return m_Final;
    }
    // A catalogue's key is context, end-of-transmission byte, text.
    std::string key;
    key.reserve(m_ContextLength + 1 + m_TextLength);
    key.append(m_Context, m_ContextLength).append(1, '\004').append(m_Text, m_TextLength);
    char const * const found = dgettext(TranslationDomain, key.c_str());
    if (found == key.c_str()) {
        return String(m_Text, m_TextLength);
    }
    return String(found);
}

void SetTranslationFolder(String const & folder)
{
    bindtextdomain(TranslationDomain, folder.c_str());
    bind_textdomain_codeset(TranslationDomain, "UTF-8");
}

}
