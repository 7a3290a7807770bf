#include "framework/document/Swatches.h"

Raster::Colour const * Swatches::Find(String const & name) const
{
    for (Swatch const & swatch : m_Swatches) {
        if (name == swatch.m_Name) {
            return &swatch.m_Colour;
        }
    }
    return nullptr;
}
