#include "import/Slug.h"

#include <algorithm>
#include <unicode/uchar.h>
#include <unicode/utf8.h>

namespace Import
{

std::string MakeSlug(std::string_view text)
{
    std::string slug;
    auto const * bytes = reinterpret_cast<std::uint8_t const *>(text.data());
    std::size_t at = 0;
    while (at < text.size()) {
        auto const rest = static_cast<std::int32_t>(std::min<std::size_t>(text.size() - at, 8));
        std::int32_t step = 0;
        UChar32 character = 0;
        U8_NEXT_OR_FFFD(bytes + at, step, rest, character);
        at += static_cast<std::size_t>(step);
        if (u_isspace(character)) {
            slug += '-';
        } else if (u_isalnum(character) || '_' == character || '-' == character ||
                   0 != (U_GET_GC_MASK(character) & U_GC_M_MASK)) {
            char encoded[4];
            std::int32_t length = 0;
            U8_APPEND_UNSAFE(encoded, length, u_tolower(character));
            slug.append(encoded, static_cast<std::size_t>(length));
        }
    }
    return slug;
}

std::string SlugCounter::MakeUnique(std::string slug)
{
    if (slug.empty()) {
        slug = "section";
    }
    if (Take(slug)) {
        return slug;
    }
    for (int & count = m_Taken[slug];;) {
        std::string candidate = slug + '-' + std::to_string(++count);
        if (Take(candidate)) {
            return candidate;
        }
    }
}

bool SlugCounter::Take(std::string const & id)
{
    return m_Taken.emplace(id, 0).second;
}

}
