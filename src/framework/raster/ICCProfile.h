#pragma once

#include <vector>

#include "framework/kernel/Counted.h"
#include "framework/kernel/Serialisable.h"
#include "framework/kernel/StringT.h"
#include "framework/raster/Format.h"

namespace Raster
{

/// A colour profile (ICC.1): immutable, shared by `Kernel::Consolidated<ICCProfile>`, safe on any thread.
class ICCProfile : public Kernel::SharedSerialisable
{
public:
    /// From the bytes of a profile. Null if they are none that the colour engine can read, or if its space is not grey,
    /// RGB, CMYK or Lab; `reason` then gets a sentence why. A date in the header is kept as it is.
    [[nodiscard]] static Kernel::Consolidated<ICCProfile> FromBytes(std::vector<unsigned char> bytes, String & reason);

    [[nodiscard]] std::vector<unsigned char> const & GetBytes() const { return m_Bytes; }
    [[nodiscard]] ColourSpace GetSpace() const { return m_Space; }
    /// The profile's own name for people, in English, such as "sRGB".
    [[nodiscard]] String const & GetDescription() const { return m_Description; }
    /// A 64-bit hash of the bytes; equal profiles agree in it and in their length.
    [[nodiscard]] std::uint64_t GetHash() const { return m_Hash; }

    /// Same bytes, in whatever objects.
    [[nodiscard]] bool IsSame(ICCProfile const & other) const;

    void Save(Kernel::OutSerialiser & out) const override;
    /// False for bytes that `FromBytes` would refuse.
    bool Load(Kernel::InSerialiser const & in, Kernel::FileStore & store, unsigned short version) override;
    [[nodiscard]] Kernel::ClassProperties const & GetObjectClassProperties() const override;
    [[nodiscard]] static Kernel::ClassProperties const & GetTypeClassProperties();

private:
    static Kernel::ClassProperties const ms_ClassProperties;

    ICCProfile() = default;
    [[nodiscard]] bool Take(std::vector<unsigned char> bytes, String & reason);

    std::vector<unsigned char> m_Bytes;
    ColourSpace m_Space = ColourSpace::None;
    String m_Description;
    std::uint64_t m_Hash = 0;
};

}
