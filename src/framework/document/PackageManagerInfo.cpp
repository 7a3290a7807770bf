#include "framework/document/PackageManagerInfo.h"

#include <algorithm>

void PackageManagerInfo::AddDocument(String const & path)
{
    if (std::find(m_Documents.begin(), m_Documents.end(), path) == m_Documents.end()) {
        m_Documents.push_back(path);
    }
}

void PackageManagerInfo::AddPicture(Picture picture)
{
    if (std::find(m_Pictures.begin(), m_Pictures.end(), picture) == m_Pictures.end()) {
        m_Pictures.push_back(std::move(picture));
    }
}

void PackageManagerInfo::AddFont(Font font)
{
    auto const known = std::find_if(m_Fonts.begin(), m_Fonts.end(), [&font](Font const & other) {
        return font.m_Path.Empty() ? other.m_Path.Empty() && other.m_Family == font.m_Family
                                   : other.m_Path == font.m_Path;
    });
    if (known == m_Fonts.end()) {
        m_Fonts.push_back(std::move(font));
    } else {
        known->m_IsUsed |= font.m_IsUsed;
        // A file may hold several faces: it goes only as a whole.
        known->m_MayCollect &= font.m_MayCollect;
    }
}
