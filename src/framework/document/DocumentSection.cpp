#include "framework/document/DocumentSection.h"

#include <string>

namespace
{

std::string ToRoman(unsigned int number)
{
    static constexpr struct
    {
        unsigned int m_Value;
        char const * m_Text;
    } digits[] = {{1000, "m"}, {900, "cm"}, {500, "d"}, {400, "cd"}, {100, "c"}, {90, "xc"}, {50, "l"},
                  {40, "xl"},  {10, "x"},   {9, "ix"},  {5, "v"},    {4, "iv"},  {1, "i"}};
    std::string text;
    for (auto const & digit : digits) {
        for (; number >= digit.m_Value; number -= digit.m_Value) {
            text += digit.m_Text;
        }
    }
    return text;
}

}

bool DocumentSection::HasDefaultValues() const
{
    // The first section always restarts, so that this alone is no sign of a hand on it.
    Values fresh;
    fresh.m_RestartPageNumbering = 0 == m_Values.m_StartPageIndex;
    fresh.m_StartPageIndex = m_Values.m_StartPageIndex;
    if (!m_Values.m_RestartPageNumbering) {
        fresh.m_StartNumberingAt = m_Values.m_StartNumberingAt;
    }
    return fresh == m_Values;
}

String DocumentSection::FormatNumber(unsigned int number) const
{
    std::string text;
    switch (m_Values.m_Format) {
    case PageNumberFormat::None:
        return String();
    case PageNumberFormat::RomanLower:
    case PageNumberFormat::RomanUpper:
        if (0 < number && number < 4000) {
            text = ToRoman(number);
            if (PageNumberFormat::RomanUpper == m_Values.m_Format) {
                for (char & letter : text) {
                    letter = static_cast<char>(letter - 'a' + 'A');
                }
            }
            break;
        }
        [[fallthrough]];
    case PageNumberFormat::Decimal:
        text = std::to_string(number);
        break;
    }
    return m_Values.m_Prefix + text;
}
