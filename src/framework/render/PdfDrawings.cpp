#include "framework/render/PdfDrawings.h"

#include "framework/kernel/Format.h"
#include "framework/render/PdfForm.h"

#include <algorithm>
#include <stdexcept>

namespace Renderer::RenderTree
{

namespace
{

using Handle = QPDFObjectHandle;

bool Contains(Handle array, Handle const & item)
{
    for (int i = 0; array.isArray() && i < array.getArrayNItems(); ++i) {
        if (array.getArrayItem(i).isSameObjectAs(item)) {
            return true;
        }
    }
    return false;
}

}

void PdfDrawings::BeginPage(int page, std::vector<Warning> * warnings)
{
    m_Page = page;
    m_Warnings = warnings;
}

bool PdfDrawings::FormFor(PlacedDrawing const & drawing, std::uint32_t & form)
{
    auto const [place, isNew] =
        m_Known.try_emplace({drawing.GetFileHash().m_High, drawing.GetFileHash().m_Low, drawing.GetPage(),
                             drawing.GetPassword()});
    Known & known = place->second;
    if (isNew && !Take(drawing, known.m_Form, known.m_Problem) &&
        Raster::PictureProblem::Code::None == known.m_Problem.m_Code) {
        Raster::Report(known.m_Problem, Raster::PictureProblem::Code::Corrupt, drawing.GetPath(),
                       Kernel::LocalisedString("can't be read", "Picture"));
    }
    if (Raster::PictureProblem::Code::None != known.m_Problem.m_Code) {
        if (m_Warnings) {
            m_Warnings->push_back(
                {Warning::Code::PictureMissing, m_Page, drawing.GetPath(), known.m_Problem.m_Text});
        }
        return false;
    }
    form = known.m_Form;
    return true;
}

PdfDrawings::OpenFile * PdfDrawings::OpenFor(PlacedDrawing const & drawing, Raster::PictureProblem & problem)
{
    auto const open = std::find_if(m_Files.begin(), m_Files.end(), [&drawing](OpenFile const & file) {
        return file.m_Hash == drawing.GetFileHash();
    });
    if (m_Files.end() != open) {
        return &*open;
    }
    PlacedDrawing::Bytes const bytes = drawing.ReadAsPdf(problem);
    std::unique_ptr<PdfSource> source =
        bytes ? PdfSource::Open(bytes, drawing.GetPath(), drawing.GetPassword(), problem) : nullptr;
    if (!source) {
        return nullptr;
    }
    if (MostOpenFiles <= m_Files.size()) {
        m_Files.pop_front();
    }
    auto copier = std::make_unique<PdfObjectCopier>(m_Objects.GetPdf(), [this](std::string const & data) {
        return m_Objects.SpilledStream(m_Spill.Append(data.data(), data.size()), nullptr);
    });
    m_Files.push_back({drawing.GetFileHash(), std::move(source), std::move(copier)});
    return &m_Files.back();
}

bool PdfDrawings::Take(PlacedDrawing const & drawing, std::uint32_t & form, Raster::PictureProblem & problem)
{
    OpenFile * const file = OpenFor(drawing, problem);
    std::optional<PdfSource::Page> const page =
        file ? file->m_Source->FindPage(drawing.GetPdfPage(), problem) : std::nullopt;
    if (!page) {
        return false;
    }
    try {
        PdfSource::Content const content = file->m_Source->ReadContent(*page);
        bool const isPacked = !Handle(content.m_Filter).isNull();
        std::string_view const data =
            isPacked ? std::string_view(content.m_Bytes)
                     : m_Deflater.Compress(content.m_Bytes, PdfCompressor::Deflater::Effort::Quick);
        Handle stream = m_Objects.SpilledStream(m_Spill.Append(data.data(), data.size()),
                                                isPacked ? nullptr : "/FlateDecode");
        bool const isGroup = MakeForm(*page, content, *file->m_Copier, stream);
        TakeLayers(*file);
        m_Forms.push_back({stream, isGroup});
        form = static_cast<std::uint32_t>(m_Forms.size() - 1);
    } catch (std::exception const & fault) {
        Raster::Report(problem, Raster::PictureProblem::Code::Corrupt, drawing.GetPath(),
                       Kernel::LocalisedString("is damaged (%1)", "Picture"), String(fault.what()));
        return false;
    }
    if (std::string const repaired = file->m_Source->TakeWarning(); !repaired.empty() && m_Warnings) {
        m_Warnings->push_back(
            {Warning::Code::PictureRepaired, m_Page, drawing.GetPath(),
             Kernel::Format(Kernel::LocalisedString("The picture %1 is damaged and was repaired (%2); "
                                                    "look at it in the output.",
                                                    "Picture"),
                            drawing.GetPath(), repaired)});
    }
    return true;
}

void PdfDrawings::TakeLayers(OpenFile & file)
{
    Handle properties = file.m_Source->GetPdf().getRoot().getKey("/OCProperties");
    Handle groups = properties.isDictionary() ? properties.getKey("/OCGs") : Handle::newNull();
    Handle settings = properties.isDictionary() ? properties.getKey("/D") : Handle::newNull();
    if (!groups.isArray() || !settings.isDictionary()) {
        return;
    }
    bool const isHiddenByDefault = settings.getKey("/BaseState").isNameAndEquals("/OFF");
    for (int i = 0; i < groups.getArrayNItems(); ++i) {
        Handle const group = groups.getArrayItem(i);
        Handle const copy = file.m_Copier->Find(group);
        bool const isKnown = std::any_of(m_Layers.begin(), m_Layers.end(),
                                         [&copy](Handle const & layer) { return layer.isSameObjectAs(copy); });
        if (Handle(copy).isNull() || isKnown) {
            continue;
        }
        m_Layers.push_back(copy);
        if (isHiddenByDefault ? !Contains(settings.getKey("/ON"), group) : Contains(settings.getKey("/OFF"), group)) {
            m_HiddenLayers.push_back(copy);
        }
    }
}

QPDFObjectHandle PdfDrawings::MakeLayers() const
{
    if (m_Layers.empty()) {
        return Handle::newNull();
    }
    Handle const settings = Handle::newDictionary({{"/OFF", Handle::newArray(m_HiddenLayers)}});
    return Handle::newDictionary({{"/OCGs", Handle::newArray(m_Layers)}, {"/D", settings}});
}

}
