#include "framework/render/PdfFile.h"

#include "framework/render/PdfCatalogue.h"
#include "framework/render/PdfDrawings.h"
#include "framework/render/PdfExport.h"
#include "framework/render/PdfFontObjects.h"
#include "framework/render/PdfObjects.h"
#include "framework/render/PdfOutline.h"
#include "framework/render/Qpdf.h"

#include <cmath>
#include <map>
#include <tuple>

namespace Renderer::RenderTree
{

namespace
{

using Handle = QPDFObjectHandle;

/// Kids of a node of the page tree. Readers find a page by walking down, so the tree is neither one long list nor deep.
constexpr std::size_t KidsOfNode = 64;

/// An address as URIs are written: everything beyond plain ASCII in percent form (RFC 3986, 2.1).
std::string UriText(std::string_view address)
{
    static char const digits[] = "0123456789ABCDEF";
    std::string text;
    for (char const character : address) {
        unsigned char const byte = static_cast<unsigned char>(character);
        if (byte <= 0x20 || byte >= 0x7F || std::string_view("<>\"{}|\\^`").find(character) != std::string_view::npos) {
            text += '%';
            text += digits[byte >> 4];
            text += digits[byte & 15];
        } else {
            text += character;
        }
    }
    return text;
}

/// Makes libqpdf's objects from the records.
class Assembler
{
public:
    Assembler(PdfFile & file, PdfObjects & objects, PdfDrawings const & drawings, PdfCompressor & compressor,
              PdfSchema const & schema)
        : m_File(file), m_Objects(objects), m_Drawings(drawings), m_Compressor(compressor), m_Schema(schema)
    {
    }

    void Assemble()
    {
        MakeProfiles();
        m_Fonts = MakeFonts(m_Objects, m_File.m_Resources.GetFonts(), m_Compressor);
        ReservePages();
        MakeImages();
        MakeUses();
        FillPages();
        MakeCatalogue();
    }

    void Write(Pipeline & target)
    {
        QPDFWriter writer(GetPdf());
        writer.setOutputPipeline(&target);
        writer.setMinimumPDFVersion("1.7");
        writer.setObjectStreamMode(qpdf_o_generate);
        // The streams are compressed already; the metadata must stay legible.
        writer.setStreamDataMode(qpdf_s_preserve);
        // The file's id comes from its content, so that it is the same for the same content.
        writer.setDeterministicID(true);
        writer.write();
    }

private:
    [[nodiscard]] QPDF & GetPdf() { return m_Objects.GetPdf(); }
    Handle Name(char const * name) { return m_Objects.Name(name); }
    Handle Number(double value) { return m_Objects.Number(value); }
    Handle Box(Kernel::Rect const & rect) { return m_Objects.Box(rect); }

    void MakeProfiles()
    {
        for (Kernel::Consolidated<Raster::ICCProfile> const & profile : m_File.m_Resources.GetProfiles()) {
            m_Profiles.push_back(m_Objects.MakeProfile(*profile));
        }
    }

    void MakeImages()
    {
        for (PdfImage const & image : m_File.m_Resources.GetImages()) {
            Handle stream = m_Objects.SpilledStream(image.m_Data, nullptr);
            Handle dictionary = Handle::parse("<<" + image.m_Entries + ">>");
            dictionary.replaceKey("/Type", Name("/XObject"));
            dictionary.replaceKey("/Subtype", Name("/Image"));
            dictionary.replaceKey("/Width", Handle::newInteger(image.m_Width));
            dictionary.replaceKey("/Height", Handle::newInteger(image.m_Height));
            if (image.m_Profile != 0) {
                dictionary.replaceKey("/ColorSpace", IccSpace(image.m_Profile - 1));
            }
            if (image.m_SoftMask != 0) {
                dictionary.replaceKey("/SMask", m_Images[image.m_SoftMask - 1]);
            }
            stream.replaceDict(dictionary);
            m_Images.push_back(stream);
        }
    }

    Handle IccSpace(std::uint32_t profile)
    {
        return Handle::newArray({Name("/ICCBased"), m_Profiles[profile]});
    }

    /// Forms come before those that use them, as a form is finished before what is round it.
    void MakeUses()
    {
        std::vector<PdfUses const *> const & uses = m_File.m_Resources.GetUses();
        std::deque<PdfForm> const & forms = m_File.m_Resources.GetForms();
        m_Uses.assign(uses.size(), Handle());
        for (PdfForm const & form : forms) {
            Handle stream = m_Objects.SpilledStream(form.m_Data, "/FlateDecode");
            Handle dictionary = stream.getDict();
            dictionary.replaceKey("/Type", Name("/XObject"));
            dictionary.replaceKey("/Subtype", Name("/Form"));
            dictionary.replaceKey("/BBox", Box(form.m_Bounds));
            if (form.m_IsGroup) {
                dictionary.replaceKey("/Group", TransparencyGroup());
            }
            dictionary.replaceKey("/Resources", UsesAt(form.m_Uses));
            m_Forms.push_back(stream);
        }
        for (std::uint32_t i = 0; i < uses.size(); ++i) {
            UsesAt(i);
        }
    }

    Handle UsesAt(std::uint32_t number)
    {
        if (!m_Uses[number].isInitialized()) {
            m_Uses[number] = GetPdf().makeIndirectObject(MakeResources(*m_File.m_Resources.GetUses()[number]));
        }
        return m_Uses[number];
    }

    Handle MakeResources(PdfUses const & uses)
    {
        Handle fonts = Handle::newDictionary();
        for (std::uint32_t const font : uses.m_Fonts) {
            fonts.replaceKey("/" + m_File.m_Resources.GetFonts()[font]->GetName(), m_Fonts[font]);
        }
        Handle objects = Handle::newDictionary();
        for (std::uint32_t const image : uses.m_Images) {
            objects.replaceKey("/I" + std::to_string(image + 1), m_Images[image]);
        }
        for (std::uint32_t const form : uses.m_Forms) {
            objects.replaceKey("/X" + std::to_string(form + 1), m_Forms[form]);
        }
        for (std::uint32_t const drawing : uses.m_Drawings) {
            objects.replaceKey("/D" + std::to_string(drawing + 1), m_Drawings.GetForms()[drawing].m_Object);
        }
        Handle states = Handle::newDictionary();
        for (std::uint32_t const opacity : uses.m_Opacities) {
            Handle const value = Number(opacity / 1000.0);
            states.replaceKey("/G" + std::to_string(opacity),
                              Handle::newDictionary({{"/ca", value}, {"/CA", value}}));
        }
        Handle resources = Handle::newDictionary();
        for (auto [name, dictionary] : {std::pair("/Font", fonts), {"/XObject", objects}, {"/ExtGState", states}}) {
            if (!dictionary.getKeys().empty()) {
                resources.replaceKey(name, dictionary);
            }
        }
        if (uses.m_Lab) {
            resources.replaceKey("/ColorSpace", Handle::parse("<</Lab[/Lab<</WhitePoint[0.9642 1 0.8249]"
                                                              "/Range[-128 127 -128 127]>>]>>"));
        }
        return resources;
    }

    Handle TransparencyGroup()
    {
        Raster::ColourSpace const space = Raster::SpaceOfFormat(m_Schema.GetColourFormat());
        char const * name = space == Raster::ColourSpace::Cmyk   ? "/DeviceCMYK"
                            : space == Raster::ColourSpace::Grey ? "/DeviceGray"
                                                                 : "/DeviceRGB";
        return Handle::newDictionary({{"/S", Name("/Transparency")}, {"/CS", Name(name)}});
    }

    [[nodiscard]] bool HasTransparency(PdfUses const & uses) const
    {
        bool transparent = !uses.m_Opacities.empty();
        for (std::uint32_t const number : uses.m_Forms) {
            PdfForm const & form = m_File.m_Resources.GetForms()[number];
            transparent = transparent || form.m_IsGroup || HasTransparency(*m_File.m_Resources.GetUses()[form.m_Uses]);
        }
        for (std::uint32_t const image : uses.m_Images) {
            transparent = transparent || m_File.m_Resources.GetImages()[image].m_SoftMask != 0;
        }
        for (std::uint32_t const drawing : uses.m_Drawings) {
            transparent = transparent || m_Drawings.GetForms()[drawing].m_IsGroup;
        }
        return transparent;
    }

    void ReservePages()
    {
        m_Pages.reserve(m_File.m_Pages.size());
        for (std::size_t i = 0; i < m_File.m_Pages.size(); ++i) {
            m_Pages.push_back(GetPdf().makeIndirectObject(Handle::newDictionary({{"/Type", Name("/Page")}})));
        }
    }

    void FillPages()
    {
        std::vector<Handle> media;
        std::vector<std::vector<std::pair<char const *, Handle>>> others;
        for (PageBoxes const & boxes : m_File.m_Boxes) {
            media.push_back(Box(boxes.m_Media));
            others.emplace_back();
            for (auto const & [name, rect] : {std::pair("/CropBox", boxes.m_Crop), {"/BleedBox", boxes.m_Bleed},
                                              {"/TrimBox", boxes.m_Trim}, {"/ArtBox", boxes.m_Art}}) {
                if (!rect.IsEmpty()) {
                    others.back().emplace_back(name, Box(rect));
                }
            }
        }
        for (std::size_t i = 0; i < m_Pages.size(); ++i) {
            PdfPageRecord const & record = m_File.m_Pages[i];
            Handle & page = m_Pages[i];
            page.replaceKey("/MediaBox", media[record.m_Boxes]);
            for (auto const & [name, box] : others[record.m_Boxes]) {
                page.replaceKey(name, box);
            }
            page.replaceKey("/Resources", m_Uses[record.m_Uses]);
            page.replaceKey("/Contents", m_Objects.SpilledStream(record.m_Content, "/FlateDecode"));
            if (HasTransparency(*m_File.m_Resources.GetUses()[record.m_Uses])) {
                page.replaceKey("/Group", TransparencyGroup());
            }
            if (Handle links = MakeLinks(record); links.getArrayNItems() > 0) {
                page.replaceKey("/Annots", links);
            }
        }
        m_Root = MakePageTree();
    }

    Handle MakeLinks(PdfPageRecord const & record)
    {
        Handle annotations = Handle::newArray();
        for (std::uint32_t i = 0; i < record.m_LinkCount; ++i) {
            PdfLinkRecord const & link = m_File.m_Links[record.m_FirstLink + i];
            Handle annotation = Handle::newDictionary({{"/Type", Name("/Annot")}, {"/Subtype", Name("/Link")}});
            annotation.replaceKey("/Rect", Box(link.m_Rect));
            annotation.replaceKey("/Border", m_NoBorder);
            // Shown on paper too, which for a link without border means nothing, but print standards ask for it.
            annotation.replaceKey("/F", Number(4));
            if (link.m_Address != 0) {
                annotation.replaceKey("/A", ActionFor(link.m_Address - 1));
            } else if (Handle destination = Destination(link.m_Target); !destination.isNull()) {
                annotation.replaceKey("/Dest", destination);
            } else {
                continue;
            }
            annotations.appendItem(GetPdf().makeIndirectObject(annotation));
        }
        return annotations;
    }

    Handle ActionFor(std::uint32_t number)
    {
        m_Actions.resize(m_File.m_Addresses.size());
        Handle & action = m_Actions[number];
        if (!action.isInitialized()) {
            PdfAddress const & address = m_File.m_Addresses[number];
            if (address.m_IsPdfFile) {
                action = Handle::newDictionary(
                    {{"/S", Name("/GoToR")},
                     {"/F", Handle::newDictionary({{"/Type", Name("/Filespec")},
                                                   {"/F", Handle::newString(address.m_Text.ToStd())},
                                                   {"/UF", PdfObjects::Text(address.m_Text)}})},
                     {"/D", Handle::newArray({Handle::newInteger(0), Name("/Fit")})}});
            } else {
                action = Handle::newDictionary(
                    {{"/S", Name("/URI")}, {"/URI", Handle::newString(UriText(address.m_Text.View()))}});
            }
        }
        return action;
    }

    /// Goes from a spread's first page to the one of its pages that the place lies on.
    void GoToPartOfSpread(std::size_t & index, Kernel::Point & place) const
    {
        using Continues = PdfPage::Continues;
        for (; index + 1 < m_File.m_Pages.size(); ++index) {
            auto const next = static_cast<Continues>(m_File.m_Pages[index + 1].m_Continues);
            Kernel::Rect const & trim = m_File.m_Boxes[m_File.m_Pages[index].m_Boxes].GetTrim();
            double const width = std::abs(trim.Width());
            double const height = std::abs(trim.Height());
            if (next == Continues::Beside && place.x >= width) {
                place.x -= width;
            } else if (next == Continues::Below && place.y >= height) {
                place.y -= height;
            } else {
                return;
            }
        }
    }

    /// Null for a page that is not in the file.
    Handle Destination(PdfTarget const & target)
    {
        if (target.m_Page < 1 || static_cast<std::size_t>(target.m_Page) > m_Pages.size()) {
            return Handle::newNull();
        }
        std::size_t index = static_cast<std::size_t>(target.m_Page - 1);
        PdfPageRecord const & page = m_File.m_Pages[index];
        Kernel::Point place{0, 0};
        if (target.m_HasPosition) {
            place = target.m_FromTopLeft ? target.m_Position
                                         : Kernel::Point{target.m_Position.x - page.m_Origin.x,
                                                         target.m_Position.y - page.m_Origin.y};
            GoToPartOfSpread(index, place);
        }
        Kernel::Rect const & trim = m_File.m_Boxes[m_File.m_Pages[index].m_Boxes].GetTrim();
        double const x = trim.left + place.x;
        double const y = trim.top - place.y;
        // Many links lead to one place: the index to a chapter, a note's marks to the note.
        Handle & known = m_Destinations[{static_cast<int>(index) + 1, ToThousandths(x), ToThousandths(y)}];
        if (!known.isInitialized()) {
            known = Handle::newArray({m_Pages[index], Name("/XYZ"), Number(x), Number(y), m_Null});
        }
        return known;
    }

    Handle MakePageTree()
    {
        struct Node
        {
            Handle m_Object;
            long long m_Count;
        };
        std::vector<Node> nodes;
        nodes.reserve(m_Pages.size());
        for (Handle const & page : m_Pages) {
            nodes.push_back({page, 1});
        }
        do {
            std::vector<Node> parents;
            for (std::size_t first = 0; first < nodes.size(); first += KidsOfNode) {
                Handle parent = GetPdf().makeIndirectObject(Handle::newDictionary({{"/Type", Name("/Pages")}}));
                std::vector<Handle> kids;
                long long count = 0;
                for (std::size_t i = first; i < std::min(nodes.size(), first + KidsOfNode); ++i) {
                    nodes[i].m_Object.replaceKey("/Parent", parent);
                    kids.push_back(nodes[i].m_Object);
                    count += nodes[i].m_Count;
                }
                parent.replaceKey("/Kids", Handle::newArray(kids));
                parent.replaceKey("/Count", Handle::newInteger(count));
                parents.push_back({parent, count});
            }
            nodes = std::move(parents);
        } while (nodes.size() > 1);
        return nodes.front().m_Object;
    }

    void MakeCatalogue()
    {
        FileExportOptionsPDF::Settings const & settings = m_Schema.GetOptions().GetSettings();
        Handle catalogue = GetPdf().getRoot();
        catalogue.replaceKey("/Pages", m_Root);
        MakeInformation(m_Objects, m_File.m_Info, catalogue);
        if (settings.m_PageLabels) {
            MakePageLabels(m_File, catalogue);
        }
        if (settings.m_OutputIntent) {
            MakeOutputIntent(m_Objects, m_Schema, catalogue);
        }
        if (Handle layers = m_Drawings.MakeLayers(); !layers.isNull()) {
            catalogue.replaceKey("/OCProperties", layers);
        }
        Handle outline =
            MakeOutline(GetPdf(), m_File.m_Bookmarks, settings.m_OpenBookmarkLevels, [this](PdfBookmark const & bookmark) {
                PdfTarget target;
                target.m_Page = bookmark.m_Page;
                target.m_HasPosition = true;
                target.m_FromTopLeft = static_cast<bool>(bookmark.m_PrintersMarks);
                target.m_Position = bookmark.m_PrintersMarks
                                        ? bookmark.m_PrintersMarks->FromTopLeft(bookmark.m_Position)
                                        : bookmark.m_Position;
                return Destination(target);
            });
        if (!outline.isNull()) {
            catalogue.replaceKey("/Outlines", outline);
            catalogue.replaceKey("/PageMode", Name("/UseOutlines"));
        }
    }

    PdfFile & m_File;
    PdfObjects & m_Objects;
    PdfDrawings const & m_Drawings;
    PdfCompressor & m_Compressor;
    PdfSchema const & m_Schema;
    Handle m_NoBorder = Handle::parse("[0 0 0]");
    Handle m_Null = Handle::newNull();
    std::map<std::tuple<int, Thousandths, Thousandths>, Handle> m_Destinations;
    Handle m_Root;
    std::vector<Handle> m_Profiles;
    std::vector<Handle> m_Fonts;
    std::vector<Handle> m_Images;
    std::vector<Handle> m_Forms;
    std::vector<Handle> m_Uses;
    std::vector<Handle> m_Pages;
    std::vector<Handle> m_Actions;
};

}

void WritePdfFile(PdfFile & file, PdfObjects & objects, PdfDrawings const & drawings, PdfCompressor & compressor,
                  PdfSchema const & schema, Pipeline & target)
{
    Assembler assembler(file, objects, drawings, compressor, schema);
    assembler.Assemble();
    assembler.Write(target);
}

}
