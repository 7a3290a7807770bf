#include "framework/render/PdfCatalogue.h"

#include "framework/raster/ICCManager.h"
#include "framework/render/PdfPageLabels.h"

namespace Renderer::RenderTree
{

namespace
{

using Handle = QPDFObjectHandle;

}

void MakePageLabels(PdfFile const & file, QPDFObjectHandle & catalogue)
{
    std::vector<std::string_view> labels;
    bool any = false;
    for (PdfPageRecord const & page : file.m_Pages) {
        labels.push_back(page.m_Label.View());
        any = any || !page.m_Label.Empty();
    }
    if (!any) {
        return;
    }
    Handle numbers = Handle::newArray();
    for (PdfLabelRange const & range : CompressPageLabels(labels)) {
        Handle entry = Handle::newDictionary();
        static char const * const styles[] = {nullptr, "/D", "/r", "/R"};
        if (char const * style = styles[static_cast<int>(range.m_Style)]) {
            entry.replaceKey("/S", Handle::newName(style));
            if (range.m_Start != 1) {
                entry.replaceKey("/St", Handle::newInteger(range.m_Start));
            }
        }
        if (!range.m_Prefix.empty()) {
            entry.replaceKey("/P", Handle::newString(TextString(range.m_Prefix)));
        }
        numbers.appendItem(Handle::newInteger(static_cast<long long>(range.m_FirstPage)));
        numbers.appendItem(entry);
    }
    catalogue.replaceKey("/PageLabels", Handle::newDictionary({{"/Nums", numbers}}));
}

void MakeOutputIntent(PdfObjects & objects, PdfSchema const & schema, QPDFObjectHandle & catalogue)
{
    Raster::ColourSpace const space = Raster::SpaceOfFormat(schema.GetColourFormat());
    bool const print = space == Raster::ColourSpace::Cmyk;
    Kernel::Consolidated<Raster::ICCProfile> const profile = schema.GetProfiles().ForSpace(
        space == Raster::ColourSpace::Lab ? Raster::ColourSpace::Rgb : space);
    if (!profile) {
        return;
    }
    bool const standard = profile->IsSame(*Raster::ICCManager::GetInstance().GetDefaultProfileForSpace(space));
    char const * identifier = standard && print                              ? "FOGRA39"
                              : standard && space == Raster::ColourSpace::Rgb ? "sRGB IEC61966-2.1"
                                                                              : "Custom";
    catalogue.replaceKey("/OutputIntents", Handle::newArray({Handle::newDictionary({
                                               {"/Type", objects.Name("/OutputIntent")},
                                               {"/S", objects.Name(print ? "/GTS_PDFX" : "/GTS_PDFA1")},
                                               {"/OutputConditionIdentifier", Handle::newString(identifier)},
                                               {"/RegistryName", Handle::newString("http://www.color.org")},
                                               {"/Info", PdfObjects::Text(profile->GetDescription())},
                                               {"/DestOutputProfile", objects.MakeProfile(*profile)},
                                           })}));
}

void MakeInformation(PdfObjects & objects, PdfInfo const & info, QPDFObjectHandle & catalogue)
{
    if (!info.m_Language.Empty()) {
        catalogue.replaceKey("/Lang", PdfObjects::Text(info.m_Language));
    }
    catalogue.replaceKey("/MarkInfo", Handle::newDictionary({{"/Marked", Handle::newBool(false)}}));
    if (!info.m_Title.Empty()) {
        catalogue.replaceKey("/ViewerPreferences",
                             Handle::newDictionary({{"/DisplayDocTitle", Handle::newBool(true)}}));
    }
    Handle metadata = Handle::newStream(&objects.GetPdf(), MakeXmpPacket(info));
    metadata.getDict().replaceKey("/Type", objects.Name("/Metadata"));
    metadata.getDict().replaceKey("/Subtype", objects.Name("/XML"));
    catalogue.replaceKey("/Metadata", metadata);

    Handle dictionary = Handle::newDictionary();
    for (auto const & [name, text] : {std::pair("/Title", info.m_Title), {"/Author", info.m_Author},
                                      {"/Subject", info.m_Subject}, {"/Keywords", info.m_Tags}}) {
        if (!text.Empty()) {
            dictionary.replaceKey(name, PdfObjects::Text(text));
        }
    }
    dictionary.replaceKey("/Creator", Handle::newString(ProducerName));
    dictionary.replaceKey("/Producer", Handle::newString(ProducerName));
    dictionary.replaceKey("/CreationDate", Handle::newString(PdfDate(info.m_Time)));
    dictionary.replaceKey("/ModDate", Handle::newString(PdfDate(info.m_Time)));
    objects.GetPdf().getTrailer().replaceKey("/Info", objects.GetPdf().makeIndirectObject(dictionary));
}

}
