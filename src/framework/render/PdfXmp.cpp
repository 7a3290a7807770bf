#include "framework/render/PdfXmp.h"

#include "framework/kernel/Utf.h"
#include "framework/render/PdfText.h"

namespace Renderer::RenderTree
{

namespace
{

/// Who edits a packet in a finished file can't make it longer.
constexpr std::size_t Padding = 4096;

std::string Escaped(std::string_view text)
{
    std::string escaped;
    while (!text.empty()) {
        char32_t const character = Kernel::TakeUtf8(text);
        switch (character) {
        case U'&':
            escaped += "&amp;";
            break;
        case U'<':
            escaped += "&lt;";
            break;
        case U'>':
            escaped += "&gt;";
            break;
        default:
            // Other controls can't stand in XML at all.
            if (character >= 0x20 || character == U'\t' || character == U'\n') {
                Kernel::AppendUtf8(escaped, character);
            }
        }
    }
    return escaped;
}

void Add(std::string & xml, char const * name, char const * open, std::string const & text, char const * close)
{
    if (!text.empty()) {
        xml += std::string("<") + name + ">" + open + text + close + "</" + name + ">\n";
    }
}

std::string KeyWords(std::string_view tags)
{
    std::string items;
    while (!tags.empty()) {
        std::size_t const end = std::min(tags.find_first_of(",;"), tags.size());
        std::string_view word = tags.substr(0, end);
        tags.remove_prefix(std::min(end + 1, tags.size()));
        while (!word.empty() && word.front() == ' ') {
            word.remove_prefix(1);
        }
        while (!word.empty() && word.back() == ' ') {
            word.remove_suffix(1);
        }
        items += word.empty() ? "" : "<rdf:li>" + Escaped(word) + "</rdf:li>";
    }
    return items;
}

}

std::string MakeXmpPacket(PdfInfo const & info)
{
    std::string const date = XmpDate(info.m_Time);
    std::string xml = "<?xpacket begin=\"\xEF\xBB\xBF\" id=\"W5M0MpCehiHzreSzNTczkc9d\"?>\n"
                      "<x:xmpmeta xmlns:x=\"adobe:ns:meta/\">\n"
                      "<rdf:RDF xmlns:rdf=\"http://www.w3.org/1999/02/22-rdf-syntax-ns#\">\n"
                      "<rdf:Description rdf:about=\"\" xmlns:dc=\"http://purl.org/dc/elements/1.1/\" "
                      "xmlns:xmp=\"http://ns.adobe.com/xap/1.0/\" xmlns:pdf=\"http://ns.adobe.com/pdf/1.3/\">\n";
    char const * const alternatives = "<rdf:Alt><rdf:li xml:lang=\"x-default\">";
    char const * const alternativesEnd = "</rdf:li></rdf:Alt>";
    Add(xml, "dc:format", "", "application/pdf", "");
    Add(xml, "dc:title", alternatives, Escaped(info.m_Title), alternativesEnd);
    Add(xml, "dc:creator", "<rdf:Seq><rdf:li>", Escaped(info.m_Author), "</rdf:li></rdf:Seq>");
    Add(xml, "dc:description", alternatives, Escaped(info.m_Subject), alternativesEnd);
    Add(xml, "dc:subject", "<rdf:Bag>", KeyWords(info.m_Tags), "</rdf:Bag>");
    Add(xml, "dc:language", "<rdf:Bag><rdf:li>", Escaped(info.m_Language), "</rdf:li></rdf:Bag>");
    Add(xml, "pdf:Keywords", "", Escaped(info.m_Tags), "");
    Add(xml, "pdf:Producer", "", ProducerName, "");
    Add(xml, "xmp:CreatorTool", "", ProducerName, "");
    Add(xml, "xmp:CreateDate", "", date, "");
    Add(xml, "xmp:ModifyDate", "", date, "");
    Add(xml, "xmp:MetadataDate", "", date, "");
    xml += "</rdf:Description>\n</rdf:RDF>\n</x:xmpmeta>\n";
    for (std::size_t room = 0; room < Padding; room += 64) {
        xml.append(63, ' ');
        xml += '\n';
    }
    xml += "<?xpacket end=\"w\"?>";
    return xml;
}

}
