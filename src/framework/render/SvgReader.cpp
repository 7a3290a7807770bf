#include "framework/render/SvgReader.h"

#include "framework/kernel/Uri.h"
#include "framework/render/CairoBitmap.h"

#include <algorithm>
#include <array>
#include <cairo-pdf.h>
#include <librsvg/rsvg.h>
#include <memory>
#include <string_view>

namespace Renderer::RenderTree
{

namespace
{

using Code = Raster::PictureProblem::Code;

/// CSS's unit (96 to the inch) in points.
constexpr double PointsPerPixel = 0.75;
/// Points of the PDF page to one of the drawing, so that what becomes pixels on the way has enough of them.
constexpr double PageScale = 4;
constexpr double LargestPage = 14400;

struct ObjectDeleter
{
    void operator()(void * object) const { g_object_unref(object); }
};
using HandlePtr = std::unique_ptr<RsvgHandle, ObjectDeleter>;

/// A sentence's end from an error, which is taken.
std::string TakeText(GError * error)
{
    std::string text = error ? error->message : "it says nothing more";
    g_clear_error(&error);
    std::replace(text.begin(), text.end(), '\n', ' ');
    return text;
}

HandlePtr Open(std::vector<unsigned char> const & bytes, String const & path, Raster::PictureProblem & problem)
{
    std::unique_ptr<GInputStream, ObjectDeleter> const stream(
        g_memory_input_stream_new_from_data(bytes.data(), static_cast<gssize>(bytes.size()), nullptr));
    std::unique_ptr<GFile, ObjectDeleter> const base(path.Empty() ? nullptr : g_file_new_for_path(path.c_str()));
    GError * error = nullptr;
    HandlePtr handle(
        rsvg_handle_new_from_stream_sync(stream.get(), base.get(), RSVG_HANDLE_FLAGS_NONE, nullptr, &error));
    if (!handle) {
        Raster::Report(problem, Code::Corrupt, path, Kernel::LocalisedString("is damaged (%1)", "Picture"),
                       TakeText(error));
        return nullptr;
    }
    rsvg_handle_set_dpi(handle.get(), 96);
    return handle;
}

bool Render(RsvgHandle * handle, cairo_t * context, double width, double height, String const & path,
            Raster::PictureProblem & problem)
{
    RsvgRectangle const viewport{0, 0, width, height};
    GError * error = nullptr;
    if (!rsvg_handle_render_document(handle, context, &viewport, &error)) {
        Raster::Report(problem, Code::Corrupt, path, Kernel::LocalisedString("can't be drawn (%1)", "Picture"),
                       TakeText(error));
        return false;
    }
    return true;
}

cairo_status_t Append(void * target, unsigned char const * data, unsigned int size)
{
    static_cast<std::vector<unsigned char> *>(target)->insert(static_cast<std::vector<unsigned char> *>(target)->end(),
                                                              data, data + size);
    return CAIRO_STATUS_SUCCESS;
}

/// The way to a file that an address names; empty if it names something else, or a file that is out of reach.
String FileOfAddress(std::string_view address)
{
    static constexpr std::array<std::pair<std::string_view, char>, 5> Entities{
        {{"&amp;", '&'}, {"&lt;", '<'}, {"&gt;", '>'}, {"&quot;", '"'}, {"&apos;", '\''}}};
    std::string plain;
    for (address = address.substr(0, address.find('#')); !address.empty();) {
        auto const entity = std::find_if(Entities.begin(), Entities.end(),
                                         [address](auto const & entry) { return address.starts_with(entry.first); });
        plain += Entities.end() == entity ? address.front() : entity->second;
        address.remove_prefix(Entities.end() == entity ? 1 : entity->first.size());
    }
    if (Kernel::HasUriProtocol(String(plain)) || plain.starts_with("data:")) {
        return {};
    }
    std::unique_ptr<char, decltype(&g_free)> const name(g_uri_unescape_string(plain.c_str(), nullptr), &g_free);
    std::string_view const way(name ? name.get() : "");
    bool const isBeside =
        !way.starts_with('/') && !way.starts_with("../") && way.find("/../") == std::string_view::npos;
    return isBeside ? String(way) : String();
}

}

std::optional<Kernel::Size> ReadSvgSize(std::vector<unsigned char> const & bytes, String const & path,
                                        Raster::PictureProblem & problem)
{
    HandlePtr const handle = Open(bytes, path, problem);
    if (!handle) {
        return std::nullopt;
    }
    double width = 0;
    double height = 0;
    if (!rsvg_handle_get_intrinsic_size_in_pixels(handle.get(), &width, &height)) {
        gboolean hasBox = FALSE;
        RsvgRectangle box{};
        rsvg_handle_get_intrinsic_dimensions(handle.get(), nullptr, nullptr, nullptr, nullptr, &hasBox, &box);
        RsvgRectangle ink{};
        if (!hasBox && rsvg_handle_get_geometry_for_element(handle.get(), nullptr, &ink, nullptr, nullptr)) {
            box = {0, 0, ink.x + ink.width, ink.y + ink.height};
        }
        width = box.width;
        height = box.height;
    }
    if (!(0 < width && 0 < height)) {
        Raster::Report(problem, Code::Corrupt, path,
                       Kernel::LocalisedString("has no size and draws nothing", "Picture"));
        return std::nullopt;
    }
    return Kernel::Size{width * PointsPerPixel, height * PointsPerPixel};
}

Raster::Picture::Bytes SvgToPdf(std::vector<unsigned char> const & bytes, String const & path,
                                Kernel::Size const & size, Raster::PictureProblem & problem)
{
    HandlePtr const handle = Open(bytes, path, problem);
    if (!handle) {
        return nullptr;
    }
    double const scale = std::clamp(LargestPage / std::max(size.width, size.height), 1.0, PageScale);
    auto const file = std::make_shared<std::vector<unsigned char>>();
    SurfacePtr const surface(
        cairo_pdf_surface_create_for_stream(Append, file.get(), size.width * scale, size.height * scale));
    {
        ContextPtr const context(cairo_create(surface.get()));
        if (!Render(handle.get(), context.get(), size.width * scale, size.height * scale, path, problem)) {
            return nullptr;
        }
    }
    cairo_surface_finish(surface.get());
    if (CAIRO_STATUS_SUCCESS != cairo_surface_status(surface.get())) {
        Raster::Report(problem, Code::Corrupt, path, Kernel::LocalisedString("can't be drawn", "Picture"));
        return nullptr;
    }
    return file;
}

Kernel::Counted<Raster::DynamicBitmap const> DrawSvg(std::vector<unsigned char> const & bytes, String const & path,
                                                     int width, int height, Raster::PictureProblem & problem)
{
    HandlePtr const handle = Open(bytes, path, problem);
    if (!handle) {
        return nullptr;
    }
    SurfacePtr const surface(cairo_image_surface_create(CAIRO_FORMAT_ARGB32, width, height));
    ContextPtr const context(cairo_create(surface.get()));
    if (CAIRO_STATUS_SUCCESS != cairo_status(context.get())) {
        Raster::Report(problem, Code::TooLarge, path,
                       Kernel::LocalisedString("needs more memory than there is", "Picture"));
        return nullptr;
    }
    if (!Render(handle.get(), context.get(), width, height, path, problem)) {
        return nullptr;
    }
    return Unpremultiplied(surface.get());
}

std::vector<String> FindSvgLinks(std::vector<unsigned char> const & bytes)
{
    // What is longer is no path, and no drawing is made of more files: a hostile one costs one walk over its text.
    constexpr std::size_t LongestAddress = 4096;
    constexpr std::size_t MostLinks = 1000;
    constexpr std::string_view Blanks = " \t\r\n";
    std::string_view const text(reinterpret_cast<char const *>(bytes.data()), bytes.size());
    std::vector<String> links;
    auto const addUpTo = [&](std::size_t begin, char end) {
        std::string_view address = text.substr(begin, LongestAddress);
        std::size_t const length = address.find(end);
        if (length == std::string_view::npos || links.size() == MostLinks) {
            return;
        }
        constexpr std::string_view Around = " \t\r\n\"'";
        address = address.substr(0, length);
        address.remove_prefix(std::min(address.find_first_not_of(Around), address.size()));
        String link = FileOfAddress(address.substr(0, address.find_last_not_of(Around) + 1));
        if (!link.Empty() && std::find(links.begin(), links.end(), link) == links.end()) {
            links.push_back(std::move(link));
        }
    };
    auto const skipBlanks = [&](std::size_t at) { return std::min(text.find_first_not_of(Blanks, at), text.size()); };
    // `href="address"`, with any prefix, of pictures, other drawings and style sheets.
    constexpr std::string_view Name = "href";
    for (std::size_t at = text.find(Name); at != std::string_view::npos; at = text.find(Name, at)) {
        at = skipBlanks(at + Name.size());
        if (at == text.size() || text[at] != '=') {
            continue;
        }
        at = skipBlanks(at + 1);
        if (at < text.size() && ('"' == text[at] || '\'' == text[at])) {
            addUpTo(at + 1, text[at]);
        }
    }
    // `url(address)` in styles.
    constexpr std::string_view Function = "url(";
    for (std::size_t at = text.find(Function); at != std::string_view::npos; at = text.find(Function, at)) {
        at += Function.size();
        addUpTo(at, ')');
    }
    return links;
}

}
