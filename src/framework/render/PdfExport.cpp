#include "framework/render/PdfExport.h"

#include "framework/kernel/Assert.h"
#include "framework/kernel/Clock.h"
#include "framework/kernel/Format.h"
#include "framework/kernel/OutStream.h"
#include "framework/render/PdfContent.h"
#include "framework/render/PdfDrawings.h"
#include "framework/render/PdfFile.h"
#include "framework/render/PdfMarks.h"
#include "framework/render/PdfPictures.h"

#include <map>
#include <qpdf/Pipeline.hh>
#include <stdexcept>

namespace Renderer::RenderTree
{

namespace
{

/// Why an output that was stopped has no file.
class Aborted : public std::runtime_error
{
public:
    Aborted() : std::runtime_error("The output was stopped.") {}
};

/// Gathers libqpdf's small pieces for the stream. libqpdf finishes its pipelines in destructors, so nothing may be thrown
/// through it: what goes wrong is kept, and the rest is swallowed.
class StreamPipeline : public Pipeline
{
public:
    StreamPipeline(Kernel::OutStream & stream, PdfSchema const & schema)
        : Pipeline("output", nullptr), m_Stream(stream), m_Schema(schema)
    {
        m_Buffer.reserve(BufferSize);
    }

    void write(unsigned char const * data, std::size_t size) override
    {
        if (m_Buffer.size() + size > BufferSize) {
            Flush();
        }
        m_Buffer.insert(m_Buffer.end(), data, data + size);
    }

    void finish() override { Flush(); }

    /// Throws what has gone wrong.
    void Check() const
    {
        if (m_Failure) {
            std::rethrow_exception(m_Failure);
        }
    }

private:
    static constexpr std::size_t BufferSize = std::size_t(1) << 16;

    void Flush()
    {
        if (!m_Failure) {
            try {
                if (m_Schema.IsAborted()) {
                    throw Aborted();
                }
                m_Stream.Write(m_Buffer.data(), m_Buffer.size());
            } catch (...) {
                m_Failure = std::current_exception();
            }
        }
        m_Buffer.clear();
    }

    Kernel::OutStream & m_Stream;
    PdfSchema const & m_Schema;
    std::vector<unsigned char> m_Buffer;
    std::exception_ptr m_Failure;
};

Kernel::Rect Mapped(Kernel::Rect const & rect, Raster::AffineTransform::Params const & toPage)
{
    if (rect.IsEmpty()) {
        return rect;
    }
    Kernel::Point const topLeft = toPage.Map({rect.left, rect.top});
    Kernel::Point const bottomRight = toPage.Map({rect.right, rect.bottom});
    return {topLeft.x, topLeft.y, bottomRight.x, bottomRight.y};
}

}

class PdfExport::State
{
public:
    explicit State(Kernel::Counted<PdfSchema> schema)
        : m_Schema(std::move(schema)), m_Pictures(*m_Schema, m_File.m_Resources, m_Spill),
          m_Content(
              *m_Schema, m_File.m_Resources, [this](std::string content) { return StoreForm(content); },
              [this](PlacedPicture const & placed, Kernel::Size const & size, std::uint32_t & image) {
                  return m_Pictures.ImageFor(placed, size, image);
              },
              [this](PlacedDrawing const & drawing, std::uint32_t & form) {
                  return m_Drawings.FormFor(drawing, form);
              })
    {
    }

    [[nodiscard]] bool IsUsable() const { return m_Stream && m_Error.Empty() && !m_Closed; }

    void Fail(String const & error)
    {
        if (m_Error.Empty()) {
            m_Error = error;
        }
    }

    SpillRange StoreForm(std::string_view content)
    {
        std::string_view const packed = m_Deflater.Compress(content, PdfCompressor::Deflater::Effort::Quick);
        return m_Spill.Append(packed.data(), packed.size());
    }

    std::uint32_t NumberOfBoxes(PageBoxes const & boxes)
    {
        // Nearly all pages of a file have the boxes of one of the last few.
        std::size_t const last = m_File.m_Boxes.size();
        for (std::size_t i = last; i-- > 0 && i + 8 >= last;) {
            if (m_File.m_Boxes[i] == boxes) {
                return static_cast<std::uint32_t>(i);
            }
        }
        m_File.m_Boxes.push_back(boxes);
        return static_cast<std::uint32_t>(last);
    }

    void AddLink(PdfHyperlink const & link, Raster::AffineTransform::Params const & toPage);
    /// Tells of fonts and characters of the content that was written last.
    void WarnOfContent(std::vector<Warning> * warnings, int page);
    /// Packs a content stream on the thread beside; `range` says where it has gone to, and stays where it is.
    void Pack(std::string text, SpillRange & range);

    Kernel::Counted<PdfSchema> m_Schema;
    Kernel::Counted<Kernel::OutStream> m_Stream;
    String m_Filename;
    String m_Error;
    bool m_Closed = false;
    /// Forms for sheets so far, for warnings.
    int m_FormPages = 0;
    PdfFile m_File;
    PdfSpill m_Spill;
    PdfCompressor::Deflater m_Deflater;
    PdfPictures m_Pictures;
    PdfObjects m_Objects{m_Spill};
    PdfDrawings m_Drawings{m_Objects, m_Spill};
    PdfContent m_Content;
    std::map<PdfAddress, std::uint32_t> m_AddressNumbers;
    /// Last, so that its thread ends before what it works on goes.
    PdfCompressor m_Compressor;
};

void PdfExport::State::AddLink(PdfHyperlink const & link, Raster::AffineTransform::Params const & toPage)
{
    PdfLinkRecord record;
    record.m_Rect = Mapped(link.m_Rect, toPage);
    if (link.m_Kind == PdfHyperlink::Resource || link.m_Kind == PdfHyperlink::OtherPdf) {
        PdfAddress const address{link.m_Target, link.m_Kind == PdfHyperlink::OtherPdf};
        auto const [place, added] =
            m_AddressNumbers.try_emplace(address, static_cast<std::uint32_t>(m_File.m_Addresses.size()));
        if (added) {
            m_File.m_Addresses.push_back(address);
        }
        record.m_Address = place->second + 1;
    } else {
        record.m_Target.m_Page = link.m_Page;
        record.m_Target.m_HasPosition = link.m_Kind == PdfHyperlink::Position;
        record.m_Target.m_FromTopLeft = static_cast<bool>(link.m_PrintersMarks);
        record.m_Target.m_Position =
            link.m_PrintersMarks ? link.m_PrintersMarks->FromTopLeft(link.m_Position) : link.m_Position;
    }
    m_File.m_Links.push_back(record);
}

void PdfExport::State::WarnOfContent(std::vector<Warning> * warnings, int page)
{
    if (!warnings) {
        return;
    }
    for (Typeset::FontFace const * face : m_Content.GetForbiddenFonts()) {
        warnings->push_back({Warning::Code::FontNotEmbeddable, page, face->GetPath(),
                             Kernel::Format(Kernel::LocalisedString("The licence of the font %1 forbids embedding it; "
                                                                    "its text is drawn as outlines.",
                                                                    "Output"),
                                            face->GetPostScriptName())});
    }
    if (m_Content.HadMissingGlyph()) {
        warnings->push_back(
            {Warning::Code::GlyphMissing, page, String(),
             Kernel::LocalisedString("The page has a character that no installed font contains.", "Output")});
    }
}

void PdfExport::State::Pack(std::string text, SpillRange & range)
{
    std::size_t const size = text.size();
    m_Compressor.Add(size, [&spill = m_Spill, &range, text = std::move(text)](PdfCompressor::Deflater & deflater) {
        std::string_view const packed = deflater.Compress(text, PdfCompressor::Deflater::Effort::Quick);
        range = spill.Append(packed.data(), packed.size());
    });
}

PdfExport::PdfExport(Kernel::Counted<PdfSchema> schema, Kernel::Counted<Kernel::UnitValueConverter const>)
    : m_State(std::make_unique<State>(std::move(schema)))
{
}

PdfExport::~PdfExport() = default;

bool PdfExport::Create(char const * filename, Kernel::Counted<Kernel::OutStream> const & stream,
                       String const & subject, String const & title, String const & author, String const & tags)
{
    KORVANE_ASSERT(stream && !m_State->m_Stream);
    FileExportOptionsPDF::Settings const & settings = m_State->m_Schema->GetOptions().GetSettings();
    PdfInfo & info = m_State->m_File.m_Info;
    info.m_Subject = subject;
    info.m_Title = title;
    info.m_Author = author;
    info.m_Tags = tags;
    info.m_Language = settings.m_Language;
    info.m_Time = settings.m_FixedTime ? *settings.m_FixedTime
                                       : Kernel::Clock::Get().Now().Nanoseconds() / 1'000'000'000;
    m_State->m_Filename = filename;
    std::string error;
    if (!m_State->m_Spill.Open(error)) {
        m_State->Fail(error);
        return false;
    }
    m_State->m_Stream = stream;
    return true;
}

String const & PdfExport::GetFilename() const
{
    return m_State->m_Filename;
}

PdfSchema const & PdfExport::GetSchema() const
{
    return *m_State->m_Schema;
}

int PdfExport::AddForm(DisplayList const & content, Kernel::Rect const & bounds, std::vector<Warning> * warnings)
{
    State & state = *m_State;
    if (!state.IsUsable() || state.m_Schema->IsAborted()) {
        return -1;
    }
    KORVANE_ASSERT(!bounds.IsEmpty());
    try {
        PdfResources & resources = state.m_File.m_Resources;
        state.m_Pictures.BeginPage(++state.m_FormPages, warnings);
        state.m_Drawings.BeginPage(state.m_FormPages, warnings);
        PdfUses uses;
        std::string text = state.m_Content.Write({}, {&content}, PdfContent::ToForm, uses);
        state.WarnOfContent(warnings, state.m_FormPages);
        PdfForm form;
        form.m_Bounds = Mapped(bounds, PdfContent::ToForm);
        form.m_IsGroup = false;
        form.m_Uses = resources.AddUses(uses);
        std::uint32_t const number = resources.AddForm(form);
        state.Pack(std::move(text), resources.GetForm(number).m_Data);
        return static_cast<int>(number);
    } catch (std::exception const & exception) {
        state.Fail(exception.what());
    }
    return -1;
}

bool PdfExport::WritePage(PdfPage const & page, DisplayList const & content, std::vector<PdfHyperlink> const & links,
                          std::vector<Warning> * warnings)
{
    State & state = *m_State;
    if (!state.IsUsable() || state.m_Schema->IsAborted()) {
        return false;
    }
    KORVANE_ASSERT(!page.m_Boxes.m_Media.IsEmpty());
    try {
        Kernel::Rect const & media = page.m_Boxes.m_Media;
        Raster::AffineTransform::Params const toPage{1, 0, 0, -1, -media.left, media.bottom};
        PageBoxes boxes;
        boxes.m_Media = Mapped(page.m_Boxes.m_Media, toPage);
        boxes.m_Crop = Mapped(page.m_Boxes.m_Crop, toPage);
        boxes.m_Bleed = Mapped(page.m_Boxes.m_Bleed, toPage);
        boxes.m_Trim = Mapped(page.m_Boxes.m_Trim, toPage);
        boxes.m_Art = Mapped(page.m_Boxes.m_Art, toPage);

        state.m_Pictures.BeginPage(GetPageCount() + 1, warnings);
        state.m_Drawings.BeginPage(GetPageCount() + 1, warnings);
        DisplayList marks;
        if (page.m_PrintersMarks) {
            DrawPrintersMarks(*page.m_PrintersMarks, page.m_Boxes.GetTrim(), marks);
        }
        PdfUses uses;
        std::string text = state.m_Content.Write(page.m_Forms, {&marks, &content}, toPage, uses);
        state.WarnOfContent(warnings, GetPageCount() + 1);

        PdfPageRecord record;
        record.m_Uses = state.m_File.m_Resources.AddUses(uses);
        record.m_Boxes = state.NumberOfBoxes(boxes);
        record.m_Origin = {page.m_Boxes.GetTrim().left, page.m_Boxes.GetTrim().top};
        record.m_Label = page.m_Label;
        record.m_Continues = static_cast<std::uint8_t>(page.m_ContinuesSpread);
        record.m_FirstLink = static_cast<std::uint32_t>(state.m_File.m_Links.size());
        for (PdfHyperlink const & link : links) {
            state.AddLink(link, toPage);
        }
        record.m_LinkCount = static_cast<std::uint32_t>(state.m_File.m_Links.size()) - record.m_FirstLink;
        state.m_File.m_Pages.push_back(record);
        state.Pack(std::move(text), state.m_File.m_Pages.back().m_Content);
    } catch (std::exception const & exception) {
        state.Fail(exception.what());
    }
    return state.m_Error.Empty();
}

int PdfExport::GetPageCount() const
{
    return static_cast<int>(m_State->m_File.m_Pages.size());
}

void PdfExport::AddBookmarks(std::vector<Kernel::Counted<PdfBookmark const>> const & bookmarks)
{
    std::vector<Kernel::Counted<PdfBookmark const>> & all = m_State->m_File.m_Bookmarks;
    all.insert(all.end(), bookmarks.begin(), bookmarks.end());
}

bool PdfExport::Close()
{
    State & state = *m_State;
    if (state.m_Closed || !state.m_Stream) {
        return state.m_Closed && state.m_Error.Empty();
    }
    if (state.m_File.m_Pages.empty()) {
        state.Fail(Kernel::LocalisedString("There is no page to write.", "Output"));
    }
    if (state.m_Schema->IsAborted()) {
        state.Fail(Aborted().what());
    }
    if (state.m_Error.Empty()) {
        try {
            StreamPipeline pipeline(*state.m_Stream, *state.m_Schema);
            state.m_Compressor.Finish();
            WritePdfFile(state.m_File, state.m_Objects, state.m_Drawings, state.m_Compressor, *state.m_Schema, pipeline);
            pipeline.Check();
        } catch (std::exception const & exception) {
            // Data that could not be kept are the cause of what libqpdf then misses.
            std::string const error = state.m_Spill.GetError();
            state.Fail(error.empty() ? exception.what() : error);
        }
        if (std::string const error = state.m_Spill.GetError(); !error.empty()) {
            state.Fail(error);
        }
    }
    state.m_Closed = true;
    return state.m_Error.Empty();
}

String const & PdfExport::GetError() const
{
    return m_State->m_Error;
}

}
