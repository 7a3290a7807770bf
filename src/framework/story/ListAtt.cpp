#include "framework/story/ListAtt.h"

#include "framework/kernel/HashAccumulator.h"
#include "framework/story/ByteStream.h"

#include <algorithm>
#include <array>
#include <string>

namespace Story
{

namespace
{

struct RomanDigit
{
    int m_Value;
    char const * m_Lower;
    char const * m_Upper;
};

constexpr std::array<RomanDigit, 13> RomanDigits{{{1000, "m", "M"},
                                                  {900, "cm", "CM"},
                                                  {500, "d", "D"},
                                                  {400, "cd", "CD"},
                                                  {100, "c", "C"},
                                                  {90, "xc", "XC"},
                                                  {50, "l", "L"},
                                                  {40, "xl", "XL"},
                                                  {10, "x", "X"},
                                                  {9, "ix", "IX"},
                                                  {5, "v", "V"},
                                                  {4, "iv", "IV"},
                                                  {1, "i", "I"}}};

std::string FormatRoman(int number, bool upper)
{
    std::string text;
    for (RomanDigit const & digit : RomanDigits) {
        for (; number >= digit.m_Value; number -= digit.m_Value) {
            text += upper ? digit.m_Upper : digit.m_Lower;
        }
    }
    return text;
}

std::string FormatLetters(int number, char first)
{
    std::string text;
    for (; number > 0; number = (number - 1) / 26) {
        text += static_cast<char>(first + (number - 1) % 26);
    }
    std::reverse(text.begin(), text.end());
    return text;
}

bool Names(ListAttFields fields, ListAttFields field)
{
    return (static_cast<std::uint32_t>(fields) & static_cast<std::uint32_t>(field)) != 0;
}

}

String FormatNumber(int number, ListAtt::NumberFormat format)
{
    constexpr int largestRoman = 3999;
    using Format = ListAtt::NumberFormat;
    if (number >= 1) {
        if (format == Format::LowerLetter || format == Format::UpperLetter) {
            return FormatLetters(number, format == Format::LowerLetter ? 'a' : 'A');
        }
        if ((format == Format::LowerRoman || format == Format::UpperRoman) && number <= largestRoman) {
            return FormatRoman(number, format == Format::UpperRoman);
        }
    }
    return std::to_string(number);
}

String ListAtt::FormatMarker(int number) const
{
    switch (m_Kind) {
    case Bulleted:
        return m_Bullet;
    case Numbered:
        return FormatNumber(number, m_Format) + m_Suffix.View();
    default:
        return {};
    }
}

void ListAtt::CopyFields(ListAtt const & other, ListAttFields fields)
{
    auto const copy = [&](ListAttFields field, auto ListAtt::*member) {
        if (Names(fields, field)) {
            this->*member = other.*member;
        }
    };
    copy(ListAttFields::Kind, &ListAtt::m_Kind);
    copy(ListAttFields::Level, &ListAtt::m_Level);
    copy(ListAttFields::Name, &ListAtt::m_Name);
    copy(ListAttFields::Format, &ListAtt::m_Format);
    copy(ListAttFields::Bullet, &ListAtt::m_Bullet);
    copy(ListAttFields::Suffix, &ListAtt::m_Suffix);
    copy(ListAttFields::Group, &ListAtt::m_Group);
    copy(ListAttFields::IsGlobal, &ListAtt::m_IsGlobal);
    copy(ListAttFields::IsRestartNumbering, &ListAtt::m_IsRestartNumbering);
    copy(ListAttFields::StartNumberingAt, &ListAtt::m_StartNumberingAt);
}

bool ListAtt::IsEqual(ListAtt const & other) const
{
    return m_Kind == other.m_Kind && m_Level == other.m_Level && m_Name == other.m_Name &&
           m_StartNumberingAt == other.m_StartNumberingAt && m_Group == other.m_Group &&
           m_IsRestartNumbering == other.m_IsRestartNumbering && m_IsGlobal == other.m_IsGlobal &&
           m_Format == other.m_Format && m_Bullet == other.m_Bullet && m_Suffix == other.m_Suffix;
}

void ListAtt::Save(ByteWriter & out) const
{
    out.Write(static_cast<std::int32_t>(m_Kind));
    out.Write(static_cast<std::int32_t>(m_Level));
    out.WriteString(m_Name);
    out.Write(static_cast<std::int32_t>(m_StartNumberingAt));
    out.Write(static_cast<std::int32_t>(m_Group));
    out.WriteBool(m_IsRestartNumbering);
    out.WriteBool(m_IsGlobal);
    out.Write(m_Format);
    out.WriteString(m_Bullet);
    out.WriteString(m_Suffix);
}

Kernel::Counted<ListAtt const> ListAtt::Load(ByteReader & in)
{
    auto att = Kernel::MakeCounted<ListAtt>();
    att->m_Kind = in.Read<std::int32_t>();
    att->m_Level = in.Read<std::int32_t>();
    att->m_Name = in.ReadString();
    att->m_StartNumberingAt = in.Read<std::int32_t>();
    att->m_Group = in.Read<std::int32_t>();
    att->m_IsRestartNumbering = in.ReadBool();
    att->m_IsGlobal = in.ReadBool();
    att->m_Format = in.Read<NumberFormat>();
    att->m_Bullet = in.ReadString();
    att->m_Suffix = in.ReadString();
    return att;
}

void ListAtt::AccumulateHash(Kernel::HashAccumulator & hash) const
{
    hash.Add(m_Kind);
    hash.Add(m_Level);
    hash.Add(m_Name);
    hash.Add(m_StartNumberingAt);
    hash.Add(m_Group);
    hash.Add(m_IsRestartNumbering);
    hash.Add(m_IsGlobal);
    hash.Add(m_Format);
    hash.Add(m_Bullet);
    hash.Add(m_Suffix);
}

}
