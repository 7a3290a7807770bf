#pragma once

#include <deque>
#include <map>
#include <memory>
#include <set>
#include <string>
#include <unordered_map>
#include <vector>

#include "framework/kernel/Geometry.h"
#include "framework/raster/ICCProfile.h"
#include "framework/render/PdfFont.h"
#include "framework/render/PdfSpill.h"

namespace Renderer::RenderTree
{

/// Which resources a content stream uses, by number in the file's lists. Sorted, so that equal uses compare equal and
/// pages with the same fonts share one dictionary.
struct PdfUses
{
    std::set<std::uint32_t> m_Fonts;
    std::set<std::uint32_t> m_Images;
    std::set<std::uint32_t> m_Forms;
    /// Placed drawings.
    std::set<std::uint32_t> m_Drawings;
    /// Opacities in thousandths.
    std::set<std::uint32_t> m_Opacities;
    bool m_Lab = false;

    void Clear() { *this = PdfUses(); }
    friend auto operator<=>(PdfUses const &, PdfUses const &) = default;
};

/// An image XObject whose data lie in the spill.
struct PdfImage
{
    int m_Width = 0;
    int m_Height = 0;
    /// The stream dictionary's entries besides size, length and soft mask, as PDF text.
    std::string m_Entries;
    /// A profile's number in the file plus 1, if the colour space is that profile; `m_Entries` then names none.
    std::uint32_t m_Profile = 0;
    SpillRange m_Data;
    /// Another image's number plus 1.
    std::uint32_t m_SoftMask = 0;
};

/// A form XObject: a group drawn as one picture, or a page that sheets show.
struct PdfForm
{
    /// Extent in its own coordinates, y up: top is the greater number.
    Kernel::Rect m_Bounds{-16000, 16000, 16000, -16000};
    /// Composed by itself before it goes on what lies beneath.
    bool m_IsGroup = true;
    SpillRange m_Data;
    std::uint32_t m_Uses = 0;
};

/// What the pages of one file share.
class PdfResources
{
public:
    PdfFont & FontFor(Kernel::Counted<Typeset::FontFace const> const & face, std::uint32_t & number);
    [[nodiscard]] std::vector<std::unique_ptr<PdfFont>> const & GetFonts() const { return m_Fonts; }
    [[nodiscard]] std::vector<std::unique_ptr<PdfFont>> & GetFonts() { return m_Fonts; }

    std::uint32_t AddImage(PdfImage image);
    [[nodiscard]] std::vector<PdfImage> const & GetImages() const { return m_Images; }

    std::uint32_t AddForm(PdfForm form);
    [[nodiscard]] std::deque<PdfForm> const & GetForms() const { return m_Forms; }
    /// Its address stays: a thread beside writes where its content lies.
    [[nodiscard]] PdfForm & GetForm(std::uint32_t number) { return m_Forms[number]; }

    /// The number of a profile; equal ones get one number.
    std::uint32_t AddProfile(Kernel::Consolidated<Raster::ICCProfile> const & profile);
    [[nodiscard]] std::vector<Kernel::Consolidated<Raster::ICCProfile>> const & GetProfiles() const { return m_Profiles; }

    /// The number of a set of uses; equal ones get one number.
    std::uint32_t AddUses(PdfUses const & uses);
    [[nodiscard]] std::vector<PdfUses const *> const & GetUses() const { return m_Uses; }

private:
    std::vector<std::unique_ptr<PdfFont>> m_Fonts;
    std::unordered_map<Typeset::FontFace const *, std::uint32_t> m_FontNumbers;
    std::vector<PdfImage> m_Images;
    std::deque<PdfForm> m_Forms;
    std::vector<Kernel::Consolidated<Raster::ICCProfile>> m_Profiles;
    std::map<PdfUses, std::uint32_t> m_UseNumbers;
    std::vector<PdfUses const *> m_Uses;
};

}
