#include "framework/typeset/Hyphenator.h"

#include <hyphen.h>
#include <unicode/uchar.h>
#include <unicode/ucnv.h>
#include <unicode/unorm2.h>
#include <unicode/ustring.h>
#include <unicode/utf16.h>

#include <algorithm>
#include <cstdlib>
#include <map>
#include <memory>
#include <mutex>
#include <string>
#include <unistd.h>

namespace Typeset
{

struct Hyphenator::Dictionary
{
    HyphenDict * m_Hyphen = nullptr;
    bool m_Utf8 = false;
    /// For an 8-bit encoding: the byte of each code unit, 0 where it has none.
    std::vector<char> m_Bytes;
    std::string m_Locale;
};

namespace
{

struct Minima
{
    char const * m_Language;
    int m_Left;
    int m_Right;
};

// The least fragments that each language's typographers accept; what a dictionary declares is not smaller for these.
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

/// The byte that stands for each code unit of the Basic Multilingual Plane in an 8-bit encoding.
std::vector<char> ReadEncoding(char const * name)
{
    std::vector<char> bytes;
    UErrorCode error = U_ZERO_ERROR;
    UConverter * converter = ucnv_open(name, &error);
    if (U_FAILURE(error)) {
        return bytes;
    }
    bytes.assign(0x10000, 0);
    for (int byte = 1; byte < 256; ++byte) {
        char const source = static_cast<char>(byte);
        UChar target[4] = {};
        error = U_ZERO_ERROR;
        if (ucnv_toUChars(converter, target, 4, &source, 1, &error) == 1 && U_SUCCESS(error) && target[0] != 0xFFFD) {
            bytes[target[0]] = source;
        }
    }
    ucnv_close(converter);
    return bytes;
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
            if (HyphenDict * hyphen = hnj_hyphen_load(path.c_str())) {
                made.reset(new Hyphenator);
                made->m_Dictionary = new Dictionary;
                Dictionary & dictionary = *made->m_Dictionary;
                dictionary.m_Hyphen = hyphen;
                dictionary.m_Utf8 = hyphen->utf8 != 0;
                dictionary.m_Locale = tag.substr(0, tag.find_first_of("-_"));
                if (!dictionary.m_Utf8) {
                    dictionary.m_Bytes = ReadEncoding(hyphen->cset);
                }
                made->m_LeftMinimum = std::max<int>(hyphen->lhmin, 2);
                made->m_RightMinimum = std::max<int>(hyphen->rhmin, 2);
                for (Minima const & entry : minima) {
                    if (dictionary.m_Locale == entry.m_Language) {
                        made->m_LeftMinimum = std::max<int>(hyphen->lhmin, entry.m_Left);
                        made->m_RightMinimum = std::max<int>(hyphen->rhmin, entry.m_Right);
                    }
                }
            }
        }
        found = made.get();
    }
    byLanguage.emplace(tag, found);
    return found;
}

Hyphenator::~Hyphenator()
{
    if (m_Dictionary) {
        hnj_hyphen_free(m_Dictionary->m_Hyphen);
        delete m_Dictionary;
    }
}

void Hyphenator::Hyphenate(std::u16string_view word, std::vector<std::uint16_t> & positions) const
{
    constexpr std::size_t longest = 200; // Longer strings are no words.
    if (word.size() < static_cast<std::size_t>(m_LeftMinimum + m_RightMinimum) || word.size() > longest) {
        return;
    }
    // One letter at a time, so that offsets in the lower-cased word lead back to the text. A letter whose lower case
    // is longer stays as it is.
    Dictionary const & dictionary = *m_Dictionary;
    std::string bytes;
    std::vector<std::uint16_t> starts; // Offset in the word of each letter of the dictionary's alphabet.
    bytes.reserve(word.size() * 3);
    std::size_t const length = word.size();
    for (std::size_t i = 0; i < length;) {
        std::size_t const start = i;
        UChar32 character = 0;
        U16_NEXT(word.data(), i, length, character);
        if (character == 0x2019) {
            character = '\'';
        }
        UChar32 const lower = u_tolower(character);
        if (dictionary.m_Utf8) {
            char units[4];
            int count = 0;
            UBool failed = false;
            U8_APPEND(units, count, 4, lower, failed);
            if (failed) {
                return;
            }
            bytes.append(units, static_cast<std::size_t>(count));
        } else {
            char byte = lower < 0x10000 ? dictionary.m_Bytes[static_cast<std::size_t>(lower)] : '\0';
            if (!byte && character == '\'') {
                byte = '\'';
            }
            if (!byte) {
                // Polytonic Greek in a monotonic dictionary: breathings and accents do not matter to the syllables.
                UErrorCode error = U_ZERO_ERROR;
                UNormalizer2 const * normaliser = unorm2_getNFDInstance(&error);
                UChar decomposed[8];
                int const count = unorm2_getDecomposition(normaliser, lower, decomposed, 8, &error);
                if (U_FAILURE(error) || count < 1) {
                    return;
                }
                byte = dictionary.m_Bytes[decomposed[0]];
                if (!byte) {
                    return;
                }
            }
            bytes.push_back(byte);
        }
        starts.push_back(static_cast<std::uint16_t>(start));
    }

    std::vector<char> marks(bytes.size() + 5, 0);
    char ** replacements = nullptr;
    int * replacementPositions = nullptr;
    int * replacementCuts = nullptr;
    int const failed = hnj_hyphen_hyphenate3(dictionary.m_Hyphen, bytes.c_str(), static_cast<int>(bytes.size()),
                                             marks.data(), nullptr, &replacements, &replacementPositions,
                                             &replacementCuts, m_LeftMinimum, m_RightMinimum, 2, 2);
    // With replacements, a break would change the spelling ("Schiffahrt" to "Schiff-fahrt"): such places are left out.
    if (!failed) {
        int const letters = static_cast<int>(starts.size());
        for (int i = m_LeftMinimum - 1; i + m_RightMinimum < letters; ++i) {
            bool const changesSpelling = replacements && replacements[i];
            if ((marks[static_cast<std::size_t>(i)] & 1) && !changesSpelling) {
                positions.push_back(starts[static_cast<std::size_t>(i) + 1]);
            }
        }
    }
    if (replacements) {
        for (std::size_t i = 0; i < bytes.size(); ++i) {
            std::free(replacements[i]);
        }
        std::free(replacements);
    }
    std::free(replacementPositions);
    std::free(replacementCuts);
}

}
