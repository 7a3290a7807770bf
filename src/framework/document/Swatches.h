#pragma once

#include "framework/kernel/Countable.h"
#include "framework/kernel/Counted.h"
#include "framework/kernel/StringT.h"
#include "framework/raster/Colour.h"

#include <vector>

/// A colour with a name.
struct Swatch
{
    String m_Name;
    Raster::Colour m_Colour;

    friend bool operator==(Swatch const &, Swatch const &) = default;
};

/// The named colours of a document, in their order, each name once. An immutable value.
class Swatches : public virtual Kernel::Countable
{
public:
    explicit Swatches(std::vector<Swatch> swatches) : m_Swatches(std::move(swatches)) {}

    [[nodiscard]] std::vector<Swatch> const & GetAll() const { return m_Swatches; }
    /// Null if no swatch has the name.
    [[nodiscard]] Raster::Colour const * Find(String const & name) const;

private:
    std::vector<Swatch> m_Swatches;
};
