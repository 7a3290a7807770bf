#include "framework/render/RasterSink.h"

#include "framework/kernel/Assert.h"
#include "framework/raster/ColourTransform.h"
#include "framework/raster/PngEncoder.h"
#include "framework/render/CairoBitmap.h"

#include <cmath>
#include <cstring>

namespace Renderer::RenderTree
{

namespace
{

cairo_matrix_t MatrixOf(Raster::AffineTransform::Params const & map)
{
    return {map.a, map.b, map.c, map.d, map.e, map.f};
}

/// cairo's pixels: 32 bits in the machine's order, alpha highest, colours multiplied by it.
std::uint32_t Premultiplied(std::uint8_t const * rgba)
{
    std::uint32_t const alpha = rgba[3];
    auto const times = [alpha](std::uint32_t value) { return (value * alpha + 127) / 255; };
    return alpha << 24 | times(rgba[0]) << 16 | times(rgba[1]) << 8 | times(rgba[2]);
}

/// Sends a glyph's outline to cairo.
class OutlineToCairo : public Typeset::OutlineSink
{
public:
    OutlineToCairo(cairo_t * context, double scale, double slant) : m_Context(context), m_Scale(scale), m_Slant(slant) {}

    void SetOrigin(double x, double y)
    {
        m_OriginX = x;
        m_OriginY = y;
    }
    void MoveTo(double x, double y) override
    {
        cairo_move_to(m_Context, X(x, y), Y(y));
        Keep(x, y);
    }
    void LineTo(double x, double y) override
    {
        cairo_line_to(m_Context, X(x, y), Y(y));
        Keep(x, y);
    }
    void QuadTo(double controlX, double controlY, double x, double y) override
    {
        CubicTo(m_LastX + (controlX - m_LastX) * 2 / 3, m_LastY + (controlY - m_LastY) * 2 / 3,
                x + (controlX - x) * 2 / 3, y + (controlY - y) * 2 / 3, x, y);
    }
    void CubicTo(double x1, double y1, double x2, double y2, double x, double y) override
    {
        cairo_curve_to(m_Context, X(x1, y1), Y(y1), X(x2, y2), Y(y2), X(x, y), Y(y));
        Keep(x, y);
    }
    void Close() override { cairo_close_path(m_Context); }

private:
    [[nodiscard]] double X(double x, double y) const { return m_OriginX + (x + m_Slant * y) * m_Scale; }
    [[nodiscard]] double Y(double y) const { return m_OriginY - y * m_Scale; }
    void Keep(double x, double y)
    {
        m_LastX = x;
        m_LastY = y;
    }

    cairo_t * m_Context;
    double m_Scale;
    double m_Slant;
    double m_OriginX = 0;
    double m_OriginY = 0;
    double m_LastX = 0;
    double m_LastY = 0;
};

/// How pictures are brought to fewer and to more pixels.
struct Resamplers
{
    enum Raster::ResamplerType m_Down;
    enum Raster::ResamplerType m_Up;
};

cairo_filter_t FilterFor(enum Raster::ResamplerType resampler)
{
    switch (resampler) {
    case Raster::ResamplerNearest:
        return CAIRO_FILTER_NEAREST;
    case Raster::ResamplerBilinear:
        return CAIRO_FILTER_GOOD;
    case Raster::ResamplerBicubic:
    case Raster::ResamplerLanczos3:
        break;
    }
    return CAIRO_FILTER_BEST;
}

/// Most pixels across or down that a placed drawing is made in; beyond that it is scaled.
constexpr int LargestDrawing = 4096;

/// One drawing of one list.
class Painter
{
public:
    Painter(cairo_t * context, Schema const & schema, Resamplers resamplers, std::vector<Warning> * warnings)
        : m_Context(context), m_Schema(schema), m_Resamplers(resamplers), m_Warnings(warnings)
    {
    }

    void Draw(DisplayList const & list)
    {
        for (DisplayList::Operation const operation : list.GetOperations()) {
            switch (operation.m_Kind) {
            case DisplayList::Kind::Fill: {
                DisplayList::FilledPath const & fill = list.GetFill(operation.m_Index);
                SetColour(fill.m_Colour);
                AddPath(fill.m_Path);
                SetRule(fill.m_Rule);
                cairo_fill(m_Context);
                break;
            }
            case DisplayList::Kind::Stroke: {
                DisplayList::StrokedPath const & stroke = list.GetStroke(operation.m_Index);
                SetColour(stroke.m_Colour);
                SetStroke(stroke.m_Stroke);
                AddPath(stroke.m_Path);
                cairo_stroke(m_Context);
                break;
            }
            case DisplayList::Kind::Glyphs:
                Glyphs(list, list.GetRun(operation.m_Index));
                break;
            case DisplayList::Kind::Picture:
                Picture(list.GetPicture(operation.m_Index));
                break;
            case DisplayList::Kind::Drawing:
                Drawing(list.GetDrawing(operation.m_Index));
                break;
            case DisplayList::Kind::BeginGroup:
                BeginGroup(list.GetGroup(operation.m_Index));
                break;
            case DisplayList::Kind::EndGroup:
                EndGroup();
                break;
            case DisplayList::Kind::BeginMark:
            case DisplayList::Kind::EndMark:
                break;
            }
        }
    }

private:
    void SetColour(Raster::Colour const & colour)
    {
        Raster::Colour const rgb = Raster::ConvertColour(colour, Raster::ColourSpace::Rgb, m_Schema.GetProfiles());
        cairo_set_source_rgba(m_Context, static_cast<double>(rgb.m_Components[0]),
                              static_cast<double>(rgb.m_Components[1]), static_cast<double>(rgb.m_Components[2]),
                              static_cast<double>(rgb.m_Alpha));
    }

    void SetRule(FillRule rule)
    {
        cairo_set_fill_rule(m_Context,
                            rule == FillRule::EvenOdd ? CAIRO_FILL_RULE_EVEN_ODD : CAIRO_FILL_RULE_WINDING);
    }

    void SetStroke(Stroke const & stroke)
    {
        cairo_set_line_width(m_Context, stroke.m_Width);
        static constexpr cairo_line_cap_t caps[] = {CAIRO_LINE_CAP_BUTT, CAIRO_LINE_CAP_ROUND, CAIRO_LINE_CAP_SQUARE};
        static constexpr cairo_line_join_t joins[] = {CAIRO_LINE_JOIN_MITER, CAIRO_LINE_JOIN_ROUND,
                                                      CAIRO_LINE_JOIN_BEVEL};
        cairo_set_line_cap(m_Context, caps[static_cast<int>(stroke.m_Cap)]);
        cairo_set_line_join(m_Context, joins[static_cast<int>(stroke.m_Join)]);
        cairo_set_miter_limit(m_Context, stroke.m_MiterLimit);
        cairo_set_dash(m_Context, stroke.m_Dashes.data(), static_cast<int>(stroke.m_Dashes.size()), stroke.m_DashPhase);
    }

    void AddPath(Path const & path)
    {
        Kernel::Point const * p = path.GetPoints().data();
        for (Path::Verb const verb : path.GetVerbs()) {
            switch (verb) {
            case Path::Verb::Move:
                cairo_move_to(m_Context, p->x, p->y);
                ++p;
                break;
            case Path::Verb::Line:
                cairo_line_to(m_Context, p->x, p->y);
                ++p;
                break;
            case Path::Verb::Curve:
                cairo_curve_to(m_Context, p[0].x, p[0].y, p[1].x, p[1].y, p[2].x, p[2].y);
                p += 3;
                break;
            case Path::Verb::Close:
                cairo_close_path(m_Context);
                break;
            }
        }
    }

    void BeginGroup(Group const & group)
    {
        cairo_save(m_Context);
        if (group.m_Clip) {
            AddPath(*group.m_Clip);
            SetRule(group.m_ClipRule);
            cairo_clip(m_Context);
        }
        cairo_matrix_t const matrix = MatrixOf(group.m_Transform);
        cairo_transform(m_Context, &matrix);
        m_Opacities.push_back(group.m_Opacity);
        if (group.m_Opacity < 1) {
            cairo_push_group(m_Context);
        }
    }

    void EndGroup()
    {
        double const opacity = m_Opacities.back();
        m_Opacities.pop_back();
        if (opacity < 1) {
            cairo_pop_group_to_source(m_Context);
            cairo_paint_with_alpha(m_Context, std::max(0.0, opacity));
        }
        cairo_restore(m_Context);
    }

    void Glyphs(DisplayList const & list, GlyphRun const & run)
    {
        SetColour(run.m_Colour);
        SetRule(FillRule::NonZero);
        OutlineToCairo outline(m_Context, run.m_Size / run.m_Face->GetUnitsPerEm(), run.m_Slant);
        double pen = run.m_Origin.x;
        for (Typeset::PlacedGlyph const & glyph : list.GlyphsOf(run)) {
            outline.SetOrigin(pen + static_cast<double>(glyph.m_OffsetX),
                              run.m_Origin.y + static_cast<double>(glyph.m_OffsetY));
            run.m_Face->DrawGlyph(glyph.m_Glyph, outline);
            pen += static_cast<double>(glyph.m_Advance);
        }
        cairo_fill(m_Context);
    }

    Kernel::Counted<Raster::DynamicBitmap> PixelsOf(PlacedPicture const & placed)
    {
        Kernel::Counted<Raster::DynamicBitmap const> bitmap = placed.m_Bitmap;
        Kernel::Consolidated<Raster::ICCProfile> profile = placed.m_BitmapProfile;
        if (placed.m_Picture) {
            Raster::PictureProblem problem;
            bitmap = placed.m_Picture->Decode(problem);
            profile = placed.m_Picture->ReadProfile();
            if (!bitmap) {
                if (m_Warnings) {
                    m_Warnings->push_back(
                        {Warning::Code::PictureMissing, 0, placed.m_Picture->GetPath(), problem.m_Text});
                }
                return nullptr;
            }
        }
        Raster::ICCManager::ICCProfileSet const & set = m_Schema.GetProfiles();
        if (!profile) {
            profile = set.ForSpace(Raster::SpaceOfFormat(bitmap->GetFormat()));
        }
        return Raster::ConvertToRgba8(*bitmap, profile, set.ForSpace(Raster::ColourSpace::Rgb), set.m_Intent,
                                      set.m_BlackPointCompensation);
    }

    void Picture(PlacedPicture const & placed)
    {
        Pixels(PixelsOf(placed).Get(), placed.m_Placement);
    }

    /// In as many pixels as it covers here.
    void Drawing(PlacedVectors const & placed)
    {
        cairo_matrix_t toPixels;
        cairo_get_matrix(m_Context, &toPixels);
        Raster::AffineTransform::Params const map = placed.m_Placement.Then(
            {toPixels.xx, toPixels.yx, toPixels.xy, toPixels.yy, toPixels.x0, toPixels.y0});
        auto const count = [](double length) {
            return std::clamp(static_cast<int>(std::ceil(std::min(length, 1e6))), 1, LargestDrawing);
        };
        Raster::PictureProblem problem;
        Kernel::Counted<Raster::DynamicBitmap const> bitmap = placed.m_Drawing->Draw(
            count(std::hypot(map.a, map.b)), count(std::hypot(map.c, map.d)), problem);
        if (!bitmap && m_Warnings) {
            m_Warnings->push_back({Raster::PictureProblem::Code::Unsupported == problem.m_Code
                                       ? Warning::Code::PictureNotDrawn
                                       : Warning::Code::PictureMissing,
                                   0, placed.m_Drawing->GetPath(), problem.m_Text});
        }
        if (bitmap) {
            Raster::ICCManager::ICCProfileSet const & set = m_Schema.GetProfiles();
            bitmap = Raster::ConvertToRgba8(*bitmap, set.ForSpace(Raster::SpaceOfFormat(bitmap->GetFormat())),
                                            set.ForSpace(Raster::ColourSpace::Rgb), set.m_Intent,
                                            set.m_BlackPointCompensation);
        }
        Pixels(bitmap.Get(), placed.m_Placement);
    }

    /// Draws what stands for a picture that can't be had: a grey box with its diagonals. In the unit square.
    void Missing()
    {
        cairo_rectangle(m_Context, 0, 0, 1, 1);
        cairo_set_source_rgb(m_Context, 0.92, 0.92, 0.92);
        cairo_fill(m_Context);
        cairo_move_to(m_Context, 0, 0);
        cairo_line_to(m_Context, 1, 1);
        cairo_move_to(m_Context, 1, 0);
        cairo_line_to(m_Context, 0, 1);
        cairo_rectangle(m_Context, 0, 0, 1, 1);
        // The pen is as wide whatever the box's shape is.
        cairo_matrix_t matrix;
        cairo_get_matrix(m_Context, &matrix);
        cairo_identity_matrix(m_Context);
        cairo_set_source_rgb(m_Context, 0.5, 0.5, 0.5);
        cairo_set_line_width(m_Context, 1);
        cairo_set_dash(m_Context, nullptr, 0, 0);
        cairo_stroke(m_Context);
        cairo_set_matrix(m_Context, &matrix);
    }

    void Pixels(Raster::DynamicBitmap const * pixels, Raster::AffineTransform::Params const & where)
    {
        cairo_save(m_Context);
        cairo_matrix_t const placement = MatrixOf(where);
        cairo_transform(m_Context, &placement);
        if (!pixels || pixels->GetPixels().empty()) {
            Missing();
            cairo_restore(m_Context);
            return;
        }
        cairo_rectangle(m_Context, 0, 0, 1, 1);
        int const width = pixels->GetWidth();
        int const height = pixels->GetHeight();
        SurfacePtr const surface(cairo_image_surface_create(CAIRO_FORMAT_ARGB32, width, height));
        if (cairo_surface_status(surface.get()) == CAIRO_STATUS_SUCCESS) {
            unsigned char * const data = cairo_image_surface_get_data(surface.get());
            std::size_t const stride = static_cast<std::size_t>(cairo_image_surface_get_stride(surface.get()));
            for (int y = 0; y < height; ++y) {
                for (int x = 0; x < width; ++x) {
                    std::uint32_t const value = Premultiplied(pixels->GetRow(y) + static_cast<std::size_t>(x) * 4);
                    std::memcpy(data + static_cast<std::size_t>(y) * stride + static_cast<std::size_t>(x) * 4, &value, 4);
                }
            }
            cairo_surface_mark_dirty(surface.get());
            PatternPtr const pattern(cairo_pattern_create_for_surface(surface.get()));
            cairo_matrix_t toPixels;
            cairo_matrix_init_scale(&toPixels, width, height);
            cairo_pattern_set_matrix(pattern.get(), &toPixels);
            cairo_matrix_t toDevice;
            cairo_get_matrix(m_Context, &toDevice);
            bool const isReduced = std::hypot(toDevice.xx, toDevice.yx) * std::hypot(toDevice.xy, toDevice.yy) <
                                   static_cast<double>(width) * height;
            cairo_pattern_set_filter(pattern.get(), FilterFor(isReduced ? m_Resamplers.m_Down : m_Resamplers.m_Up));
            // Edge pixels go on outwards, so that the picture's rim is not mixed with nothing.
            cairo_pattern_set_extend(pattern.get(), CAIRO_EXTEND_PAD);
            cairo_set_source(m_Context, pattern.get());
            cairo_fill(m_Context);
        }
        cairo_restore(m_Context);
    }

    cairo_t * m_Context;
    Schema const & m_Schema;
    Resamplers m_Resamplers;
    std::vector<Warning> * m_Warnings;
    std::vector<double> m_Opacities;
};

}

Kernel::Counted<Raster::DynamicBitmap> RasterSink::Draw(DisplayList const & list, int width, int height,
                                                        Raster::AffineTransform::Params const & toPixels,
                                                        std::vector<Warning> * warnings) const
{
    KORVANE_ASSERT(list.GetDepth() == 0);
    if (width < 1 || height < 1 || width > MaximumSide || height > MaximumSide) {
        return nullptr;
    }
    SurfacePtr const surface(cairo_image_surface_create(CAIRO_FORMAT_ARGB32, width, height));
    ContextPtr const context(cairo_create(surface.get()));
    if (cairo_status(context.get()) != CAIRO_STATUS_SUCCESS) {
        return nullptr;
    }
    cairo_matrix_t const matrix = MatrixOf(toPixels);
    cairo_set_matrix(context.get(), &matrix);
    Painter(context.get(), *m_Schema, {m_Down, m_Up}, warnings).Draw(list);
    if (cairo_status(context.get()) != CAIRO_STATUS_SUCCESS) {
        return nullptr;
    }
    return Unpremultiplied(surface.get());
}

}
