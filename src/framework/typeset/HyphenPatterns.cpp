#include "framework/typeset/HyphenPatterns.h"

#include <unicode/ucnv.h>

#include <algorithm>
#include <array>
#include <cstdio>

namespace Typeset
{

namespace
{

constexpr std::uint64_t hashStart = 0xCBF29CE484222325ULL;

std::uint64_t HashOn(std::uint64_t hash, char16_t unit)
{
    hash = (hash ^ unit) * 0x9E3779B97F4A7C15ULL;
    return (hash ^ hash >> 29) | 1;
}

bool IsDigit(char16_t unit) { return unit >= u'0' && unit <= u'9'; }

std::u16string Convert(std::string const & bytes, std::string const & encoding)
{
    UErrorCode error = U_ZERO_ERROR;
    UConverter * converter = ucnv_open(encoding.c_str(), &error);
    std::u16string text(bytes.size() + 1, u'\0');
    if (U_SUCCESS(error)) {
        std::int32_t const length =
            ucnv_toUChars(converter, text.data(), static_cast<std::int32_t>(text.size()), bytes.data(),
                          static_cast<std::int32_t>(bytes.size()), &error);
        text.resize(U_SUCCESS(error) ? static_cast<std::size_t>(length) : 0);
        ucnv_close(converter);
    } else {
        text.clear();
    }
    return text;
}

/// Empty if it cannot be read.
std::string ReadFile(std::string const & path)
{
    std::string bytes;
    if (std::FILE * file = std::fopen(path.c_str(), "rb")) {
        std::array<char, 65536> part;
        while (std::size_t const count = std::fread(part.data(), 1, part.size(), file)) {
            bytes.append(part.data(), count);
        }
        std::fclose(file);
    }
    return bytes;
}

/// The number after an option's name.
int ReadNumber(std::u16string_view line)
{
    int number = 0;
    for (char16_t const unit : line) {
        if (IsDigit(unit) && number < 1000) {
            number = number * 10 + (unit - u'0');
        }
    }
    return number;
}

}

bool HyphenPatterns::Load(std::string const & path)
{
    std::string const bytes = ReadFile(path);
    std::size_t const firstEnd = bytes.find('\n');
    if (firstEnd == std::string::npos) {
        return false;
    }
    std::string encoding = bytes.substr(0, firstEnd);
    encoding.erase(encoding.find_last_not_of(" \r") + 1);
    bool const utf8 = encoding == "UTF-8";
    std::u16string const text = Convert(bytes.substr(firstEnd + 1), encoding);
    if (text.empty()) {
        return false;
    }

    m_Levels.resize(1);
    for (std::size_t start = 0; start < text.size();) {
        std::size_t const end = std::min(text.find(u'\n', start), text.size());
        std::u16string_view line(text.data() + start, end - start);
        while (!line.empty() && (line.back() == u'\r' || line.back() == u' ')) {
            line.remove_suffix(1);
        }
        if (line.starts_with(u"NEXTLEVEL")) {
            m_Levels.emplace_back();
            m_LastInserted.clear();
        } else {
            ReadLine(line, m_Levels.size() - 1);
        }
        start = end + 1;
    }
    if (m_Levels.size() == 1) {
        // A dictionary of one level gets another before it, which parts words at hyphens and apostrophes.
        m_Levels.insert(m_Levels.begin(), Level());
        m_LastInserted.clear();
        m_CompoundLeftMinimum = m_CompoundLeftMinimum ? m_CompoundLeftMinimum : std::max(m_LeftMinimum, 2);
        m_CompoundRightMinimum = m_CompoundRightMinimum ? m_CompoundRightMinimum : std::max(m_RightMinimum, 3);
        m_NoHyphen = utf8 ? u"'\u2013\u2019-" : u"'-";
        for (char16_t const unit : m_NoHyphen) {
            Insert(m_Levels.front(), std::u16string_view(&unit, 1), {1, 1});
        }
    }
    return true;
}

void HyphenPatterns::ReadLine(std::u16string_view line, std::size_t level)
{
    if (line.empty() || line.front() == u'%' || line.front() == u'#') {
        return;
    }
    if (line.starts_with(u"LEFTHYPHENMIN")) {
        m_LeftMinimum = ReadNumber(line);
    } else if (line.starts_with(u"RIGHTHYPHENMIN")) {
        m_RightMinimum = ReadNumber(line);
    } else if (line.starts_with(u"NOHYPHEN")) {
        for (char16_t const unit : line.substr(8)) {
            if (unit != u',' && unit != u' ' && unit != u'\t') {
                m_NoHyphen += unit;
            }
        }
    } else if (line.starts_with(u"COMPOUNDLEFTHYPHENMIN")) {
        m_CompoundLeftMinimum = ReadNumber(line);
    } else if (line.starts_with(u"COMPOUNDRIGHTHYPHENMIN")) {
        m_CompoundRightMinimum = ReadNumber(line);
    } else {
        AddPattern(line, level);
    }
}

void HyphenPatterns::AddPattern(std::u16string_view line, std::size_t level)
{
    std::size_t const slash = line.find(u'/');
    std::uint8_t const respells = slash == std::u16string_view::npos ? 0 : Respells;
    std::u16string letters;
    std::vector<std::uint8_t> values(1);
    for (char16_t const unit : line.substr(0, slash)) {
        if (IsDigit(unit)) {
            values.back() = static_cast<std::uint8_t>(unit - u'0') | respells;
        } else {
            letters += unit;
            values.push_back(0);
            m_Letters[unit] = true;
        }
    }
    if (!letters.empty() && letters.size() < 200) {
        Insert(m_Levels[level], letters, values);
    }
}

HyphenPatterns::Slot & HyphenPatterns::Place(Level & level, std::uint64_t hash)
{
    if ((level.m_Used + 1) * 2 > level.m_Slots.size()) {
        std::vector<Slot> old(std::max<std::size_t>(level.m_Slots.size() * 4, 1024));
        old.swap(level.m_Slots);
        for (Slot const & slot : old) {
            if (slot.m_Hash) {
                std::size_t at = slot.m_Hash >> 8 & (level.m_Slots.size() - 1);
                while (level.m_Slots[at].m_Hash) {
                    at = (at + 1) & (level.m_Slots.size() - 1);
                }
                level.m_Slots[at] = slot;
            }
        }
    }
    std::size_t at = hash >> 8 & (level.m_Slots.size() - 1);
    while (level.m_Slots[at].m_Hash && level.m_Slots[at].m_Hash != hash) {
        at = (at + 1) & (level.m_Slots.size() - 1);
    }
    if (!level.m_Slots[at].m_Hash) {
        level.m_Slots[at].m_Hash = hash;
        ++level.m_Used;
    }
    return level.m_Slots[at];
}

HyphenPatterns::Slot const * HyphenPatterns::Look(Level const & level, std::uint64_t hash)
{
    std::size_t const mask = level.m_Slots.size() - 1;
    for (std::size_t at = hash >> 8 & mask; level.m_Slots[at].m_Hash; at = (at + 1) & mask) {
        if (level.m_Slots[at].m_Hash == hash) {
            return &level.m_Slots[at];
        }
    }
    return nullptr;
}

void HyphenPatterns::Insert(Level & level, std::u16string_view letters, std::vector<std::uint8_t> const & values)
{
    std::size_t const shared = static_cast<std::size_t>(
        std::mismatch(letters.begin(), letters.end(), m_LastInserted.begin(), m_LastInserted.end()).first -
        letters.begin());
    std::uint64_t hash = hashStart;
    for (std::size_t i = 0; i < letters.size(); ++i) {
        hash = HashOn(hash, letters[i]);
        if (i >= shared && i + 1 < letters.size()) {
            Place(level, hash);
        }
    }
    Place(level, hash).m_Values = static_cast<std::uint32_t>(m_Values.size());
    m_Values.insert(m_Values.end(), values.begin(), values.end());
    m_LastInserted.assign(letters);
}

void HyphenPatterns::Mark(Level const & level, std::u16string_view word, std::uint8_t * marks) const
{
    std::fill(marks, marks + word.size(), std::uint8_t{0});
    if (level.m_Slots.empty()) {
        return;
    }
    struct Start
    {
        std::size_t m_At;
        std::uint64_t m_Hash;
    };
    std::array<Start, LongestWord + 2> starts; // Of all patterns that may still be under way.
    std::size_t count = 0;
    std::size_t const length = word.size() + 2;
    for (std::size_t at = 0; at < length; ++at) {
        bool const isEdge = at == 0 || at + 1 == length;
        char16_t const unit = isEdge || IsDigit(word[at - 1]) ? u'.' : word[at - 1];
        starts[count++] = {at, hashStart};
        // Only the longest pattern that ends here, or that has come this far, counts: the dictionaries are made so
        // that it holds what the shorter ones say.
        Slot const * longest = nullptr;
        std::size_t longestStart = 0;
        std::size_t kept = 0;
        for (std::size_t i = 0; i < count; ++i) {
            Start start = starts[i];
            start.m_Hash = HashOn(start.m_Hash, unit);
            if (Slot const * slot = Look(level, start.m_Hash)) {
                if (!longest) {
                    longest = slot;
                    longestStart = start.m_At;
                }
                starts[kept++] = start;
            }
        }
        count = kept;
        if (!longest || !longest->m_Values) {
            continue;
        }
        for (std::size_t i = longestStart; i <= at + 1; ++i) {
            // Value i stands before character i of the word with its edges, after letter i - 2 of the word.
            std::uint8_t const value = m_Values[longest->m_Values + i - longestStart];
            if (i >= 2 && i < length && (value & 0x7F) > (marks[i - 2] & 0x7F)) {
                marks[i - 2] = value;
            }
        }
    }
}

std::bitset<HyphenPatterns::LongestWord> HyphenPatterns::Find(std::u16string_view word) const
{
    std::size_t const length = word.size();
    std::array<std::uint8_t, LongestWord> seams;
    std::array<std::uint8_t, LongestWord> inner;
    std::bitset<LongestWord> found;
    if (length == 0 || length > LongestWord) {
        return found;
    }
    Mark(m_Levels.front(), word, seams.data());
    for (std::size_t start = 0; start < length;) {
        std::size_t end = start;
        while (end + 1 < length && !(seams[end] & 1)) {
            ++end;
        }
        // Members of a compound; those of one or two letters stay whole.
        bool const isWhole = start == 0 && end + 1 == length;
        if (m_Levels.size() > 1 && (isWhole || end - start > 1)) {
            Mark(m_Levels[1], word.substr(start, end - start + 1), inner.data());
            std::size_t const left = start > 0 ? static_cast<std::size_t>(m_CompoundLeftMinimum) : 0;
            std::size_t const right = end + 1 < length ? static_cast<std::size_t>(m_CompoundRightMinimum) : 0;
            for (std::size_t i = start; i < end; ++i) {
                bool const isAllowed = (inner[i - start] & 1) && !(inner[i - start] & Respells);
                found[i] = isAllowed && i - start + 1 >= left && end - i >= right;
            }
        }
        found[end] = (seams[end] & 1) && !(seams[end] & Respells) && end + 1 < length;
        start = end + 1;
    }
    for (std::size_t i = 0; i < length; ++i) {
        if (m_NoHyphen.find(word[i]) != std::u16string::npos) {
            found[i] = false;
            if (i > 0) {
                found[i - 1] = false;
            }
        }
    }
    return found;
}

}
