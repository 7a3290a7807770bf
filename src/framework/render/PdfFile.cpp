#include "framework/render/PdfFile.h"

#include "framework/raster/ICCManager.h"
#include "framework/render/PdfOutline.h"
#include "framework/render/PdfPageLabels.h"
#include "framework/render/PdfText.h"

#include <cmath>
#include <qpdf/QPDF.hh>
#include <qpdf/QPDFWriter.hh>
#include <stdexcept>

namespace Renderer::RenderTree
{

namespace
{

using Handle = QPDFObjectHandle;

/// Kids of a node of the page tree. Readers find a page by walking down, so the tree is neither one long list nor deep.
constexpr std::size_t KidsOfNode = 64;

Handle Name(char const * name)
{
    return Handle::newName(name);
}

Handle Number(double value)
{
    Thousandths const thousandths = ToThousandths(value);
    if (thousandths % 1000 == 0) {
        return Handle::newInteger(thousandths / 1000);
    }
    std::string text;
    AppendThousandths(text, thousandths);
    return Handle::newReal(text);
}

Handle Text(String const & text)
{
    return Handle::newString(TextString(text.View()));
}

/// Readers take left, bottom, right, top.
Handle Box(Kernel::Rect const & rect)
{
    return Handle::newArray({Number(rect.left), Number(rect.bottom), Number(rect.right), Number(rect.top)});
}

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

/// Gives libqpdf the streams' bytes out of the spill when it writes them.
class SpillProvider : public Handle::StreamDataProvider
{
public:
    explicit SpillProvider(PdfSpill & spill) : StreamDataProvider(false), m_Spill(spill) {}

    void Add(Handle const & stream, SpillRange const & range)
    {
        std::size_t const id = static_cast<std::size_t>(stream.getObjGen().getObj());
        m_Ranges.resize(std::max(m_Ranges.size(), id + 1));
        m_Ranges[id] = range;
    }

    void provideStreamData(QPDFObjGen const & object, Pipeline * pipeline) override
    {
        SpillRange const & range = m_Ranges[static_cast<std::size_t>(object.getObj())];
        m_Buffer.resize(std::min<std::uint64_t>(range.m_Length, std::size_t(1) << 16));
        for (std::uint64_t done = 0; done < range.m_Length;) {
            std::size_t const size = std::min<std::uint64_t>(range.m_Length - done, m_Buffer.size());
            if (!m_Spill.Read(range, done, m_Buffer.data(), size)) {
                throw std::runtime_error(m_Spill.GetError());
            }
            pipeline->write(m_Buffer.data(), size);
            done += size;
        }
        pipeline->finish();
    }

private:
    PdfSpill & m_Spill;
    std::vector<SpillRange> m_Ranges;
    std::vector<unsigned char> m_Buffer;
};

/// Makes libqpdf's objects from the records.
class Assembler
{
public:
    Assembler(PdfFile & file, PdfSpill & spill, PdfCompressor & compressor, PdfSchema const & schema)
        : m_File(file), m_Spill(spill), m_Compressor(compressor), m_Schema(schema),
          m_Provider(std::make_shared<SpillProvider>(spill))
    {
        m_Pdf.emptyPDF();
    }

    void Assemble()
    {
        MakeProfiles();
        MakeFonts();
        ReservePages();
        MakeImages();
        MakeUses();
        FillPages();
        MakeCatalogue();
    }

    void Write(Pipeline & target)
    {
        QPDFWriter writer(m_Pdf);
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
    /// What a job beside this thread makes of a font.
    struct FontData
    {
        PdfFont::Program m_Program;
        SpillRange m_ProgramData;
        SpillRange m_ToUnicode;
    };

    Handle SpilledStream(SpillRange const & range, char const * filter)
    {
        Handle stream = Handle::newStream(&m_Pdf);
        m_Provider->Add(stream, range);
        stream.replaceStreamData(m_Provider, filter ? Name(filter) : Handle::newNull(), Handle::newNull());
        return stream;
    }

    void MakeProfiles()
    {
        for (Kernel::Consolidated<Raster::ICCProfile> const & profile : m_File.m_Resources.GetProfiles()) {
            m_Profiles.push_back(MakeProfile(*profile));
        }
    }

    Handle MakeProfile(Raster::ICCProfile const & profile)
    {
        std::vector<unsigned char> const & bytes = profile.GetBytes();
        std::string_view const data(reinterpret_cast<char const *>(bytes.data()), bytes.size());
        PdfCompressor::Deflater deflater;
        std::string_view const packed = deflater.Compress(data);
        Handle stream = SpilledStream(m_Spill.Append(packed.data(), packed.size()), "/FlateDecode");
        stream.getDict().replaceKey("/N", Handle::newInteger(Raster::ChannelCount(profile.GetSpace())));
        return stream;
    }

    void MakeFonts()
    {
        std::vector<std::unique_ptr<PdfFont>> const & fonts = m_File.m_Resources.GetFonts();
        std::vector<FontData> data(fonts.size());
        for (std::size_t i = 0; i < fonts.size(); ++i) {
            if (!fonts[i]->IsEmbedded()) {
                continue;
            }
            m_Compressor.Add(0, [this, &font = *fonts[i], &result = data[i]](PdfCompressor::Deflater & deflater) {
                result.m_Program = font.MakeProgram();
                std::string_view packed = deflater.Compress(result.m_Program.m_Bytes);
                result.m_ProgramData = m_Spill.Append(packed.data(), packed.size());
                packed = deflater.Compress(font.MakeToUnicode());
                result.m_ToUnicode = m_Spill.Append(packed.data(), packed.size());
            });
        }
        m_Compressor.Finish();
        for (std::size_t i = 0; i < fonts.size(); ++i) {
            m_Fonts.push_back(fonts[i]->IsEmbedded() ? MakeFont(*fonts[i], data[i]) : Handle::newNull());
        }
    }

    /// A Type 0 font with one descendant (ISO 32000-2, 9.7).
    Handle MakeFont(PdfFont const & font, FontData const & data)
    {
        Typeset::FontFace const & face = font.GetFace();
        Typeset::FaceMetrics const & metrics = face.GetMetrics();
        auto const scaled = [&](int value) { return Number(std::round(value * 1000.0 / metrics.m_UnitsPerEm)); };
        std::string const name = "/" + (face.MaySubset() ? data.m_Program.m_Tag + "+" : std::string()) +
                                 face.GetPostScriptName().ToStd();

        Handle program = SpilledStream(data.m_ProgramData, "/FlateDecode");
        if (data.m_Program.m_IsCff) {
            program.getDict().replaceKey("/Subtype", Name("/CIDFontType0C"));
        } else {
            program.getDict().replaceKey(
                "/Length1", Handle::newInteger(static_cast<long long>(data.m_Program.m_Bytes.size())));
        }

        // Symbolic, as the glyphs are not of one Latin character set; besides fixed pitch and italic.
        int const flags = 4 | (face.IsMonospaced() ? 1 : 0) | (face.IsItalic() ? 64 : 0);
        Handle descriptor = Handle::newDictionary({
            {"/Type", Name("/FontDescriptor")},
            {"/FontName", Name(name.c_str())},
            {"/Flags", Handle::newInteger(flags)},
            {"/FontBBox", Handle::newArray({scaled(metrics.m_BoxLeft), scaled(metrics.m_BoxBottom),
                                            scaled(metrics.m_BoxRight), scaled(metrics.m_BoxTop)})},
            {"/ItalicAngle", Number(metrics.m_ItalicAngle)},
            {"/Ascent", scaled(metrics.m_Ascent)},
            {"/Descent", scaled(-metrics.m_Descent)},
            {"/CapHeight", scaled(metrics.m_CapHeight)},
            // Files do not tell the width of stems; readers want one to imitate a missing font, which this one is not.
            {"/StemV", Handle::newInteger(50 + face.GetWeight() * face.GetWeight() / 4225)},
            {data.m_Program.m_IsCff ? "/FontFile3" : "/FontFile2", program},
        });
        Handle descendant = Handle::newDictionary({
            {"/Type", Name("/Font")},
            {"/Subtype", Name(data.m_Program.m_IsCff ? "/CIDFontType0" : "/CIDFontType2")},
            {"/BaseFont", Name(name.c_str())},
            {"/CIDSystemInfo", Handle::newDictionary({{"/Registry", Handle::newString("Adobe")},
                                                      {"/Ordering", Handle::newString("Identity")},
                                                      {"/Supplement", Handle::newInteger(0)}})},
            {"/FontDescriptor", m_Pdf.makeIndirectObject(descriptor)},
            {"/DW", Handle::newInteger(0)},
            {"/W", Handle::parse(font.MakeWidths())},
        });
        if (!data.m_Program.m_IsCff) {
            descendant.replaceKey("/CIDToGIDMap", Name("/Identity"));
        }
        return m_Pdf.makeIndirectObject(Handle::newDictionary({
            {"/Type", Name("/Font")},
            {"/Subtype", Name("/Type0")},
            {"/BaseFont", Name(name.c_str())},
            {"/Encoding", Name("/Identity-H")},
            {"/DescendantFonts", Handle::newArray({m_Pdf.makeIndirectObject(descendant)})},
            {"/ToUnicode", SpilledStream(data.m_ToUnicode, "/FlateDecode")},
        }));
    }

    void MakeImages()
    {
        for (PdfImage const & image : m_File.m_Resources.GetImages()) {
            Handle stream = SpilledStream(image.m_Data, nullptr);
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
        std::vector<PdfForm> const & forms = m_File.m_Resources.GetForms();
        m_Uses.assign(uses.size(), Handle());
        for (PdfForm const & form : forms) {
            Handle stream = SpilledStream(form.m_Data, "/FlateDecode");
            Handle dictionary = stream.getDict();
            dictionary.replaceKey("/Type", Name("/XObject"));
            dictionary.replaceKey("/Subtype", Name("/Form"));
            dictionary.replaceKey("/BBox", Box({-16000, 16000, 16000, -16000}));
            dictionary.replaceKey("/Group", TransparencyGroup());
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
            m_Uses[number] = m_Pdf.makeIndirectObject(MakeResources(*m_File.m_Resources.GetUses()[number]));
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
        bool transparent = !uses.m_Forms.empty() || !uses.m_Opacities.empty();
        for (std::uint32_t const image : uses.m_Images) {
            transparent = transparent || m_File.m_Resources.GetImages()[image].m_SoftMask != 0;
        }
        return transparent;
    }

    void ReservePages()
    {
        m_Pages.reserve(m_File.m_Pages.size());
        for (std::size_t i = 0; i < m_File.m_Pages.size(); ++i) {
            m_Pages.push_back(m_Pdf.makeIndirectObject(Handle::newDictionary({{"/Type", Name("/Page")}})));
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
            page.replaceKey("/Contents", SpilledStream(record.m_Content, "/FlateDecode"));
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
            annotation.replaceKey("/F", Handle::newInteger(4));
            if (link.m_Address != 0) {
                annotation.replaceKey("/A", ActionFor(link.m_Address - 1));
            } else if (Handle destination = Destination(link.m_Target); !destination.isNull()) {
                annotation.replaceKey("/Dest", destination);
            } else {
                continue;
            }
            annotations.appendItem(m_Pdf.makeIndirectObject(annotation));
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
                                                   {"/UF", Text(address.m_Text)}})},
                     {"/D", Handle::newArray({Handle::newInteger(0), Name("/Fit")})}});
            } else {
                action = Handle::newDictionary(
                    {{"/S", Name("/URI")}, {"/URI", Handle::newString(UriText(address.m_Text.View()))}});
            }
        }
        return action;
    }

    /// Null for a page that is not in the file.
    Handle Destination(PdfTarget const & target)
    {
        if (target.m_Page < 1 || static_cast<std::size_t>(target.m_Page) > m_Pages.size()) {
            return Handle::newNull();
        }
        std::size_t const index = static_cast<std::size_t>(target.m_Page - 1);
        PdfPageRecord const & page = m_File.m_Pages[index];
        Kernel::Rect const & trim = m_File.m_Boxes[page.m_Boxes].GetTrim();
        Kernel::Point place{0, 0};
        if (target.m_HasPosition) {
            place = target.m_FromTopLeft ? target.m_Position
                                         : Kernel::Point{target.m_Position.x - page.m_Origin.x,
                                                         target.m_Position.y - page.m_Origin.y};
        }
        return Handle::newArray({m_Pages[index], Name("/XYZ"), Number(trim.left + place.x),
                                 Number(trim.top - place.y), Handle::newNull()});
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
                Handle parent = m_Pdf.makeIndirectObject(Handle::newDictionary({{"/Type", Name("/Pages")}}));
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
        Handle catalogue = m_Pdf.getRoot();
        catalogue.replaceKey("/Pages", m_Root);
        if (!m_File.m_Info.m_Language.Empty()) {
            catalogue.replaceKey("/Lang", Text(m_File.m_Info.m_Language));
        }
        catalogue.replaceKey("/MarkInfo", Handle::newDictionary({{"/Marked", Handle::newBool(false)}}));
        if (!m_File.m_Info.m_Title.Empty()) {
            catalogue.replaceKey("/ViewerPreferences",
                                 Handle::newDictionary({{"/DisplayDocTitle", Handle::newBool(true)}}));
        }
        Handle metadata = Handle::newStream(&m_Pdf, MakeXmpPacket(m_File.m_Info));
        metadata.getDict().replaceKey("/Type", Name("/Metadata"));
        metadata.getDict().replaceKey("/Subtype", Name("/XML"));
        catalogue.replaceKey("/Metadata", metadata);
        if (settings.m_PageLabels) {
            MakePageLabels(catalogue);
        }
        if (settings.m_OutputIntent) {
            MakeOutputIntent(catalogue);
        }
        Handle outline =
            MakeOutline(m_Pdf, m_File.m_Bookmarks, settings.m_OpenBookmarkLevels, [this](PdfBookmark const & bookmark) {
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
        MakeInfo();
    }

    void MakePageLabels(Handle & catalogue)
    {
        std::vector<std::string_view> labels;
        bool any = false;
        for (PdfPageRecord const & page : m_File.m_Pages) {
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
                entry.replaceKey("/S", Name(style));
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

    /// ISO 32000-2, 14.11.5.
    void MakeOutputIntent(Handle & catalogue)
    {
        Raster::ColourSpace const space = Raster::SpaceOfFormat(m_Schema.GetColourFormat());
        bool const print = space == Raster::ColourSpace::Cmyk;
        Kernel::Consolidated<Raster::ICCProfile> const profile = m_Schema.GetProfiles().ForSpace(
            space == Raster::ColourSpace::Lab ? Raster::ColourSpace::Rgb : space);
        if (!profile) {
            return;
        }
        bool const standard = profile->IsSame(*Raster::ICCManager::GetInstance().GetDefaultProfileForSpace(space));
        char const * identifier = standard && print                              ? "FOGRA39"
                                  : standard && space == Raster::ColourSpace::Rgb ? "sRGB IEC61966-2.1"
                                                                                  : "Custom";
        catalogue.replaceKey("/OutputIntents", Handle::newArray({Handle::newDictionary({
                                                   {"/Type", Name("/OutputIntent")},
                                                   {"/S", Name(print ? "/GTS_PDFX" : "/GTS_PDFA1")},
                                                   {"/OutputConditionIdentifier", Handle::newString(identifier)},
                                                   {"/RegistryName", Handle::newString("http://www.color.org")},
                                                   {"/Info", Text(profile->GetDescription())},
                                                   {"/DestOutputProfile", MakeProfile(*profile)},
                                               })}));
    }

    void MakeInfo()
    {
        Handle info = Handle::newDictionary();
        for (auto const & [name, text] : {std::pair("/Title", m_File.m_Info.m_Title), {"/Author", m_File.m_Info.m_Author},
                                          {"/Subject", m_File.m_Info.m_Subject}, {"/Keywords", m_File.m_Info.m_Tags}}) {
            if (!text.Empty()) {
                info.replaceKey(name, Text(text));
            }
        }
        info.replaceKey("/Creator", Handle::newString(ProducerName));
        info.replaceKey("/Producer", Handle::newString(ProducerName));
        info.replaceKey("/CreationDate", Handle::newString(PdfDate(m_File.m_Info.m_Time)));
        info.replaceKey("/ModDate", Handle::newString(PdfDate(m_File.m_Info.m_Time)));
        m_Pdf.getTrailer().replaceKey("/Info", m_Pdf.makeIndirectObject(info));
    }

    PdfFile & m_File;
    PdfSpill & m_Spill;
    PdfCompressor & m_Compressor;
    PdfSchema const & m_Schema;
    std::shared_ptr<SpillProvider> m_Provider;
    QPDF m_Pdf;
    Handle m_NoBorder = Handle::parse("[0 0 0]");
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

void WritePdfFile(PdfFile & file, PdfSpill & spill, PdfCompressor & compressor, PdfSchema const & schema,
                  Pipeline & target)
{
    Assembler assembler(file, spill, compressor, schema);
    assembler.Assemble();
    assembler.Write(target);
}

}
