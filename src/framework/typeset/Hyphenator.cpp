#include "framework/typeset/Hyphenator.h"

#include <unicode/uchar.h>
#include <unicode/unorm2.h>
#include <unicode/utf16.h>

#include <algorithm>
#include <array>
#include <cctype>
#include <cstdlib>
#include <map>
#include <memory>
#include <mutex>
#include <string>
#include <unistd.h>

namespace Typeset
{

namespace
{

struct Minima
{
    char const * m_Language;
    int m_Left;
    int m_Right;
};

// The least fragments that each language's typographers accept; what a dictionary declares counts where it is more.
constexpr Minima minima[] = {{"de", 2, 2}, {"el", 2, 2}, {"en", 2, 3}, {"es", 2, 2}, {"fr", 2, 3},
                             {"it", 2, 2}, {"nl", 2, 2}, {"pl", 2, 2}, {"pt", 2, 3}, {"ru", 2, 2},
                             {"sv", 2, 2}, {"cs", 2, 3}, {"uk", 2, 2}, {"la", 2, 2}};

std::string FindDictionary(std::string_view language)
{
    std::string folders = "/usr/share/hyphen";
    if (char const * own = std::getenv("KORVANE_HYPHEN_PATH")) {
        folders = own;
    }
    std::string base(language.substr(0, language.find_first_of("-_")));
    std::transform(base.begin(), base.end(), base.begin(), [](unsigned char c) { return std::tolower(c); });
    if (base.empty() || base.find_first_not_of("abcdefghijklmnopqrstuvwxyz") != std::string::npos) {
        return {};
    }
    std::string full(language);
    std::replace(full.begin(), full.end(), '-', '_');
    std::string upper(base);
    std::transform(upper.begin(), upper.end(), upper.begin(), [](unsigned char c) { return std::toupper(c); });
    // American patterns are what "en" means; other languages name their main country as themselves.
    std::vector<std::string> names{full, base, base + "_" + (base == "en" ? "US" : upper)};
    if (base == "el") {
        names.push_back("el_GR");
    }
    std::size_t start = 0;
    while (start <= folders.size()) {
        std::size_t const end = std::min(folders.find(':', start), folders.size());
        for (std::string const & name : names) {
            if (name.find('/') != std::string::npos) {
                continue;
            }
            std::string const path = folders.substr(start, end - start) + "/hyph_" + name + ".dic";
            if (access(path.c_str(), R_OK) == 0) {
                return path;
            }
        }
        start = end + 1;
    }
    return {};
}

}

Hyphenator const * Hyphenator::Get(String const & language)
{
    static std::mutex lock;
    static auto & byLanguage = *new std::map<std::string, Hyphenator *>;
    static auto & byPath = *new std::map<std::string, std::unique_ptr<Hyphenator>>;

    std::lock_guard const guard(lock);
    std::string const tag = language.ToStd();
    if (auto const known = byLanguage.find(tag); known != byLanguage.end()) {
        return known->second;
    }
    Hyphenator * found = nullptr;
    if (std::string const path = FindDictionary(tag); !path.empty()) {
        std::unique_ptr<Hyphenator> & made = byPath[path + "|" + tag.substr(0, 2)];
        if (!made) {
            std::unique_ptr<Hyphenator> loaded(new Hyphenator);
            if (loaded->m_Patterns.Load(path)) {
                std::string const base = tag.substr(0, tag.find_first_of("-_"));
                loaded->m_LeftMinimum = std::max(loaded->m_Patterns.GetLeftMinimum(), 2);
                loaded->m_RightMinimum = std::max(loaded->m_Patterns.GetRightMinimum(), 2);
                for (Minima const & entry : minima) {
                    if (base == entry.m_Language) {
                        loaded->m_LeftMinimum = std::max(loaded->m_LeftMinimum, entry.m_Left);
                        loaded->m_RightMinimum = std::max(loaded->m_RightMinimum, entry.m_Right);
                    }
                }
                made = std::move(loaded);
            }
        }
        found = made.get();
    }
    byLanguage.emplace(tag, found);
    return found;
}

void Hyphenator::Hyphenate(std::u16string_view word, std::vector<std::uint16_t> & positions) const
{
    if (word.size() < static_cast<std::size_t>(m_LeftMinimum + m_RightMinimum) ||
        word.size() > HyphenPatterns::LongestWord) {
        return;
    }
    // One letter at a time, so that places in the lower-cased word lead back to the text.
    std::array<char16_t, HyphenPatterns::LongestWord> letters;
    std::array<std::uint16_t, HyphenPatterns::LongestWord> starts; // Offset in the word of each letter.
    std::size_t count = 0;
    for (std::size_t i = 0; i < word.size();) {
        starts[count] = static_cast<std::uint16_t>(i);
        UChar32 character = 0;
        U16_NEXT(word.data(), i, word.size(), character);
        character = character == 0x2019 ? '\'' : u_tolower(character);
        if (character > 0xFFFF) {
            character = 0xFFFD; // No pattern has such letters.
        } else if (!m_Patterns.Knows(static_cast<char16_t>(character))) {
            // Polytonic Greek in a monotonic dictionary: accents do not matter to the syllables.
            UErrorCode error = U_ZERO_ERROR;
            UChar decomposed[8];
            std::int32_t const length =
                unorm2_getDecomposition(unorm2_getNFDInstance(&error), character, decomposed, 8, &error);
            if (U_SUCCESS(error) && length > 0 && m_Patterns.Knows(decomposed[0])) {
                character = decomposed[0];
            }
        }
        letters[count++] = static_cast<char16_t>(character);
    }
    auto const allowed = m_Patterns.Find(std::u16string_view(letters.data(), count));
    auto const left = static_cast<std::size_t>(m_LeftMinimum);
    auto const right = static_cast<std::size_t>(m_RightMinimum);
    for (std::size_t i = left; i + right <= count; ++i) {
        // Marks stay with their letter.
        if (allowed[i - 1] && u_charType(letters[i]) != U_NON_SPACING_MARK) {
            positions.push_back(starts[i]);
        }
    }
}

}
