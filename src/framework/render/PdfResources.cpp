#include "framework/render/PdfResources.h"

namespace Renderer::RenderTree
{

PdfFont & PdfResources::FontFor(Kernel::Counted<Typeset::FontFace const> const & face, std::uint32_t & number)
{
    auto const [place, added] =
        m_FontNumbers.try_emplace(face.Get(), static_cast<std::uint32_t>(m_Fonts.size()));
    if (added) {
        m_Fonts.push_back(std::make_unique<PdfFont>(face, "F" + std::to_string(m_Fonts.size() + 1)));
    }
    number = place->second;
    return *m_Fonts[number];
}

std::uint32_t PdfResources::AddImage(PdfImage image)
{
    m_Images.push_back(std::move(image));
    return static_cast<std::uint32_t>(m_Images.size() - 1);
}

std::uint32_t PdfResources::AddForm(PdfForm form)
{
    m_Forms.push_back(std::move(form));
    return static_cast<std::uint32_t>(m_Forms.size() - 1);
}

std::uint32_t PdfResources::AddProfile(Kernel::Consolidated<Raster::ICCProfile> const & profile)
{
    for (std::size_t i = 0; i < m_Profiles.size(); ++i) {
        if (m_Profiles[i]->IsSame(*profile)) {
            return static_cast<std::uint32_t>(i);
        }
    }
    m_Profiles.push_back(profile);
    return static_cast<std::uint32_t>(m_Profiles.size() - 1);
}

std::uint32_t PdfResources::AddUses(PdfUses const & uses)
{
    auto const [place, added] = m_UseNumbers.try_emplace(uses, static_cast<std::uint32_t>(m_Uses.size()));
    if (added) {
        m_Uses.push_back(&place->first);
    }
    return place->second;
}

}
