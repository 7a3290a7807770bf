#pragma once

#include <array>
#include <cstdint>
#include <memory>

namespace Typeset
{

/// What the engine asks of a character, over and over.
struct CharacterInfo
{
    enum Flags : std::uint16_t
    {
        Special = 1,     ///< Left out of, or replaced in, the text that is shaped: controls, U+00AD, U+FFFC.
        Bidi = 2,        ///< Makes the bidirectional algorithm necessary.
        Surrogate = 4,   ///< One half of a pair; only when looked up by code unit.
        Complex = 8,     ///< Line breaks near it are found by ICU: East Asian, South-East Asian, Hebrew, emoji.
        Mark = 16,       ///< Belongs to the character before it: combining marks, joiners, variation selectors.
        Ignorable = 32,  ///< Needs no glyph.
        Letter = 64,     ///< Part of a word that may be hyphenated.
        Ideographic = 128 ///< Justification may open the gap beside it.
    };
    std::uint16_t m_Flags = 0;
    std::uint8_t m_Script = 0;    ///< UScriptCode; kana and bopomofo count as Han.
    std::uint8_t m_LineClass = 0; ///< ULineBreak, with the classes of UAX #14 LB1 resolved.
};

/// CharacterInfo of all of Unicode, filled from ICU in blocks as they are needed. One thread at a time.
class CharacterTable
{
public:
    [[nodiscard]] CharacterInfo const & Get(char32_t character)
    {
        std::size_t const page = character >> 8;
        if (page >= m_Blocks.size()) {
            return Get(0xFFFD);
        }
        if (!m_Blocks[page]) {
            Fill(page);
        }
        return (*m_Blocks[page])[character & 0xFF];
    }

private:
    using Block = std::array<CharacterInfo, 256>;
    void Fill(std::size_t page);

    std::array<std::unique_ptr<Block>, 0x1100> m_Blocks;
};

}
