#include "framework/typeset/CharacterTable.h"

#include <unicode/uchar.h>
#include <unicode/uscript.h>

namespace Typeset
{

namespace
{

bool NeedsBidi(UCharDirection direction)
{
    switch (direction) {
    case U_RIGHT_TO_LEFT:
    case U_RIGHT_TO_LEFT_ARABIC:
    case U_ARABIC_NUMBER:
    case U_RIGHT_TO_LEFT_EMBEDDING:
    case U_RIGHT_TO_LEFT_OVERRIDE:
    case U_RIGHT_TO_LEFT_ISOLATE:
    case U_LEFT_TO_RIGHT_EMBEDDING:
    case U_LEFT_TO_RIGHT_OVERRIDE:
    case U_LEFT_TO_RIGHT_ISOLATE:
    case U_FIRST_STRONG_ISOLATE:
    case U_POP_DIRECTIONAL_FORMAT:
    case U_POP_DIRECTIONAL_ISOLATE:
        return true;
    default:
        return false;
    }
}

bool IsSpecial(UChar32 character, int8_t category)
{
    if (character == '\t') {
        return false;
    }
    return category == U_CONTROL_CHAR || character == 0xAD || character == 0x2028 || character == 0x2029 ||
           character == 0xFEFF || character == 0xFFFC || category == U_SURROGATE;
}

ULineBreak ResolveLineClass(UChar32 character)
{
    auto const lineClass = static_cast<ULineBreak>(u_getIntPropertyValue(character, UCHAR_LINE_BREAK));
    switch (lineClass) {
    case U_LB_AMBIGUOUS:
    case U_LB_SURROGATE:
    case U_LB_UNKNOWN:
        return U_LB_ALPHABETIC;
    case U_LB_CONDITIONAL_JAPANESE_STARTER:
        return U_LB_NONSTARTER;
    default:
        return lineClass;
    }
}

bool IsComplexForBreaking(UChar32 character, ULineBreak lineClass)
{
    switch (lineClass) {
    case U_LB_ALPHABETIC:
    case U_LB_NUMERIC:
    case U_LB_QUOTATION:
    case U_LB_OPEN_PUNCTUATION:
    case U_LB_CLOSE_PUNCTUATION:
    case U_LB_CLOSE_PARENTHESIS:
    case U_LB_EXCLAMATION:
    case U_LB_INFIX_NUMERIC:
    case U_LB_BREAK_SYMBOLS:
    case U_LB_PREFIX_NUMERIC:
    case U_LB_POSTFIX_NUMERIC:
    case U_LB_GLUE:
    case U_LB_SPACE:
    case U_LB_HYPHEN:
    case U_LB_BREAK_AFTER:
    case U_LB_BREAK_BEFORE:
    case U_LB_BREAK_BOTH:
    case U_LB_ZWSPACE:
    case U_LB_WORD_JOINER:
    case U_LB_COMBINING_MARK:
    case U_LB_INSEPARABLE:
    case U_LB_CONTINGENT_BREAK:
    case U_LB_MANDATORY_BREAK:
    case U_LB_LINE_FEED:
    case U_LB_CARRIAGE_RETURN:
    case U_LB_NEXT_LINE:
        return character >= 0x2E80 && character < 0xFB00;
    default:
        return true;
    }
}

CharacterInfo Describe(UChar32 character)
{
    CharacterInfo info;
    auto const category = u_charType(character);
    UErrorCode error = U_ZERO_ERROR;
    UScriptCode script = uscript_getScript(character, &error);
    if (script == USCRIPT_HIRAGANA || script == USCRIPT_KATAKANA || script == USCRIPT_BOPOMOFO) {
        script = USCRIPT_HAN;
    }
    if (U_FAILURE(error) || script < 0 || script > 255 || script == USCRIPT_UNKNOWN) {
        script = USCRIPT_COMMON;
    }
    info.m_Script = static_cast<std::uint8_t>(script);
    ULineBreak const lineClass = ResolveLineClass(character);
    info.m_LineClass = static_cast<std::uint8_t>(lineClass);

    auto const set = [&info](CharacterInfo::Flags flag, bool condition) {
        if (condition) {
            info.m_Flags |= flag;
        }
    };
    bool const isMark = category == U_NON_SPACING_MARK || category == U_ENCLOSING_MARK ||
                        category == U_COMBINING_SPACING_MARK;
    set(CharacterInfo::Special, IsSpecial(character, category));
    set(CharacterInfo::Bidi, NeedsBidi(u_charDirection(character)));
    set(CharacterInfo::Surrogate, category == U_SURROGATE);
    set(CharacterInfo::Complex, IsComplexForBreaking(character, lineClass));
    set(CharacterInfo::Mark, isMark || character == 0x200C || character == 0x200D ||
                                 u_hasBinaryProperty(character, UCHAR_EMOJI_MODIFIER) ||
                                 u_hasBinaryProperty(character, UCHAR_VARIATION_SELECTOR));
    set(CharacterInfo::Ignorable, u_hasBinaryProperty(character, UCHAR_DEFAULT_IGNORABLE_CODE_POINT) ||
                                      category == U_CONTROL_CHAR || category == U_LINE_SEPARATOR ||
                                      category == U_PARAGRAPH_SEPARATOR);
    set(CharacterInfo::Letter, u_isalpha(character) || isMark);
    set(CharacterInfo::Ideographic,
        script == USCRIPT_HAN || lineClass == U_LB_IDEOGRAPHIC || (character >= 0x3000 && character < 0x3040));
    return info;
}

}

void CharacterTable::Fill(std::size_t page)
{
    m_Blocks[page] = std::make_unique<Block>();
    for (std::size_t i = 0; i < 256; ++i) {
        (*m_Blocks[page])[i] = Describe(static_cast<UChar32>(page * 256 + i));
    }
}

}
