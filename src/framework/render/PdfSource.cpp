#include "framework/render/PdfSource.h"

#include "framework/kernel/Format.h"
#include "framework/render/PdfBombGuard.h"

#include <algorithm>
#include <charconv>
#include <cmath>
#include <qpdf/QPDFExc.hh>
#include <qpdf/QUtil.hh>
#include <set>
#include <stdexcept>

namespace Renderer::RenderTree
{

namespace
{

using Code = Raster::PictureProblem::Code;
using Handle = QPDFObjectHandle;

/// Collects what is unpacked, up to the limit.
class BoundedString : public Pipeline
{
public:
    explicit BoundedString(std::string & text) : Pipeline("content", nullptr), m_Text(text) {}

    void write(unsigned char const * data, std::size_t size) override
    {
        if (PdfSource::LargestUnpacked - std::min(PdfSource::LargestUnpacked, m_Text.size()) < size) {
            throw std::runtime_error("unpacks to too much");
        }
        m_Text.append(reinterpret_cast<char const *>(data), size);
    }
    void finish() override {}

private:
    std::string & m_Text;
};

/// Four numbers in whatever order of corners; nothing if it is no sane rectangle.
std::optional<Kernel::Rect> ReadBox(Handle box)
{
    if (!box.isArray() || 4 != box.getArrayNItems()) {
        return std::nullopt;
    }
    double numbers[4];
    for (int i = 0; i < 4; ++i) {
        if (!box.getArrayItem(i).getValueAsNumber(numbers[i]) || !std::isfinite(numbers[i])) {
            return std::nullopt;
        }
    }
    Kernel::Rect const rect{std::min(numbers[0], numbers[2]), std::max(numbers[1], numbers[3]),
                            std::max(numbers[0], numbers[2]), std::min(numbers[1], numbers[3])};
    return rect.left < rect.right && rect.bottom < rect.top ? std::optional(rect) : std::nullopt;
}

/// What a page takes over from the nodes above it (ISO 32000-2, 7.7.3.4).
struct Inherited
{
    Handle m_Media = Handle::newNull();
    Handle m_Crop = Handle::newNull();
    Handle m_Rotation = Handle::newNull();
    Handle m_Resources = Handle::newNull();

    void TakeFrom(Handle & node)
    {
        for (auto const & [name, value] : {std::pair("/MediaBox", &m_Media), {"/CropBox", &m_Crop},
                                           {"/Rotate", &m_Rotation}, {"/Resources", &m_Resources}}) {
            if (node.hasKey(name)) {
                *value = node.getKey(name);
            }
        }
    }
};

PdfSource::Page MakePage(Handle object, Inherited const & inherited)
{
    PdfSource::Page page;
    page.m_Object = object;
    page.m_Resources = inherited.m_Resources;
    // Letter is what readers fall back to.
    page.m_Box = ReadBox(inherited.m_Media).value_or(Kernel::Rect{0, 792, 612, 0});
    if (std::optional<Kernel::Rect> const crop = ReadBox(inherited.m_Crop)) {
        Kernel::Rect const both{std::max(page.m_Box.left, crop->left), std::min(page.m_Box.top, crop->top),
                                std::min(page.m_Box.right, crop->right), std::max(page.m_Box.bottom, crop->bottom)};
        if (both.left < both.right && both.bottom < both.top) {
            page.m_Box = both;
        }
    }
    int degrees = 0;
    if (Handle(inherited.m_Rotation).getValueAsInt(degrees)) {
        page.m_Turns = (degrees / 90 % 4 + 4) % 4;
    }
    double unit = 1;
    if (object.getKey("/UserUnit").getValueAsNumber(unit) && std::isfinite(unit) && 0 < unit) {
        page.m_Unit = unit;
    }
    return page;
}

void ReportDamage(Raster::PictureProblem & problem, String const & path, std::exception const & fault)
{
    auto const * const known = dynamic_cast<QPDFExc const *>(&fault);
    if (known && qpdf_e_password == known->getErrorCode()) {
        Raster::Report(problem, Code::Locked, path, Kernel::LocalisedString("is protected by a password", "Picture"));
    } else if (known && qpdf_e_unsupported == known->getErrorCode()) {
        Raster::Report(problem, Code::Unsupported, path, Kernel::LocalisedString("can't be read (%1)", "Picture"),
                       String(known->getMessageDetail()));
    } else {
        Raster::Report(problem, Code::Corrupt, path, Kernel::LocalisedString("is damaged (%1)", "Picture"),
                       String(known ? known->getMessageDetail() : std::string(fault.what())));
    }
}

}

Kernel::Size PdfSource::Page::GetSize() const
{
    double const width = (m_Box.right - m_Box.left) * m_Unit;
    double const height = (m_Box.top - m_Box.bottom) * m_Unit;
    return m_Turns % 2 == 1 ? Kernel::Size{height, width} : Kernel::Size{width, height};
}

std::string PdfSource::Page::GetMatrix() const
{
    double const w = m_Box.right - m_Box.left;
    double const h = m_Box.top - m_Box.bottom;
    double const l = m_Box.left;
    double const b = m_Box.bottom;
    double const matrices[4][6] = {{1 / w, 0, 0, 1 / h, -l / w, -b / h},
                                   {0, -1 / w, 1 / h, 0, -b / h, 1 + l / w},
                                   {-1 / w, 0, 0, -1 / h, 1 + l / w, 1 + b / h},
                                   {0, 1 / w, -1 / h, 0, 1 + b / h, -l / w}};
    std::string text = "[";
    for (double const value : matrices[m_Turns]) {
        // PDF has no exponents.
        char number[400];
        text.append(number, std::to_chars(number, std::end(number), value, std::chars_format::fixed, 12).ptr);
        text += ' ';
    }
    return text + "]";
}

std::unique_ptr<PdfSource> PdfSource::Open(Bytes bytes, String const & path, String const & password,
                                           Raster::PictureProblem & problem)
{
    if (UnpacksTooFar(*bytes, LargestUnpacked)) {
        Raster::Report(problem, Code::TooLarge, path,
                       Kernel::LocalisedString("unpacks to more than any drawing needs", "Picture"));
        return nullptr;
    }
    // Before revision 6 passwords were not in UTF-8: the other ways to write it are tried too.
    std::vector<std::string> passwords{password.ToStd()};
    if (!password.Empty()) {
        passwords = QUtil::possible_repaired_encodings(password.ToStd());
    }
    for (std::string const & attempt : passwords) {
        std::unique_ptr<PdfSource> source(new PdfSource);
        source->m_Path = path;
        source->m_Bytes = bytes;
        source->m_Pdf.setSuppressWarnings(true);
        try {
            source->m_Pdf.processMemoryFile("", reinterpret_cast<char const *>(bytes->data()), bytes->size(),
                                            attempt.c_str());
            return source;
        } catch (std::exception const & fault) {
            problem = {};
            ReportDamage(problem, path, fault);
        }
        if (Code::Locked != problem.m_Code) {
            break;
        }
    }
    return nullptr;
}

std::optional<PdfSource::Page> PdfSource::FindPage(int number, Raster::PictureProblem & problem)
{
    try {
        std::vector<std::pair<Handle, Inherited>> waiting{{m_Pdf.getRoot().getKey("/Pages"), {}}};
        std::set<QPDFObjGen> seen;
        int count = 0;
        while (!waiting.empty()) {
            auto [node, inherited] = waiting.back();
            waiting.pop_back();
            if (!node.isDictionary() || (node.isIndirect() && !seen.insert(node.getObjGen()).second)) {
                continue;
            }
            inherited.TakeFrom(node);
            Handle kids = node.getKey("/Kids");
            if (kids.isArray()) {
                for (int i = kids.getArrayNItems(); 0 < i--;) {
                    waiting.emplace_back(kids.getArrayItem(i), inherited);
                }
            } else if (++count == number) {
                return MakePage(node, inherited);
            }
        }
        Raster::Report(problem, Code::NoSuchPage, m_Path,
                       0 == count
                           ? Kernel::LocalisedString("has no page", "Picture")
                           : Kernel::LocalisedString("has no page of that number; its last one is %1", "Picture"),
                       Kernel::Format("%1", count));
    } catch (std::exception const & fault) {
        ReportDamage(problem, m_Path, fault);
    }
    return std::nullopt;
}

PdfSource::Content PdfSource::ReadContent(Page const & page)
{
    Content content;
    content.m_Filter = Handle::newNull();
    content.m_Parameters = Handle::newNull();
    Handle contents = Handle(page.m_Object).getKey("/Contents");
    if (contents.isStream()) {
        std::shared_ptr<Buffer> const raw = contents.getRawStreamData();
        content.m_Bytes.assign(reinterpret_cast<char const *>(raw->getBuffer()), raw->getSize());
        content.m_Filter = contents.getDict().getKey("/Filter");
        content.m_Parameters = contents.getDict().getKey("/DecodeParms");
        return content;
    }
    int const count = contents.isArray() ? contents.getArrayNItems() : 0;
    BoundedString plain(content.m_Bytes);
    for (int i = 0; i < count; ++i) {
        Handle part = contents.getArrayItem(i);
        // The parts are one text; an operator never goes over their ends.
        content.m_Bytes += '\n';
        bool unpacked = false;
        if (part.isStream() &&
            !(part.pipeStreamData(&plain, &unpacked, 0, qpdf_dl_generalized, true) && unpacked)) {
            throw std::runtime_error("a part of the page can't be unpacked");
        }
    }
    return content;
}

std::string PdfSource::TakeWarning()
{
    std::vector<QPDFExc> const warnings = m_Pdf.getWarnings();
    return warnings.empty() ? std::string() : warnings.front().getMessageDetail();
}

}
