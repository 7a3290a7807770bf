#include "framework/render/PdfContent.h"

#include "framework/kernel/Assert.h"
#include "framework/kernel/Utf.h"
#include "framework/raster/ColourTransform.h"
#include "framework/render/PdfExport.h"

#include <cmath>

namespace Renderer::RenderTree
{

namespace
{

/// A path that is one upright rectangle, as most are.
bool IsRectangle(Path const & path)
{
    static constexpr Path::Verb verbs[] = {Path::Verb::Move, Path::Verb::Line, Path::Verb::Line, Path::Verb::Line,
                                           Path::Verb::Close};
    if (!std::equal(path.GetVerbs().begin(), path.GetVerbs().end(), std::begin(verbs), std::end(verbs))) {
        return false;
    }
    std::vector<Kernel::Point> const & p = path.GetPoints();
    return p[0].y == p[1].y && p[1].x == p[2].x && p[2].y == p[3].y && p[3].x == p[0].x;
}

Raster::ColourSpace SpaceToWrite(Raster::ColourSpace space, Raster::Format format)
{
    Raster::ColourSpace const target = Raster::SpaceOfFormat(format);
    // Grey stays grey beside red, green and blue: black text then prints with black ink alone.
    bool const keepsGrey = target == Raster::ColourSpace::Rgb || target == Raster::ColourSpace::Lab;
    if (target == Raster::ColourSpace::None || (space == Raster::ColourSpace::Grey && keepsGrey)) {
        return space;
    }
    return target;
}

}

PdfContent::PdfContent(Schema const & schema, PdfResources & resources, FormStore storeForm, ImageSource images,
                       DrawingSource drawings)
    : m_Schema(schema), m_Resources(resources), m_StoreForm(std::move(storeForm)), m_Images(std::move(images)),
      m_Drawings(std::move(drawings))
{
}

std::string PdfContent::Write(std::vector<PlacedForm> const & forms, std::initializer_list<DisplayList const *> lists,
                              Raster::AffineTransform::Params const & toPage, PdfUses & uses)
{
    KORVANE_ASSERT_MESSAGE(toPage.a == 1 && toPage.b == 0 && toPage.c == 0 && toPage.d == -1,
                           "text is written upright and in its own size");
    m_ToPage = toPage;
    m_FromPage = toPage.Inverse();
    m_Text.clear();
    m_Uses.Clear();
    m_State = GraphicsState();
    m_ForbiddenFonts.clear();
    m_HadMissingGlyph = false;
    // First, while colours and line styles are those that every content stream begins with: a form has them from here.
    for (PlacedForm const & form : forms) {
        Place(form);
    }
    for (DisplayList const * list : lists) {
        WriteList(*list);
    }
    EndText();
    uses = m_Uses;
    return std::move(m_Text);
}

void PdfContent::Place(PlacedForm const & form)
{
    m_Text += "q\n";
    AppendPath(Path::Rectangle(form.m_Clip));
    m_Text += "W n\n";
    AppendMatrix(m_Text, ToForm.Inverse().Then(form.m_Transform).Then(m_ToPage));
    m_Text += "cm/X";
    AppendInteger(m_Text, static_cast<std::uint32_t>(form.m_Form) + 1);
    m_Text += " Do\nQ\n";
    m_Uses.m_Forms.insert(static_cast<std::uint32_t>(form.m_Form));
}

void PdfContent::WriteList(DisplayList const & list)
{
    KORVANE_ASSERT(list.GetDepth() == 0);
    for (DisplayList::Operation const operation : list.GetOperations()) {
        switch (operation.m_Kind) {
        case DisplayList::Kind::Fill:
            Fill(list.GetFill(operation.m_Index));
            break;
        case DisplayList::Kind::Stroke:
            StrokePath(list.GetStroke(operation.m_Index));
            break;
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
            BeginMark(list.GetMark(operation.m_Index));
            break;
        case DisplayList::Kind::EndMark:
            EndMark();
            break;
        }
    }
}

void PdfContent::BeginGroup(Group const & group)
{
    EndText();
    OpenGroup open;
    open.m_OuterState = m_State;
    open.m_Opacity = group.m_Opacity;
    m_Text += "q\n";
    if (group.m_Clip) {
        AppendPath(*group.m_Clip);
        m_Text += group.m_ClipRule == FillRule::EvenOdd ? "W* n\n" : "W n\n";
    }
    if (!group.m_Transform.IsIdentity()) {
        AppendMatrix(m_Text, m_FromPage.Then(group.m_Transform).Then(m_ToPage));
        m_Text += "cm\n";
    }
    if (group.m_Opacity < 1) {
        open.m_IsForm = true;
        open.m_OuterText = std::move(m_Text);
        open.m_OuterUses = std::move(m_Uses);
        m_Text.clear();
        m_Uses.Clear();
        // A form begins with whatever colours and line styles are set where it is drawn.
        m_State.m_Fill.clear();
        m_State.m_StrokeColour.clear();
        m_State.m_Font = nullptr;
        m_State.m_Opacity = 1000;
    }
    m_Open.push_back(std::move(open));
}

void PdfContent::EndGroup()
{
    EndText();
    OpenGroup open = std::move(m_Open.back());
    m_Open.pop_back();
    if (open.m_IsForm) {
        PdfForm form;
        form.m_Uses = m_Resources.AddUses(m_Uses);
        form.m_Data = m_StoreForm(std::move(m_Text));
        std::uint32_t const number = m_Resources.AddForm(form);
        m_Text = std::move(open.m_OuterText);
        m_Uses = std::move(open.m_OuterUses);
        m_Uses.m_Forms.insert(number);
        m_State.m_Opacity = open.m_OuterState.m_Opacity;
        SetOpacity(open.m_Opacity);
        m_Text += "/X";
        AppendInteger(m_Text, number + 1);
        m_Text += " Do\n";
    }
    m_Text += "Q\n";
    m_State = std::move(open.m_OuterState);
}

void PdfContent::BeginMark(Mark const & mark)
{
    bool const written = mark.m_Role == Role::Artifact || !mark.m_Language.Empty();
    m_Marks.push_back(written);
    if (!written) {
        return;
    }
    EndText();
    if (mark.m_Role == Role::Artifact) {
        m_Text += "/Artifact BMC\n";
    } else {
        m_Text += "/Span<</Lang";
        AppendHexText(m_Text, Kernel::Utf8ToUtf16(mark.m_Language));
        m_Text += ">>BDC\n";
    }
}

void PdfContent::EndMark()
{
    bool const written = m_Marks.back();
    m_Marks.pop_back();
    if (written) {
        EndText();
        m_Text += "EMC\n";
    }
}

void PdfContent::Fill(DisplayList::FilledPath const & fill)
{
    if (fill.m_Path.IsEmpty()) {
        return;
    }
    EndText();
    SetColour(fill.m_Colour, false);
    AppendPath(fill.m_Path);
    m_Text += fill.m_Rule == FillRule::EvenOdd ? "f*\n" : "f\n";
}

void PdfContent::StrokePath(DisplayList::StrokedPath const & stroke)
{
    if (stroke.m_Path.IsEmpty()) {
        return;
    }
    EndText();
    SetColour(stroke.m_Colour, true);
    SetStrokeStyle(stroke.m_Stroke);
    AppendPath(stroke.m_Path);
    m_Text += "S\n";
}

void PdfContent::SetStrokeStyle(Stroke const & stroke)
{
    auto const set = [this](auto & known, auto wanted, char const * name) {
        if (known != wanted) {
            known = wanted;
            AppendThousandths(m_Text, static_cast<Thousandths>(wanted) *
                                          (std::is_same_v<decltype(wanted), Thousandths> ? 1 : 1000));
            m_Text += name;
        }
    };
    set(m_State.m_Width, ToThousandths(std::max(0.0, stroke.m_Width)), " w\n");
    set(m_State.m_Cap, stroke.m_Cap, " J\n");
    set(m_State.m_Join, stroke.m_Join, " j\n");
    set(m_State.m_MiterLimit, ToThousandths(std::max(1.0, stroke.m_MiterLimit)), " M\n");
    std::string dashes = "[";
    for (double const length : stroke.m_Dashes) {
        dashes += dashes.size() > 1 ? " " : "";
        AppendNumber(dashes, std::max(0.0, length));
    }
    dashes += ']';
    AppendNumber(dashes, stroke.m_DashPhase);
    dashes += " d\n";
    if (dashes != m_State.m_Dashes) {
        m_Text += dashes;
        m_State.m_Dashes = std::move(dashes);
    }
}

void PdfContent::Picture(PlacedPicture const & picture)
{
    EndText();
    Raster::AffineTransform::Params const & placement = picture.m_Placement;
    std::uint32_t image = 0;
    if (!m_Images(picture, {std::hypot(placement.a, placement.b), std::hypot(placement.c, placement.d)}, image)) {
        MissingPicture(placement);
        return;
    }
    // From the stored picture to the upright one, both with (0,0) at the top left.
    static constexpr Raster::AffineTransform::Params upright[] = {
        {1, 0, 0, 1, 0, 0},  {-1, 0, 0, 1, 1, 0}, {-1, 0, 0, -1, 1, 1}, {1, 0, 0, -1, 0, 1},
        {0, 1, 1, 0, 0, 0},  {0, 1, -1, 0, 1, 0}, {0, -1, -1, 0, 1, 1}, {0, -1, 1, 0, 0, 1}};
    int const orientation = picture.m_Picture ? picture.m_Picture->GetInfo().m_Orientation : 1;
    // A PDF image has (0,0) at its bottom left.
    Raster::AffineTransform::Params const fromBottom{1, 0, 0, -1, 0, 1};
    m_Uses.m_Images.insert(image);
    SetOpacity(1);
    m_Text += "q ";
    AppendMatrix(m_Text, fromBottom.Then(upright[orientation - 1]).Then(placement).Then(m_ToPage));
    m_Text += "cm/I";
    AppendInteger(m_Text, image + 1);
    m_Text += " Do Q\n";
}

void PdfContent::Drawing(PlacedVectors const & placed)
{
    EndText();
    std::uint32_t form = 0;
    if (!m_Drawings(*placed.m_Drawing, form)) {
        MissingPicture(placed.m_Placement);
        return;
    }
    // The form fills the unit square with (0,0) at its bottom left, and begins with whatever is set where it is drawn:
    // a page begins with black, one point wide, and solid lines.
    Raster::AffineTransform::Params const fromBottom{1, 0, 0, -1, 0, 1};
    m_Uses.m_Drawings.insert(form);
    SetOpacity(1);
    m_Text += "q 0 g 0 G 1 w 0 J 0 j 10 M[]0 d ";
    AppendMatrix(m_Text, fromBottom.Then(placed.m_Placement).Then(m_ToPage));
    m_Text += "cm/D";
    AppendInteger(m_Text, form + 1);
    m_Text += " Do Q\n";
}

void PdfContent::MissingPicture(Raster::AffineTransform::Params const & placement)
{
    Path box;
    Kernel::Point const corners[] = {placement.Map({0, 0}), placement.Map({1, 0}), placement.Map({1, 1}),
                                     placement.Map({0, 1})};
    box.MoveTo(corners[0].x, corners[0].y);
    for (int const corner : {1, 2, 3}) {
        box.LineTo(corners[corner].x, corners[corner].y);
    }
    box.Close();
    Path cross = box;
    for (int const corner : {0, 1}) {
        cross.MoveTo(corners[corner].x, corners[corner].y);
        cross.LineTo(corners[corner + 2].x, corners[corner + 2].y);
    }
    Fill({box, Raster::Colour::Grey(0.92F), FillRule::NonZero});
    StrokePath({cross, Raster::Colour::Grey(0.5F), Stroke{0.5, {}, {}, 10, {}, 0}});
}

void PdfContent::AppendPath(Path const & path)
{
    std::vector<Kernel::Point> const & points = path.GetPoints();
    if (IsRectangle(path)) {
        Kernel::Point const from = m_ToPage.Map(points[0]);
        Kernel::Point const to = m_ToPage.Map(points[2]);
        Thousandths const left = ToThousandths(std::min(from.x, to.x));
        Thousandths const bottom = ToThousandths(std::min(from.y, to.y));
        for (Thousandths const value : {left, bottom, ToThousandths(std::max(from.x, to.x)) - left,
                                        ToThousandths(std::max(from.y, to.y)) - bottom}) {
            AppendThousandths(m_Text, value);
            m_Text += ' ';
        }
        m_Text += "re ";
        return;
    }
    std::size_t point = 0;
    for (Path::Verb const verb : path.GetVerbs()) {
        std::size_t const count = verb == Path::Verb::Curve ? 3 : verb == Path::Verb::Close ? 0 : 1;
        for (std::size_t const end = point + count; point < end; ++point) {
            AppendPoint(m_Text, m_ToPage.Map(points[point]));
        }
        m_Text += verb == Path::Verb::Move ? "m " : verb == Path::Verb::Line ? "l " : verb == Path::Verb::Curve ? "c "
                                                                                                                : "h ";
    }
}

void PdfContent::SetOpacity(double opacity)
{
    std::uint32_t const thousandths = static_cast<std::uint32_t>(std::lround(std::clamp(opacity, 0.0, 1.0) * 1000));
    if (thousandths == m_State.m_Opacity) {
        return;
    }
    m_State.m_Opacity = thousandths;
    m_Uses.m_Opacities.insert(thousandths);
    m_Text += "/G";
    AppendInteger(m_Text, thousandths);
    m_Text += " gs\n";
}

void PdfContent::SetColour(Raster::Colour const & colour, bool stroke)
{
    SetOpacity(static_cast<double>(colour.m_Alpha));
    KnownColour & known = m_Known[stroke ? 1 : 0];
    if (known.m_Operator.empty() || known.m_Colour != colour) {
        known.m_Colour = colour;
        known.m_Operator.clear();
        Raster::Colour const written = Raster::ConvertColour(
            colour, SpaceToWrite(colour.m_Space, m_Schema.GetColourFormat()), m_Schema.GetProfiles());
        if (written.m_Space == Raster::ColourSpace::Lab) {
            known.m_Operator = stroke ? "/Lab CS " : "/Lab cs ";
        }
        int const channels = Raster::ChannelCount(written.m_Space);
        for (int i = 0; i < channels; ++i) {
            AppendNumber(known.m_Operator, static_cast<double>(written.m_Components[static_cast<std::size_t>(i)]));
            known.m_Operator += ' ';
        }
        static char const * const operators[][2] = {
            {"g\n", "G\n"}, {"g\n", "G\n"}, {"rg\n", "RG\n"}, {"k\n", "K\n"}, {"sc\n", "SC\n"}};
        known.m_Operator += operators[static_cast<int>(written.m_Space)][stroke ? 1 : 0];
    }
    m_Uses.m_Lab = m_Uses.m_Lab || known.m_Operator[0] == '/';
    std::string & set = stroke ? m_State.m_StrokeColour : m_State.m_Fill;
    if (set != known.m_Operator) {
        set = known.m_Operator;
        m_Text += set;
    }
}

}
