#pragma once

#include "framework/kernel/StringT.h"

#include <string>
#include <string_view>
#include <vector>

namespace Typeset
{

/// One installed face, as fontconfig lists it.
struct CatalogueEntry
{
    std::vector<std::string> m_Families; ///< Lower case.
    String m_Path;
    unsigned m_Index = 0;
    int m_Weight = 400; ///< OpenType weight class.
    int m_Width = 100;  ///< Percent of the normal width.
    double m_OpticalSize = 0; ///< Points for which the face was drawn; 0 = any.
    bool m_Italic = false;
};

/// The scalable faces installed on this machine, or those in one folder, in an order that depends on nothing but their
/// paths. Read once, at construction; immutable.
class FontCatalogue
{
public:
    FontCatalogue();
    explicit FontCatalogue(String const & folder);

    [[nodiscard]] std::vector<CatalogueEntry> const & GetEntries() const noexcept { return m_Entries; }

    /// The face of the family (any case) that comes nearest: normal width first, then slope, then weight (CSS Fonts
    /// 4, 5.2), then optical size, then path. Null if no face has the family name.
    [[nodiscard]] CatalogueEntry const * Find(std::string_view family, int weight, bool italic, double size) const;

    /// Paths and indices of the faces that have the character, ordered: upright before italic, regular before bold,
    /// then by path. Asks fontconfig.
    [[nodiscard]] static std::vector<CatalogueEntry> FindWithCharacter(char32_t character);

private:
    std::vector<CatalogueEntry> m_Entries;
};

/// ASCII lower case, which is what family names are compared in.
[[nodiscard]] std::string LowerCaseName(std::string_view name);

}
