#include "framework/render/PdfObjects.h"

#include <algorithm>
#include <stdexcept>

namespace Renderer::RenderTree
{

/// Gives libqpdf the streams' bytes out of the spill when it writes them.
class PdfObjects::SpillProvider : public Handle::StreamDataProvider
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

PdfObjects::PdfObjects(PdfSpill & spill) : m_Spill(spill), m_Provider(std::make_shared<SpillProvider>(spill))
{
    m_Pdf.emptyPDF();
}

QPDFObjectHandle PdfObjects::Name(char const * name)
{
    Handle & known = m_Names[name];
    return known.isInitialized() ? known : known = Handle::newName(name);
}

QPDFObjectHandle PdfObjects::Number(double value)
{
    Thousandths const thousandths = ToThousandths(value);
    auto const known = m_Numbers.find(thousandths);
    if (known != m_Numbers.end()) {
        return known->second;
    }
    Handle number;
    if (thousandths % 1000 == 0) {
        number = Handle::newInteger(thousandths / 1000);
    } else {
        std::string text;
        AppendThousandths(text, thousandths);
        number = Handle::newReal(text);
    }
    if (m_Numbers.size() < MostNumbers) {
        m_Numbers.emplace(thousandths, number);
    }
    return number;
}

QPDFObjectHandle PdfObjects::Text(String const & text)
{
    return Handle::newString(TextString(text.View()));
}

QPDFObjectHandle PdfObjects::Box(Kernel::Rect const & rect)
{
    return Handle::newArray({Number(rect.left), Number(rect.bottom), Number(rect.right), Number(rect.top)});
}

QPDFObjectHandle PdfObjects::SpilledStream(SpillRange const & range, char const * filter)
{
    Handle stream = Handle::newStream(&m_Pdf);
    m_Provider->Add(stream, range);
    stream.replaceStreamData(m_Provider, filter ? Name(filter) : Handle::newNull(), Handle::newNull());
    return stream;
}

QPDFObjectHandle PdfObjects::MakeProfile(Raster::ICCProfile const & profile)
{
    std::vector<unsigned char> const & bytes = profile.GetBytes();
    std::string_view const data(reinterpret_cast<char const *>(bytes.data()), bytes.size());
    PdfCompressor::Deflater deflater;
    std::string_view const packed = deflater.Compress(data, PdfCompressor::Deflater::Effort::Thorough);
    Handle stream = SpilledStream(m_Spill.Append(packed.data(), packed.size()), "/FlateDecode");
    stream.getDict().replaceKey("/N", Handle::newInteger(Raster::ChannelCount(profile.GetSpace())));
    return stream;
}

}
