#include "support/DrawingBuilder.h"

#include "framework/render/Qpdf.h"

Raster::Picture::Bytes ToBytes(std::string const & text)
{
    return std::make_shared<std::vector<unsigned char> const>(text.begin(), text.end());
}

Raster::Picture::Bytes PdfSketch::Make() const
{
    using Handle = QPDFObjectHandle;
    QPDF pdf;
    pdf.emptyPDF();
    for (std::string const & content : m_Pages) {
        Handle page = Handle::parse("<</Type/Page" + m_Keys + ">>");
        page.replaceKey("/Contents", Handle::newStream(&pdf, content));
        pdf.addPage(pdf.makeIndirectObject(page), false);
    }
    QPDFWriter writer(pdf);
    writer.setOutputMemory();
    writer.setStaticID(true);
    if (!m_Password.empty()) {
        writer.setR6EncryptionParameters(m_Password.c_str(), "owner", true, true, true, true, true, true, qpdf_r3p_full,
                                         true);
    }
    writer.write();
    std::shared_ptr<Buffer> const file = writer.getBufferSharedPointer();
    return ToBytes({reinterpret_cast<char const *>(file->getBuffer()), file->getSize()});
}

Raster::Picture::Bytes RawPdf(std::vector<std::string> const & objects)
{
    std::string file = "%PDF-1.7\n";
    std::vector<std::size_t> places;
    for (std::size_t i = 0; i < objects.size(); ++i) {
        places.push_back(file.size());
        file += std::to_string(i + 1) + " 0 obj\n" + objects[i] + "\nendobj\n";
    }
    std::size_t const table = file.size();
    file += "xref\n0 " + std::to_string(objects.size() + 1) + "\n0000000000 65535 f \n";
    for (std::size_t const place : places) {
        std::string const digits = std::to_string(place);
        file += std::string(10 - digits.size(), '0') + digits + " 00000 n \n";
    }
    file += "trailer\n<</Root 1 0 R/Size " + std::to_string(objects.size() + 1) + ">>\nstartxref\n" +
            std::to_string(table) + "\n%%EOF\n";
    return ToBytes(file);
}

Raster::Picture::Bytes SvgWith(std::string const & content)
{
    return ToBytes("<?xml version=\"1.0\"?>\n<svg xmlns=\"http://www.w3.org/2000/svg\" "
                   "xmlns:xlink=\"http://www.w3.org/1999/xlink\" width=\"100\" height=\"50\">" +
                   content + "</svg>\n");
}
