#include "framework/typeset/FontCatalogue.h"

#include "framework/kernel/FileSystem.h"
#include "framework/kernel/PathTraitsDos.h"

#include <fontconfig/fontconfig.h>

#include <algorithm>
#include <cmath>
#include <cstdlib>
#include <tuple>

namespace Typeset
{

namespace
{

/// Drawn sizes are part of the family name in some fonts ("EB Garamond 08"), and told by no table.
double OpticalSizeOf(std::vector<std::string> const & families)
{
    for (std::string const & family : families) {
        std::size_t const space = family.rfind(' ');
        if (space == std::string::npos || family.find_first_not_of("0123456789", space + 1) != std::string::npos) {
            continue;
        }
        double const size = std::atof(family.c_str() + space + 1);
        bool const isMember = std::find(families.begin(), families.end(), family.substr(0, space)) != families.end();
        if (isMember && size >= 4 && size <= 144) {
            return size;
        }
    }
    return 0;
}

/// False for what cannot be set: bitmaps, Type 1, instances of variable fonts.
bool ReadEntry(FcPattern * pattern, CatalogueEntry & entry)
{
    FcChar8 * text = nullptr;
    FcBool scalable = FcTrue;
    FcBool variable = FcFalse;
    int index = 0;
    FcPatternGetBool(pattern, FC_SCALABLE, 0, &scalable);
    FcPatternGetBool(pattern, FC_VARIABLE, 0, &variable);
    FcPatternGetInteger(pattern, FC_INDEX, 0, &index);
    if (!scalable || variable || index >> 16 != 0 || FcPatternGetString(pattern, FC_FILE, 0, &text) != FcResultMatch) {
        return false;
    }
    entry.m_Path = String(reinterpret_cast<char const *>(text));
    if (FcPatternGetString(pattern, FC_FONTFORMAT, 0, &text) == FcResultMatch) {
        std::string_view const format(reinterpret_cast<char const *>(text));
        if (format != "TrueType" && format != "CFF") {
            return false;
        }
    }
    entry.m_Index = static_cast<unsigned>(index);
    for (int i = 0; FcPatternGetString(pattern, FC_FAMILY, i, &text) == FcResultMatch; ++i) {
        entry.m_Families.push_back(LowerCaseName(reinterpret_cast<char const *>(text)));
    }
    int weight = FC_WEIGHT_REGULAR;
    int slant = FC_SLANT_ROMAN;
    FcPatternGetInteger(pattern, FC_WEIGHT, 0, &weight);
    FcPatternGetInteger(pattern, FC_SLANT, 0, &slant);
    FcPatternGetInteger(pattern, FC_WIDTH, 0, &entry.m_Width);
    entry.m_Weight = FcWeightToOpenType(weight);
    entry.m_Italic = slant != FC_SLANT_ROMAN;
    entry.m_OpticalSize = OpticalSizeOf(entry.m_Families);
    return true;
}

/// `config` may be null for the machine's own.
std::vector<CatalogueEntry> List(FcConfig * config, FcPattern * pattern)
{
    std::vector<CatalogueEntry> entries;
    FcObjectSet * fields = FcObjectSetBuild(FC_FILE, FC_INDEX, FC_FAMILY, FC_WEIGHT, FC_SLANT, FC_WIDTH, FC_SCALABLE,
                                            FC_VARIABLE, FC_FONTFORMAT, static_cast<char const *>(nullptr));
    if (FcFontSet * set = FcFontList(config, pattern, fields)) {
        for (int i = 0; i < set->nfont; ++i) {
            CatalogueEntry entry;
            if (ReadEntry(set->fonts[i], entry)) {
                entries.push_back(std::move(entry));
            }
        }
        FcFontSetDestroy(set);
    }
    FcObjectSetDestroy(fields);
    std::sort(entries.begin(), entries.end(), [](CatalogueEntry const & a, CatalogueEntry const & b) {
        return std::tie(a.m_Path, a.m_Index) < std::tie(b.m_Path, b.m_Index);
    });
    return entries;
}

/// Rank of a weight against the wanted one: the less, the nearer. Lighter faces are looked at first for light text,
/// bolder ones for bold text, and 400 and 500 stand in for each other.
int WeightRank(int weight, int wanted)
{
    if (weight == wanted) {
        return 0;
    }
    bool const lighterFirst = wanted <= 500;
    if (wanted >= 400 && wanted <= 500 && weight > wanted && weight <= 500) {
        return weight - wanted;
    }
    bool const isPreferredSide = lighterFirst ? weight < wanted : weight > wanted;
    return std::abs(weight - wanted) + (isPreferredSide ? 1000 : 2000);
}

}

FontCatalogue::FontCatalogue()
{
    FcPattern * all = FcPatternCreate();
    m_Entries = List(nullptr, all);
    FcPatternDestroy(all);
}

FontCatalogue::FontCatalogue(String const & folder)
{
    FcConfig * const config = FcConfigCreate();
    std::vector<String> names;
    Kernel::FileSystem::ListFolder(folder, names);
    for (String const & name : names) {
        // One by one: for a folder as a whole fontconfig wants a place for its cache, and complains of having none.
        String const path = Kernel::PathTraitsDos::Append(folder, name);
        if (!Kernel::FileSystem::IsFolder(path)) {
            FcConfigAppFontAddFile(config, reinterpret_cast<FcChar8 const *>(path.c_str()));
        }
    }
    FcPattern * const all = FcPatternCreate();
    m_Entries = List(config, all);
    FcPatternDestroy(all);
    FcConfigDestroy(config);
}

CatalogueEntry const * FontCatalogue::Find(std::string_view family, int weight, bool italic, double size) const
{
    std::string const name = LowerCaseName(family);
    CatalogueEntry const * best = nullptr;
    std::tuple<int, bool, int, double> bestRank;
    for (CatalogueEntry const & entry : m_Entries) {
        if (std::find(entry.m_Families.begin(), entry.m_Families.end(), name) == entry.m_Families.end()) {
            continue;
        }
        // Optical sizes are compared by ratio: 8 to 12 points is as far as 12 to 18.
        double const opticalDistance =
            entry.m_OpticalSize > 0 ? std::abs(std::log(entry.m_OpticalSize / std::max(size, 1.0))) : 0;
        std::tuple const rank(std::abs(entry.m_Width - 100), entry.m_Italic != italic,
                              WeightRank(entry.m_Weight, weight), opticalDistance);
        if (!best || rank < bestRank) {
            best = &entry;
            bestRank = rank;
        }
    }
    return best;
}

std::vector<CatalogueEntry> FontCatalogue::FindWithCharacter(char32_t character)
{
    FcPattern * pattern = FcPatternCreate();
    FcCharSet * characters = FcCharSetCreate();
    FcCharSetAddChar(characters, character);
    FcPatternAddCharSet(pattern, FC_CHARSET, characters);
    std::vector<CatalogueEntry> entries = List(nullptr, pattern);
    FcCharSetDestroy(characters);
    FcPatternDestroy(pattern);
    std::stable_sort(entries.begin(), entries.end(), [](CatalogueEntry const & a, CatalogueEntry const & b) {
        int const aWeight = WeightRank(a.m_Weight, 400);
        int const bWeight = WeightRank(b.m_Weight, 400);
        return std::tie(a.m_Italic, aWeight) < std::tie(b.m_Italic, bWeight);
    });
    return entries;
}

std::string LowerCaseName(std::string_view name)
{
    std::string lower(name);
    for (char & character : lower) {
        if (character >= 'A' && character <= 'Z') {
            character = static_cast<char>(character - 'A' + 'a');
        }
    }
    return lower;
}

}
