#include "framework/typeset/FontLibrary.h"

#include "framework/typeset/FontCatalogue.h"

#include <sys/stat.h>
#include <unicode/uscript.h>

#include <algorithm>
#include <array>
#include <cstdlib>
#include <string>
#include <string_view>

namespace Typeset
{

namespace
{

constexpr double usualSize = 11;

// What stands for a family that is not installed, and for the generic names.
constexpr std::array serifs{"Noto Serif", "Liberation Serif", "Linux Libertine O", "EB Garamond", "DejaVu Serif"};
constexpr std::array sanses{"Noto Sans", "Liberation Sans", "DejaVu Sans"};
constexpr std::array monospaced{"DejaVu Sans Mono", "Liberation Mono", "Noto Sans Mono"};

enum class Genre
{
    Serif,
    Sans,
    Monospaced
};

bool Contains(std::string_view text, std::string_view part) { return text.find(part) != std::string_view::npos; }

/// What sort of face a name stands for, as far as names tell.
Genre GuessGenre(std::string_view lowerName)
{
    for (char const * part : {"mono", "code", "courier", "consol", "typewriter", "terminal"}) {
        if (Contains(lowerName, part)) {
            return Genre::Monospaced;
        }
    }
    for (char const * part : {"sans", "arial", "helvetica", "gothic", "grotes", "verdana", "calibri", "biolinum"}) {
        if (Contains(lowerName, part)) {
            return Genre::Sans;
        }
    }
    return Genre::Serif;
}

std::span<char const * const> FamiliesOf(Genre genre)
{
    switch (genre) {
    case Genre::Sans:
        return sanses;
    case Genre::Monospaced:
        return monospaced;
    case Genre::Serif:
        break;
    }
    return serifs;
}

bool IsGeneric(std::string_view lowerName)
{
    return lowerName == "serif" || lowerName == "sans-serif" || lowerName == "sans" || lowerName == "monospace";
}

/// The regional form of Chinese characters, as the families are named.
char const * RegionOfHan(std::string_view language)
{
    if (language.starts_with("ja")) {
        return "JP";
    }
    if (language.starts_with("ko")) {
        return "KR";
    }
    if (Contains(language, "HK") || Contains(language, "MO")) {
        return "HK";
    }
    if (Contains(language, "Hant") || Contains(language, "TW")) {
        return "TC";
    }
    return "SC";
}

/// Families to look into for a character, best first.
std::vector<std::string> FallbackFamilies(char32_t character, std::string_view language, bool serif)
{
    std::vector<std::string> families;
    auto const addBoth = [&](std::string const & suffix) {
        for (char const * stem : {serif ? "Noto Serif" : "Noto Sans", serif ? "Noto Sans" : "Noto Serif"}) {
            families.push_back(stem + suffix);
        }
    };
    UErrorCode error = U_ZERO_ERROR;
    UScriptCode const script = uscript_getScript(static_cast<UChar32>(character), &error);
    switch (script) {
    case USCRIPT_HAN:
    case USCRIPT_HIRAGANA:
    case USCRIPT_KATAKANA:
    case USCRIPT_BOPOMOFO:
        // Kana tell the language where the text does not.
        addBoth(std::string(" CJK ") + (script == USCRIPT_HAN || !language.empty() ? RegionOfHan(language) : "JP"));
        break;
    case USCRIPT_HANGUL:
        addBoth(" CJK KR");
        break;
    case USCRIPT_ARABIC:
        families.insert(families.end(), {"Noto Naskh Arabic", "Noto Sans Arabic"});
        break;
    case USCRIPT_COMMON:
    case USCRIPT_INHERITED:
    case USCRIPT_INVALID_CODE:
        if (character >= 0x2E80 && character < 0xFFF0) {
            addBoth(std::string(" CJK ") + RegionOfHan(language));
        }
        break;
    case USCRIPT_LATIN:
    case USCRIPT_GREEK:
    case USCRIPT_CYRILLIC:
        break;
    default:
        if (char const * name = uscript_getName(script)) {
            std::string spaced(name);
            std::replace(spaced.begin(), spaced.end(), '_', ' ');
            addBoth(" " + spaced);
        }
    }
    addBoth("");
    families.insert(families.end(), {"Noto Sans Math", "Noto Sans Symbols", "Noto Sans Symbols2", "Noto Music"});
    families.insert(families.end(), {serif ? "DejaVu Serif" : "DejaVu Sans", serif ? "DejaVu Sans" : "DejaVu Serif"});
    addBoth(std::string(" CJK ") + RegionOfHan(language));
    return families;
}

}

FontLibrary::FontLibrary() = default;
FontLibrary::~FontLibrary() = default;

FontLibrary & FontLibrary::GetInstance()
{
    // Never destroyed: faces are used by other statics to the very end of the process.
    static FontLibrary & instance = *new FontLibrary;
    return instance;
}

FontCatalogue & FontLibrary::GetCatalogue()
{
    if (!m_Catalogue) {
        m_Catalogue = std::make_unique<FontCatalogue>();
    }
    return *m_Catalogue;
}

void FontLibrary::AddFolder(String const & folder)
{
    struct stat status {};
    if (stat(folder.c_str(), &status) != 0 || !S_ISDIR(status.st_mode)) {
        return;
    }
    std::lock_guard const guard(m_Lock);
    if (m_Folders.try_emplace(folder).second) {
        // What was missing may be here.
        std::erase_if(m_Matches, [](auto const & match) { return !match.second.m_FamilyFound; });
        std::erase_if(m_Fallbacks, [](auto const & fallback) { return !fallback.second; });
    }
}

template <typename TLook>
Kernel::Counted<FontFace const> FontLibrary::LookInFolders(TLook const & look)
{
    for (auto & [folder, catalogue] : m_Folders) {
        if (!catalogue) {
            catalogue = std::make_unique<FontCatalogue>(folder);
        }
        if (Kernel::Counted<FontFace const> face = look(*catalogue)) {
            return face;
        }
    }
    return nullptr;
}

Kernel::Counted<FontFace const> FontLibrary::LoadLocked(String const & path, unsigned index)
{
    struct stat status {};
    if (stat(path.c_str(), &status) != 0 || !S_ISREG(status.st_mode)) {
        return nullptr;
    }
    FileKey const key{status.st_dev, status.st_ino,
                      static_cast<std::int64_t>(status.st_mtim.tv_sec) * 1'000'000'000 + status.st_mtim.tv_nsec,
                      status.st_size, index};
    if (auto const found = m_ByFile.find(key); found != m_ByFile.end()) {
        return found->second;
    }
    Kernel::Counted<FontFace const> face = FontFace::Load(path, index);
    if (face) {
        // A copy of a file that is already in use is the same face.
        face = m_ByHash.try_emplace({face->GetHash(), index}, face).first->second;
    }
    m_ByFile.emplace(key, face);
    return face;
}

Kernel::Counted<FontFace const> FontLibrary::FromFile(String const & path, unsigned index)
{
    std::lock_guard const guard(m_Lock);
    return LoadLocked(path, index);
}

Kernel::Counted<FontFace const> FontLibrary::FromFileAndHash(String const & path, unsigned index,
                                                             ContentHash const & hash)
{
    std::lock_guard const guard(m_Lock);
    if (auto const known = m_ByHash.find({hash, index}); known != m_ByHash.end()) {
        return known->second;
    }
    if (auto face = LoadLocked(path, index); face && face->GetHash() == hash) {
        return face;
    }
    // Moved or upgraded: only files of the same name can be the same font under another path.
    std::string_view const name = path.View().substr(path.View().rfind('/') + 1);
    auto const look = [&](FontCatalogue const & catalogue) -> Kernel::Counted<FontFace const> {
        for (CatalogueEntry const & entry : catalogue.GetEntries()) {
            if (entry.m_Index == index && entry.m_Path.View().ends_with(name) && entry.m_Path != path) {
                if (auto face = LoadLocked(entry.m_Path, index); face && face->GetHash() == hash) {
                    return face;
                }
            }
        }
        return nullptr;
    };
    if (auto face = look(GetCatalogue())) {
        return face;
    }
    return LookInFolders(look);
}

FontMatch FontLibrary::FindLocked(String const & family, int weight, bool italic, double size)
{
    size = size > 0 ? size : usualSize;
    auto const key = std::make_tuple(LowerCaseName(family), weight, italic, size);
    if (auto const known = m_Matches.find(key); known != m_Matches.end()) {
        return known->second;
    }
    std::string const & name = std::get<0>(key);
    auto const look = [&](std::string_view wanted) {
        FontMatch match;
        if (CatalogueEntry const * entry = GetCatalogue().Find(wanted, weight, italic, size)) {
            match.m_Face = LoadLocked(entry->m_Path, entry->m_Index);
            match.m_StyleFound = entry->m_Italic == italic && std::abs(entry->m_Weight - weight) <= 100;
        }
        return match;
    };

    FontMatch match;
    if (!IsGeneric(name)) {
        match = look(name);
        if (!match.m_Face) {
            match.m_Face = LookInFolders([&](FontCatalogue const & catalogue) -> Kernel::Counted<FontFace const> {
                CatalogueEntry const * entry = catalogue.Find(name, weight, italic, size);
                if (entry) {
                    match.m_StyleFound = entry->m_Italic == italic && std::abs(entry->m_Weight - weight) <= 100;
                }
                return entry ? LoadLocked(entry->m_Path, entry->m_Index) : nullptr;
            });
        }
    }
    if (!match.m_Face) {
        for (char const * substitute : FamiliesOf(GuessGenre(name))) {
            match = look(substitute);
            if (match.m_Face) {
                break;
            }
        }
        for (CatalogueEntry const & entry : GetCatalogue().GetEntries()) {
            if (match.m_Face) {
                break;
            }
            match.m_Face = LoadLocked(entry.m_Path, entry.m_Index);
            match.m_StyleFound = false;
        }
        match.m_FamilyFound = IsGeneric(name) && match.m_Face;
    }
    m_Matches.emplace(key, match);
    return match;
}

FontMatch FontLibrary::Find(String const & family, int weight, bool italic, double size)
{
    std::lock_guard const guard(m_Lock);
    return FindLocked(family, weight, italic, size);
}

FontMatch FontLibrary::Find(std::span<String const> families, int weight, bool italic, double size)
{
    std::lock_guard const guard(m_Lock);
    if (families.empty()) {
        return FindLocked("serif", weight, italic, size);
    }
    FontMatch const first = FindLocked(families.front(), weight, italic, size);
    if (first.m_FamilyFound) {
        return first;
    }
    for (String const & family : families.subspan(1)) {
        FontMatch match = FindLocked(family, weight, italic, size);
        if (match.m_FamilyFound) {
            match.m_FamilyFound = false;
            return match;
        }
    }
    return first;
}

Kernel::Counted<FontFace const> FontLibrary::FindFallback(char32_t character, String const & language,
                                                          FontFace const & beside)
{
    bool const serif = GuessGenre(LowerCaseName(beside.GetFamily())) == Genre::Serif;
    int const weight = beside.GetWeight();
    auto const key = std::make_tuple(character, language.ToStd(), serif, weight, beside.IsItalic());

    std::lock_guard const guard(m_Lock);
    if (auto const known = m_Fallbacks.find(key); known != m_Fallbacks.end()) {
        return known->second;
    }
    Kernel::Counted<FontFace const> found;
    for (std::string const & family : FallbackFamilies(character, language, serif)) {
        CatalogueEntry const * entry = GetCatalogue().Find(family, weight, beside.IsItalic(), usualSize);
        Kernel::Counted<FontFace const> const face = entry ? LoadLocked(entry->m_Path, entry->m_Index) : nullptr;
        if (face && face->HasGlyph(character)) {
            found = face;
            break;
        }
    }
    if (!found) {
        for (CatalogueEntry const & entry : FontCatalogue::FindWithCharacter(character)) {
            Kernel::Counted<FontFace const> const face = LoadLocked(entry.m_Path, entry.m_Index);
            if (face && face->HasGlyph(character)) {
                found = face;
                break;
            }
        }
    }
    if (!found) {
        found = LookInFolders([&](FontCatalogue const & catalogue) -> Kernel::Counted<FontFace const> {
            for (CatalogueEntry const & entry : catalogue.GetEntries()) {
                Kernel::Counted<FontFace const> face = LoadLocked(entry.m_Path, entry.m_Index);
                if (face && face->HasGlyph(character)) {
                    return face;
                }
            }
            return nullptr;
        });
    }
    m_Fallbacks.emplace(key, found);
    return found;
}

}
