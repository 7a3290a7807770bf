#pragma once

#include <bitset>
#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace Typeset
{

/// Hyphenation patterns (F. M. Liang, "Word Hy-phen-a-tion by Com-put-er", 1983) in the dictionary format of libhyphen:
/// a character set, options, patterns such as "hy3ph"; with NEXTLEVEL, a first set of patterns that parts compounds
/// and a second one for their members. Read here and not by libhyphen, which takes seconds for the German dictionary,
/// but understood in the same way: of the patterns that end at a letter, the longest counts. Immutable after loading.
class HyphenPatterns
{
public:
    /// False if the file cannot be read or is no dictionary.
    [[nodiscard]] bool Load(std::string const & path);

    /// For each letter of a lower-case word: whether a hyphen may stand after it, the minima not considered.
    /// Apostrophes are U+0027. Nowhere in longer words.
    static constexpr std::size_t LongestWord = 200;
    [[nodiscard]] std::bitset<LongestWord> Find(std::u16string_view word) const;

    /// Least number of letters before and after a hyphen that the dictionary declares; 0 if it does not.
    [[nodiscard]] int GetLeftMinimum() const noexcept { return m_LeftMinimum; }
    [[nodiscard]] int GetRightMinimum() const noexcept { return m_RightMinimum; }
    /// Some pattern has the letter.
    [[nodiscard]] bool Knows(char16_t letter) const noexcept { return m_Letters[letter]; }

private:
    /// Marks a place whose hyphen would change the spelling ("Schiffahrt" to "Schiff-fahrt"); they are not used.
    static constexpr std::uint8_t Respells = 0x80;

    /// The start of one or more patterns, known by its hash alone: of a few hundred thousand 64-bit hashes, no two
    /// are alike.
    struct Slot
    {
        std::uint64_t m_Hash = 0;   ///< 0 = free.
        std::uint32_t m_Values = 0; ///< Into m_Values: one more than letters. 0: it is no whole pattern.
    };
    struct Level
    {
        std::vector<Slot> m_Slots;
        std::size_t m_Used = 0;
    };

    void ReadLine(std::u16string_view line, std::size_t level);
    void AddPattern(std::u16string_view line, std::size_t level);
    void Insert(Level & level, std::u16string_view letters, std::vector<std::uint8_t> const & values);
    static Slot & Place(Level & level, std::uint64_t hash);
    [[nodiscard]] static Slot const * Look(Level const & level, std::uint64_t hash);
    /// The values after each letter of the word, by one set of patterns.
    void Mark(Level const & level, std::u16string_view word, std::uint8_t * marks) const;

    std::vector<Level> m_Levels;
    std::vector<std::uint8_t> m_Values = std::vector<std::uint8_t>(1);
    std::u16string m_NoHyphen;      ///< No hyphen beside these characters.
    std::u16string m_LastInserted;  ///< While loading: neighbours in the file start alike.
    std::vector<bool> m_Letters = std::vector<bool>(0x10000);
    int m_LeftMinimum = 0;
    int m_RightMinimum = 0;
    int m_CompoundLeftMinimum = 0; ///< The same at the seams of compounds.
    int m_CompoundRightMinimum = 0;
};

}
