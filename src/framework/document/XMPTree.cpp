#include "framework/document/XMPTree.h"

#include <string>

namespace
{

/// What XML 1.0 can hold, with the markup characters escaped.
void AppendEscaped(std::string & out, std::string_view text)
{
    for (char const c : text) {
        switch (c) {
        case '&':
            out += "&amp;";
            break;
        case '<':
            out += "&lt;";
            break;
        case '>':
            out += "&gt;";
            break;
        case '"':
            out += "&quot;";
            break;
        default:
            if (0x20 <= static_cast<unsigned char>(c) || '\t' == c || '\n' == c || '\r' == c) {
                out += c;
            }
        }
    }
}

char const * Container(XMPTree::Form form)
{
    switch (form) {
    case XMPTree::Form::Bag:
        return "rdf:Bag";
    case XMPTree::Form::Sequence:
        return "rdf:Seq";
    case XMPTree::Form::LanguageAlternative:
        return "rdf:Alt";
    case XMPTree::Form::Text:
        break;
    }
    return nullptr;
}

}

void XMPTree::Add(String name, Form form, std::vector<String> values)
{
    m_Properties.push_back({std::move(name), form, std::move(values)});
}

String XMPTree::ToXML() const
{
    std::string out = "<x:xmpmeta xmlns:x=\"adobe:ns:meta/\">\n"
                      "<rdf:RDF xmlns:rdf=\"http://www.w3.org/1999/02/22-rdf-syntax-ns#\">\n"
                      "<rdf:Description rdf:about=\"\" xmlns:dc=\"http://purl.org/dc/elements/1.1/\" "
                      "xmlns:xmp=\"http://ns.adobe.com/xap/1.0/\" xmlns:pdf=\"http://ns.adobe.com/pdf/1.3/\">\n";
    for (Property const & property : m_Properties) {
        out += '<' + property.m_Name.ToStd() + '>';
        char const * const container = Container(property.m_Form);
        if (container) {
            out += std::string("<") + container + '>';
        }
        for (String const & value : property.m_Values) {
            if (container) {
                out += Form::LanguageAlternative == property.m_Form ? "<rdf:li xml:lang=\"x-default\">" : "<rdf:li>";
            }
            AppendEscaped(out, value);
            if (container) {
                out += "</rdf:li>";
            }
        }
        if (container) {
            out += std::string("</") + container + '>';
        }
        out += "</" + property.m_Name.ToStd() + ">\n";
    }
    out += "</rdf:Description>\n</rdf:RDF>\n</x:xmpmeta>\n";
    return String(out);
}
