#include "import/SmartTypography.h"

#include <algorithm>
#include <array>
#include <unicode/uchar.h>

namespace Import
{

namespace
{

struct QuoteCustom
{
    std::string_view m_Language;
    std::u16string_view m_Open;
    std::u16string_view m_Close;
    std::u16string_view m_InnerOpen;
    std::u16string_view m_InnerClose;
};

/// Longer tags come before the languages that they refine. Source: Unicode CLDR, "delimiters" of each locale.
constexpr std::array g_Customs{
    QuoteCustom{"en", u"\u201C", u"\u201D", u"\u2018", u"\u2019"},
    QuoteCustom{"de-ch", u"\u00AB", u"\u00BB", u"\u2039", u"\u203A"},
    QuoteCustom{"de", u"\u201E", u"\u201C", u"\u201A", u"\u2018"},
    QuoteCustom{"fr", u"\u00AB\u202F", u"\u202F\u00BB", u"\u201C", u"\u201D"},
    QuoteCustom{"ru", u"\u00AB", u"\u00BB", u"\u201E", u"\u201C"},
    QuoteCustom{"uk", u"\u00AB", u"\u00BB", u"\u201E", u"\u201C"},
    QuoteCustom{"be", u"\u00AB", u"\u00BB", u"\u201E", u"\u201C"},
    QuoteCustom{"bg", u"\u201E", u"\u201C", u"\u201A", u"\u2018"},
    QuoteCustom{"cs", u"\u201E", u"\u201C", u"\u201A", u"\u2018"},
    QuoteCustom{"sk", u"\u201E", u"\u201C", u"\u201A", u"\u2018"},
    QuoteCustom{"pl", u"\u201E", u"\u201D", u"\u00AB", u"\u00BB"},
    QuoteCustom{"hu", u"\u201E", u"\u201D", u"\u00BB", u"\u00AB"},
    QuoteCustom{"ro", u"\u201E", u"\u201D", u"\u00AB", u"\u00BB"},
    QuoteCustom{"nl", u"\u201C", u"\u201D", u"\u2018", u"\u2019"},
    QuoteCustom{"es", u"\u00AB", u"\u00BB", u"\u201C", u"\u201D"},
    QuoteCustom{"it", u"\u00AB", u"\u00BB", u"\u201C", u"\u201D"},
    QuoteCustom{"pt-br", u"\u201C", u"\u201D", u"\u2018", u"\u2019"},
    QuoteCustom{"pt", u"\u00AB", u"\u00BB", u"\u201C", u"\u201D"},
    QuoteCustom{"el", u"\u00AB", u"\u00BB", u"\u201C", u"\u201D"},
    QuoteCustom{"da", u"\u201D", u"\u201D", u"\u2019", u"\u2019"},
    QuoteCustom{"sv", u"\u201D", u"\u201D", u"\u2019", u"\u2019"},
    QuoteCustom{"fi", u"\u201D", u"\u201D", u"\u2019", u"\u2019"},
    QuoteCustom{"nb", u"\u00AB", u"\u00BB", u"\u2018", u"\u2019"},
    QuoteCustom{"no", u"\u00AB", u"\u00BB", u"\u2018", u"\u2019"},
};

constexpr std::u16string_view g_Apostrophe = u"\u2019";

bool IsDigit(char16_t c)
{
    return u'0' <= c && c <= u'9';
}
bool IsWord(char16_t c)
{
    return u_isalnum(c) || (0xD800 <= c && c < 0xE000);
}
bool IsSpace(char16_t c)
{
    return u_isUWhiteSpace(c) || 0x2028 == c;
}

/// Whether a quotation mark after `c` can open: after space, brackets, dashes and other opening marks.
bool IsBeforeOpening(char16_t c)
{
    switch (u_charType(c)) {
    case U_START_PUNCTUATION:
    case U_INITIAL_PUNCTUATION:
    case U_DASH_PUNCTUATION:
        return true;
    default:
        return IsSpace(c) || u'/' == c || u'"' == c || u'\'' == c || u'=' == c;
    }
}

/// Words that begin with an apostrophe in English, and shortened years.
bool IsElision(std::u16string_view rest)
{
    if (!rest.empty() && IsDigit(rest.front())) {
        return true;
    }
    for (std::u16string_view word :
         {u"tis", u"twas", u"twere", u"twill", u"twould", u"em", u"til", u"n", u"cause", u"bout"}) {
        if (rest.size() < word.size() || (word.size() < rest.size() && IsWord(rest[word.size()]))) {
            continue;
        }
        bool isSame = true;
        for (std::size_t at = 0; at < word.size(); ++at) {
            isSame = isSame && u_tolower(rest[at]) == static_cast<UChar32>(word[at]);
        }
        if (isSame) {
            return true;
        }
    }
    return false;
}

std::size_t RunLength(std::u16string_view text, std::size_t at)
{
    std::size_t end = at;
    while (end < text.size() && text[end] == text[at]) {
        ++end;
    }
    return end - at;
}

/// Whether the number that starts at `start` is a label after its noun, such as "Listing 1-2" or "Figure 3-4": a
/// capitalised word in the singular. Where all nouns are capitalised, only those that captions have: pages and years have
/// ranges.
bool IsLabel(std::u16string_view text, std::size_t start, bool capitalisesNouns)
{
    if (start < 2 || !(u' ' == text[start - 1] || u'\u00A0' == text[start - 1] || u'\n' == text[start - 1])) {
        return false;
    }
    std::size_t const end = start - 1;
    std::size_t first = end;
    while (0 < first && u_isalpha(text[first - 1])) {
        --first;
    }
    std::u16string_view const word = text.substr(first, end - first);
    if (capitalisesNouns) {
        constexpr std::array<std::u16string_view, 7> labels{u"Abbildung", u"Beispiel", u"Bild",   u"Formel",
                                                            u"Gleichung", u"Listing",  u"Tabelle"};
        return labels.end() != std::find(labels.begin(), labels.end(), word);
    }
    return 4 <= word.size() && u_isupper(word.front()) && u's' != word.back();
}

/// Whether the hyphen at `at` stands between two numbers that make a range: "12-34", "1939-45", but neither part of a
/// date or number with more hyphens, nor a falling pair.
bool IsRangeHyphen(std::u16string_view text, std::size_t at, bool capitalisesNouns)
{
    std::size_t start = at;
    while (0 < start && IsDigit(text[start - 1])) {
        --start;
    }
    std::size_t end = at + 1;
    while (end < text.size() && IsDigit(text[end])) {
        ++end;
    }
    std::u16string_view const first = text.substr(start, at - start);
    std::u16string_view const second = text.substr(at + 1, end - at - 1);
    if (first.empty() || second.empty() || 4 < first.size() || 4 < second.size()) {
        return false;
    }
    auto const joins = [](char16_t c) {
        return IsWord(c) || u'-' == c || u'.' == c || u'/' == c || u'_' == c || u':' == c;
    };
    bool const isBound = 0 < start && joins(text[start - 1]);
    bool const runsOn =
        end < text.size() && (IsWord(text[end]) || u'-' == text[end] || u'/' == text[end] || u'_' == text[end]);
    if (isBound || runsOn || IsLabel(text, start, capitalisesNouns)) {
        return false;
    }
    // A shorter second number stands for its last digits, as in "1939-45".
    return second.size() != first.size() || first < second;
}

}

SmartTypography::SmartTypography(std::string_view language)
{
    std::string tag(language);
    for (char & c : tag) {
        c = '_' == c ? '-' : 'A' <= c && c <= 'Z' ? static_cast<char>(c + 32) : c;
    }
    QuoteCustom const * custom = &g_Customs.front();
    for (QuoteCustom const & candidate : g_Customs) {
        std::string_view const name = candidate.m_Language;
        if (tag.starts_with(name) && (tag.size() == name.size() || '-' == tag[name.size()])) {
            custom = &candidate;
            break;
        }
    }
    m_Open = custom->m_Open;
    m_Close = custom->m_Close;
    m_InnerOpen = custom->m_InnerOpen;
    m_InnerClose = custom->m_InnerClose;
    m_IsFrench = "fr" == custom->m_Language;
    m_CapitalisesNouns = "de" == tag || tag.starts_with("de-") || "lb" == tag;
}

std::u16string_view SmartTypography::QuoteFor(std::u16string_view text, std::size_t at) const
{
    bool const isDouble = u'"' == text[at];
    bool const canOpen = 0 == at || IsBeforeOpening(text[at - 1]);
    bool const hasMore = at + 1 < text.size() && !IsSpace(text[at + 1]);
    if (!canOpen || !hasMore) {
        bool const isApostrophe = !isDouble && 0 < at && IsWord(text[at - 1]) && hasMore && IsWord(text[at + 1]);
        return isDouble ? m_Close : isApostrophe ? g_Apostrophe : m_InnerClose;
    }
    if (!isDouble && IsElision(text.substr(at + 1))) {
        return g_Apostrophe;
    }
    return isDouble ? m_Open : m_InnerOpen;
}

std::vector<TextEdit> SmartTypography::FindEdits(std::u16string_view text, std::vector<bool> const & verbatim) const
{
    std::vector<TextEdit> edits;
    auto const replace = [&](std::size_t start, std::size_t length, std::u16string_view by) {
        edits.push_back({static_cast<std::uint32_t>(start), static_cast<std::uint32_t>(length), std::u16string(by)});
    };
    for (std::size_t at = 0; at < text.size(); ++at) {
        if (!verbatim.empty() && verbatim[at]) {
            continue;
        }
        char16_t const c = text[at];
        switch (c) {
        case u'"':
        case u'\'':
            replace(at, 1, QuoteFor(text, at));
            break;
        case u'.': {
            std::size_t const run = RunLength(text, at);
            if (3 == run || 4 == run) {
                replace(at, 3, u"\u2026");
            }
            at += run - 1;
            break;
        }
        case u'-': {
            std::size_t const run = RunLength(text, at);
            bool const isAfterSpace = 0 == at || IsBeforeOpening(text[at - 1]);
            // "--quiet" is the name of a command's option, not a dash.
            bool const isOption = 2 == run && isAfterSpace && at + 2 < text.size() && u_isalpha(text[at + 2]);
            if (1 == run && IsRangeHyphen(text, at, m_CapitalisesNouns)) {
                replace(at, 1, u"\u2013");
            } else if (2 == run && !isOption) {
                replace(at, 2, u"\u2013");
            } else if (3 == run) {
                replace(at, 3, u"\u2014");
            }
            at += run - 1;
            break;
        }
        case u' ':
            if (m_IsFrench && at + 1 < text.size() && (verbatim.empty() || !verbatim[at + 1])) {
                char16_t const next = text[at + 1];
                if (u';' == next || u'!' == next || u'?' == next || u'\u00BB' == next) {
                    replace(at, 1, u"\u202F");
                } else if (u':' == next) {
                    replace(at, 1, u"\u00A0");
                } else if (0 < at && u'\u00AB' == text[at - 1]) {
                    replace(at, 1, u"\u202F");
                }
            }
            break;
        default:
            break;
        }
    }
    return edits;
}

}
