#pragma once

#include <cstdint>

namespace Renderer
{

/// Which way a sheet lies. The numbers are kept by front ends.
enum OrientationEnum : int
{
    OrientationAuto = 0, ///< To be chosen by what goes on the sheet.
    OrientationPortrait = 1,
    OrientationLandscape = 2,
};

/// How the size of what is printed is found.
enum FitTypeEnum : int
{
    FitTypeScale = 0,  ///< The user's scale.
    FitTypeShrink = 1, ///< As large as it is, smaller where the paper is too small.
    FitTypeFill = 2,   ///< As large as the paper allows.
};

}

namespace Geometry
{

/// How a rectangle goes into another one, as the printing of sheets understands it (`Renderer::PlaceOnPaper`).
struct FitRect
{
    /// Flags: one place, at most one way to fit, and `FromOrigin`.
    enum Type : std::uint32_t
    {
        Centre = 0,
        TopLeft = 1,
        TopCentre = 2,
        TopRight = 4,
        MiddleLeft = 8,
        MiddleRight = 16,
        BottomLeft = 32,
        BottomCentre = 64,
        BottomRight = 128,
        PlaceMask = 255,

        /// Scaled so that it just fits, up or down, its shape kept.
        Fill = 0x200,
        /// The same, but never enlarged.
        Shrink = 0x300,
        FitMask = 0x300,

        /// What goes on the paper begins at the sheet's origin, not at the corner of what lies on the sheet: the
        /// distance between the two is a margin, and it is kept behind the content as well.
        FromOrigin = 0x400,
    };
};

}

/// Where a crop mark sits on a sheet, and which way its two lines run.
struct CropMarkPos
{
    /// At the sheet's edge a line has all the room there is; at an inner edge it ends where the next page begins.
    enum Edge : std::uint32_t
    {
        Top = 1,
        InnerTop = 2,
        Bottom = 4,
        InnerBottom = 8,
        Left = 16,
        InnerLeft = 32,
        Right = 64,
        InnerRight = 128,
    };

    /// One vertical edge and one horizontal edge of `Edge`.
    std::uint32_t m_Edges = 0;
    double m_X = 0;
    double m_Y = 0;

    friend bool operator==(CropMarkPos const &, CropMarkPos const &) = default;
};
