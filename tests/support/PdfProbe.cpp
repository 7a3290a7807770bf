#include "support/PdfProbe.h"
#include "framework/render/Qpdf.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <cstdio>
#include <functional>
#include <gtest/gtest.h>
#include <map>
#include <sstream>

namespace
{

std::string Quoted(String const & path)
{
    return "'" + path.ToStd() + "'";
}

std::string Rounded(QPDFObjectHandle number)
{
    return std::to_string(std::lround(number.getNumericValue()));
}

std::string Utf8(QPDFObjectHandle text)
{
    return text.isString() ? text.getUTF8Value() : text.unparse();
}

}

std::string RunCommand(std::string const & command)
{
    std::unique_ptr<FILE, int (*)(FILE *)> const pipe(popen((command + " 2>&1").c_str(), "r"), pclose);
    std::string output;
    std::array<char, 4096> buffer;
    while (std::size_t const size = pipe ? fread(buffer.data(), 1, buffer.size(), pipe.get()) : 0) {
        output.append(buffer.data(), size);
    }
    return output;
}

PdfProbe::PdfProbe(String const & path) : m_Path(path), m_Pdf(std::make_unique<QPDF>())
{
    m_Pdf->processFile(path.c_str());
}

PdfProbe::~PdfProbe() = default;

std::string PdfProbe::Check() const
{
    std::string const output = RunCommand("qpdf --check " + Quoted(m_Path));
    std::string complaints;
    std::istringstream lines(output);
    for (std::string line; std::getline(lines, line);) {
        bool const harmless = line.starts_with("checking ") || line.starts_with("PDF Version") ||
                              line == "File is not encrypted" || line == "File is not linearized" ||
                              line.starts_with("No syntax or stream encoding errors found") ||
                              line == "errors that qpdf cannot detect";
        complaints += harmless ? "" : line + "\n";
    }
    for (QPDFExc const & warning : m_Pdf->getWarnings()) {
        complaints += warning.what() + std::string("\n");
    }
    return complaints;
}

int PdfProbe::PageCount() const
{
    return static_cast<int>(m_Pdf->getAllPages().size());
}

std::string PdfProbe::Content(int page) const
{
    QPDFObjectHandle object = m_Pdf->getAllPages().at(static_cast<std::size_t>(page - 1));
    QPDFObjectHandle contents = object.getKey("/Contents");
    auto const data = contents.getStreamData();
    return std::string(reinterpret_cast<char const *>(data->getBuffer()), data->getSize());
}

static QPDFObjectHandle Find(QPDF & pdf, std::string const & path)
{
    QPDFObjectHandle object = pdf.getRoot();
    std::istringstream parts(path);
    bool first = true;
    for (std::string part; std::getline(parts, part, '/'); first = false) {
        bool const number = std::all_of(part.begin(), part.end(), [](char c) { return c >= '0' && c <= '9'; });
        if (first && number) {
            object = pdf.getAllPages().at(std::stoul(part) - 1);
        } else if (number && object.isArray()) {
            object = object.getArrayItem(std::stoi(part));
        } else if (object.isStream()) {
            object = object.getDict().getKey("/" + part);
        } else {
            object = object.isDictionary() ? object.getKey("/" + part) : QPDFObjectHandle::newNull();
        }
    }
    return object;
}

std::string PdfProbe::Value(std::string const & path) const
{
    QPDFObjectHandle object = Find(*m_Pdf, path);
    return object.isStream() ? object.getDict().unparseResolved() : object.unparseResolved();
}

std::string PdfProbe::Stream(std::string const & path) const
{
    auto const data = Find(*m_Pdf, path).getStreamData(qpdf_dl_generalized);
    return std::string(reinterpret_cast<char const *>(data->getBuffer()), data->getSize());
}

std::vector<std::string> PdfProbe::Labels() const
{
    std::vector<std::string> labels;
    QPDFPageLabelDocumentHelper helper(*m_Pdf);
    for (int page = 0; page < PageCount(); ++page) {
        QPDFObjectHandle entry = helper.getLabelForPage(page);
        std::string label;
        if (!entry.isNull()) {
            label = entry.hasKey("/P") ? entry.getKey("/P").getUTF8Value() : "";
            std::string const style = entry.hasKey("/S") ? entry.getKey("/S").getName() : "";
            long long number = entry.hasKey("/St") ? entry.getKey("/St").getIntValue() : 1;
            if (style == "/D") {
                label += std::to_string(number);
            } else if (!style.empty()) {
                static constexpr std::pair<int, char const *> numerals[] = {
                    {1000, "m"}, {900, "cm"}, {500, "d"}, {400, "cd"}, {100, "c"}, {90, "xc"}, {50, "l"},
                    {40, "xl"},  {10, "x"},   {9, "ix"},  {5, "v"},    {4, "iv"},  {1, "i"}};
                std::string roman;
                for (auto const & [value, text] : numerals) {
                    for (; number >= value; number -= value) {
                        roman += text;
                    }
                }
                if (style == "/R") {
                    std::transform(roman.begin(), roman.end(), roman.begin(), ::toupper);
                }
                label += roman;
            }
        }
        labels.push_back(label);
    }
    return labels;
}

std::string PdfProbe::Target(void * annotationOrItem) const
{
    QPDFObjectHandle & object = *static_cast<QPDFObjectHandle *>(annotationOrItem);
    if (object.hasKey("/A")) {
        QPDFObjectHandle action = object.getKey("/A");
        return action.hasKey("/URI") ? Utf8(action.getKey("/URI")) : "file " + Utf8(action.getKey("/F").getKey("/UF"));
    }
    QPDFObjectHandle const destination = object.getKey("/Dest");
    if (!QPDFObjectHandle(destination).isArray()) {
        return "nowhere";
    }
    QPDFObjectHandle place = destination;
    std::vector<QPDFObjectHandle> const & pages = m_Pdf->getAllPages();
    auto const found = std::find_if(pages.begin(), pages.end(), [&](QPDFObjectHandle page) {
        return page.getObjGen() == place.getArrayItem(0).getObjGen();
    });
    return "page " + std::to_string(found - pages.begin() + 1) + " (" + Rounded(place.getArrayItem(2)) + ", " +
           Rounded(place.getArrayItem(3)) + ")";
}

std::string PdfProbe::Outline() const
{
    std::string text;
    std::function<void(QPDFObjectHandle, int)> const walk = [&](QPDFObjectHandle parent, int level) {
        for (QPDFObjectHandle item = parent.getKey("/First"); item.isDictionary(); item = item.getKey("/Next")) {
            bool const open = item.hasKey("/Count") && item.getKey("/Count").getIntValue() > 0;
            text += std::string(static_cast<std::size_t>(level) * 2, ' ') + (open ? "+" : "") +
                    Utf8(item.getKey("/Title")) + " -> " + Target(&item) + "\n";
            walk(item, level + 1);
        }
    };
    QPDFObjectHandle root = m_Pdf->getRoot().getKey("/Outlines");
    if (root.isDictionary()) {
        walk(root, 0);
    }
    return text;
}

std::string PdfProbe::Links(int page) const
{
    std::string text;
    QPDFObjectHandle object = m_Pdf->getAllPages().at(static_cast<std::size_t>(page - 1));
    QPDFObjectHandle links = object.getKey("/Annots");
    for (int i = 0; links.isArray() && i < links.getArrayNItems(); ++i) {
        QPDFObjectHandle link = links.getArrayItem(i);
        QPDFObjectHandle rect = link.getKey("/Rect");
        text += Rounded(rect.getArrayItem(0)) + " " + Rounded(rect.getArrayItem(1)) + " " +
                Rounded(rect.getArrayItem(2)) + " " + Rounded(rect.getArrayItem(3)) + " -> " + Target(&link) + "\n";
    }
    return text;
}

std::string PdfProbe::Text(int page) const
{
    std::string const number = std::to_string(page);
    std::string text = RunCommand("pdftotext -enc UTF-8 -f " + number + " -l " + number + " " + Quoted(m_Path) + " -");
    text.erase(std::remove(text.begin(), text.end(), '\f'), text.end());
    return text;
}

std::string PdfProbe::Fonts() const
{
    std::istringstream lines(RunCommand("pdffonts " + Quoted(m_Path)));
    std::string text;
    for (std::string line; std::getline(lines, line);) {
        if (line.find("Identity-H") != std::string::npos) {
            text += line + "\n";
        }
    }
    return text;
}

unsigned PdfProbe::Image::At(int x, int y) const
{
    std::size_t const at = (static_cast<std::size_t>(y) * static_cast<std::size_t>(m_Width) + static_cast<std::size_t>(x)) * 3;
    auto const byte = [this](std::size_t i) { return static_cast<unsigned>(static_cast<unsigned char>(m_Rgb.at(i))); };
    return byte(at) << 16 | byte(at + 1) << 8 | byte(at + 2);
}

PdfProbe::Image PdfProbe::Draw(int page) const
{
    std::string const number = std::to_string(page);
    std::string const ppm = RunCommand("pdftoppm -r 72 -f " + number + " -l " + number + " " + Quoted(m_Path));
    Image image;
    std::istringstream stream(ppm);
    std::string magic;
    int most = 0;
    stream >> magic >> image.m_Width >> image.m_Height >> most;
    EXPECT_EQ(magic, "P6") << ppm.substr(0, 200);
    stream.get();
    image.m_Rgb.assign(std::istreambuf_iterator<char>(stream), {});
    return image;
}
