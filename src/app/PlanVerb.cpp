#include "app/FileCheck.h"
#include "app/Interruption.h"
#include "app/Json.h"
#include "app/PrintLayout.h"
#include "app/TextTable.h"
#include "app/VerbList.h"
#include "framework/render/FileExportOptions.h"
#include "import/Text.h"
#include "output/ExportBookCommand.h"

namespace App
{

namespace fs = std::filesystem;
using Import::Text;

namespace
{

struct PlanOptions
{
    std::string m_Book;
    bool m_Spreads = false;
    PrintLayout m_Layout;
    CLI::Option * m_LayoutOption = nullptr;
};

/// The result in both forms.
struct PlanResult
{
    Json m_Json;
    TextTable m_Table;
    std::string m_Summary;
};

char const * NameOf(Book::ExportPageForm form)
{
    using Form = Book::ExportPageForm;
    switch (form) {
    case Form::WholeSpread:
        return "spread";
    case Form::PageOfSpread:
        return "page";
    case Form::PageThenPad:
        return "page, blank";
    case Form::PadThenPage:
        return "blank, page";
    case Form::Merged:
        return "merged";
    case Form::Nothing:
        break;
    }
    return "nothing";
}

/// A number as people write it: at most three decimals, none that are zero.
std::string Number(double value)
{
    char text[64];
    std::snprintf(text, sizeof text, "%.3f", value);
    std::string number(text);
    number.erase(number.find_last_not_of('0') + 1);
    if (number.back() == '.') {
        number.pop_back();
    }
    return number == "-0" ? "0" : number;
}

std::string Corners(Kernel::Rect const & rect)
{
    return Number(rect.left) + " " + Number(rect.top) + " " + Number(rect.right) + " " + Number(rect.bottom);
}

Json RectJson(Kernel::Rect const & rect)
{
    return {rect.left, rect.top, rect.right, rect.bottom};
}

PlanResult PlanOutput(BookSession const & session, bool spreads)
{
    PlanResult result{Json::array(),
                      TextTable({{Text("Output", "Table"), false, true},
                                 {Text("Chapter", "Table"), true},
                                 {Text("Spread", "Table"), false, true},
                                 {Text("Page", "Table"), false, true},
                                 {Text("Offset", "Table")},
                                 {Text("Form", "Table")}}),
                      {}};
    BookSession::ChapterList const all = session.GetChapters();
    BookSession::ChapterList chapters;
    std::copy_if(all.begin(), all.end(), std::back_inserter(chapters),
                 [](auto const & chapter) { return chapter->IsValid(); });
    auto const options = Kernel::MakeCounted<Renderer::FileExportOptionsPDF const>();
    auto const plan = Kernel::MakeCounted<Book::ExportBookCommand>(
        chapters, String(), Kernel::Consolidated<Renderer::FileExportOptions>(options), Kernel::Size(), true, false,
        false, !spreads, nullptr);
    plan->SetStrayHandling(session.GetBook()->IsPadStrays(), session.GetBook()->IsMergeStrays());
    plan->BuildExportMap();
    int output = 0;
    for (Book::ExportPageEntry const & entry : plan->GetExportMap()) {
        ++output;
        Book::ExportPageRef const & real = *FirstReal(entry);
        auto const infos = chapters[static_cast<std::size_t>(real.m_Chapter)]->GetSpreadInfo();
        char const * const form = NameOf(
            FormOf(entry, static_cast<int>(infos[static_cast<std::size_t>(real.m_Spread)].m_PageRects.size())));
        Json refs = Json::array();
        for (Book::ExportPageRef const & ref : entry) {
            std::string const first = refs.empty() ? std::to_string(output) : "";
            if (ref.IsPadding()) {
                refs.push_back({{"blank", true}});
                result.m_Table.AddRow({{first}, {"-"}, {""}, {""}, {""}, {refs.size() == 1 ? form : ""}});
                continue;
            }
            auto const & chapter = chapters[static_cast<std::size_t>(ref.m_Chapter)];
            refs.push_back({{"chapter", ref.m_Chapter},
                            {"name", chapter->GetName().ToStd()},
                            {"spread", ref.m_Spread},
                            {"page", ref.m_Page},
                            {"offset", {ref.m_Offset.width, ref.m_Offset.height}}});
            result.m_Table.AddRow({{first},
                                   {chapter->GetName().ToStd()},
                                   {std::to_string(ref.m_Spread + 1)},
                                   {std::to_string(ref.m_Page + 1)},
                                   {Number(ref.m_Offset.width) + ", " + Number(ref.m_Offset.height)},
                                   {refs.size() == 1 ? form : ""}});
        }
        result.m_Json.push_back({{"output", output}, {"form", form}, {"pages", refs}});
    }
    result.m_Summary = Import::CountText("%1 output page", "%1 output pages", "Program", output);
    return result;
}

PlanResult PlanSheets(BookSession const & session, PrintLayout const & layout, Import::MessageList & messages)
{
    PlanResult result{Json::array(),
                      TextTable({{Text("Side", "Table"), false, true},
                                 {Text("Paper", "Table")},
                                 {Text("Scale", "Table"), false, true},
                                 {Text("Page", "Table"), false, true},
                                 {Text("Chapter", "Table"), true},
                                 {Text("Spread", "Table"), false, true},
                                 {Text("On paper (left top right bottom)", "Table")}}),
                      {}};
    int side = 0;
    for (Book::PaginatorPage const & sheet : LaySheets(session, layout, messages)) {
        Book::PrintSheet const placed(sheet, layout.GetSettings());
        std::string const paper = Number(placed.GetPaper().width) + " x " + Number(placed.GetPaper().height);
        std::string const scale = Number(placed.GetScale() * 100) + "%";
        ++side;
        Json targets = Json::array();
        for (std::size_t index = 0; index < sheet.m_Targets.size(); ++index) {
            Book::PaginatorTarget const & target = sheet.m_Targets[index];
            Book::PrintSheet::Piece const & piece = placed.GetPieces()[index];
            result.m_Table.AddRow({{index == 0 ? std::to_string(side) : ""},
                                   {index == 0 ? paper : ""},
                                   {index == 0 ? scale : ""},
                                   {std::to_string(target.m_Index + 1)},
                                   {target.m_Chapter->GetName().ToStd()},
                                   {std::to_string(target.m_Spread + 1)},
                                   {Corners(piece.m_Trim)}});
            Raster::AffineTransform::Params const & map = target.m_Transform;
            targets.push_back({{"index", target.m_Index},
                               {"name", target.m_Chapter->GetName().ToStd()},
                               {"spread", target.m_Spread},
                               {"page", RectJson(target.m_PageRect)},
                               {"dest", RectJson(target.m_DestRect)},
                               {"bleed", RectJson(target.m_BleedRect)},
                               {"transform", {map.a, map.c, map.e, map.b, map.d, map.f}},
                               {"onPaper", RectJson(piece.m_Trim)}});
        }
        if (sheet.m_Targets.empty()) {
            result.m_Table.AddRow({{std::to_string(side)}, {paper}, {scale}, {"-"}, {""}, {""}, {""}});
        }
        Json marks = Json::array();
        for (CropMarkPos const & mark : sheet.m_CropMarks) {
            marks.push_back({{"edges", mark.m_Edges}, {"x", mark.m_X}, {"y", mark.m_Y}});
        }
        result.m_Json.push_back({{"side", side},
                                 {"rect", RectJson(sheet.m_Rect)},
                                 {"bleed", RectJson(sheet.m_Bleed)},
                                 {"orientation", static_cast<int>(sheet.m_Orientation)},
                                 {"placement", static_cast<unsigned>(sheet.m_Placement)},
                                 {"paper", {placed.GetPaper().width, placed.GetPaper().height}},
                                 {"scale", placed.GetScale()},
                                 {"targets", targets},
                                 {"cropMarks", marks}});
    }
    result.m_Summary = Import::CountText("%1 side", "%1 sides", "Program", side);
    return result;
}

int RunPlan(VerbContext & context, PlanOptions const & options)
{
    Import::MessageList messages;
    fs::path const book = FullPath(options.m_Book);
    bool const hasLayout = options.m_LayoutOption->count() > 0;
    PlanResult result{Json::array(), TextTable({}), {}};
    bool isGood = false;
    if (FindBook(options.m_Book, messages)) {
        Listener listener(context.m_Console, context.m_Ask, context.m_Answers);
        {
            BookSession session(context.m_Console, listener);
            isGood = session.OpenUsable(book.string(), messages);
            if (isGood) {
                result = hasLayout ? PlanSheets(session, options.m_Layout, messages)
                                   : PlanOutput(session, options.m_Spreads);
            }
        }
        messages.Append(listener.TakeMessages());
    }
    isGood = isGood && !messages.HasErrors() && !Interruption::IsRaised();

    Console & console = context.m_Console;
    console.EndProgress();
    if (console.Settings().m_IsJson) {
        console.SayResult(Print({{"ok", isGood},
                                 {"book", book.string()},
                                 {hasLayout ? "sheets" : "outputPages", result.m_Json},
                                 {"messages", ToJson(messages)}}));
    }
    console.Tell(messages);
    if (isGood) {
        for (std::string const & line : result.m_Table.Layout(console.Terminal().m_Columns, false)) {
            console.Say(line);
        }
        console.Say(result.m_Summary);
    }
    return isGood ? ExitFine : ExitFailed;
}

}

void AddPlanVerb(VerbList & verbs)
{
    auto const options = std::make_shared<PlanOptions>();
    CLI::App & verb =
        verbs.Add("plan", Text("Tell on which output page, or on which sheet, each page lands", "Help"),
                  "  korvane plan my-book.kvbook --spreads\n"
                  "  korvane plan my-book.kvbook --layout booklet --json",
                  [options](VerbContext & context) { return RunPlan(context, *options); });
    verb.add_option("BOOK", options->m_Book, Text("The book file", "Help"))->required();
    auto * const spreads = verb.add_flag("--spreads", options->m_Spreads,
                                         Text("Plan whole spreads in place of single pages", "Help"));
    AddLayoutOptions(verb, options->m_Layout);
    options->m_LayoutOption = verb.get_option("--layout");
    spreads->excludes(options->m_LayoutOption);
    verbs.AddAnswers(verb);
}

}
