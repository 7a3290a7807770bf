// The options of the verbs that lay pages on sheets.

#include "app/PaperSize.h"
#include "app/PrintLayout.h"
#include "app/VerbList.h"
#include "framework/render/PrintPages.h"
#include "import/Text.h"

namespace App
{

using Import::Text;

namespace
{

using Kind = PrintLayout::Kind;

std::map<std::string, Kind> const LayoutNames = {{"single", Kind::Single},
                                                 {"tiled", Kind::Tiled},
                                                 {"nup", Kind::NUp},
                                                 {"book", Kind::Book},
                                                 {"booklet", Kind::Booklet}};

/// An option that `read` turns into `value`; `wanted` says what it takes.
template <typename TValue, typename TRead>
CLI::Option * AddRead(CLI::App & verb, std::string const & name, TValue & value, TRead const & read,
                      std::string const & wanted, std::string const & purpose)
{
    return verb
        .add_option_function<std::string>(
            "--" + name,
            [&value, read, wanted, name](std::string const & text) {
                auto const taken = read(text);
                if (!taken) {
                    throw CLI::ValidationError("--" + name,
                                               Text("\"%1\" is not %2", "Program", text, wanted));
                }
                value = *taken;
            },
            purpose)
        ->type_name(Text("VALUE", "Help"));
}

template <typename TValue>
auto OneOf(std::map<std::string, TValue> names)
{
    return [names = std::move(names)](std::string const & text) -> std::optional<TValue> {
        auto const found = names.find(text);
        return found == names.end() ? std::nullopt : std::optional(found->second);
    };
}

/// Options with the layouts that they belong to.
struct OptionOfLayouts
{
    CLI::Option * m_Option;
    std::vector<Kind> m_Kinds;
};

std::string NameOf(Kind kind)
{
    for (auto const & [name, known] : LayoutNames) {
        if (known == kind) {
            return name;
        }
    }
    return {};
}

void CheckTogether(PrintLayout const & layout, std::vector<OptionOfLayouts> const & options)
{
    for (OptionOfLayouts const & option : options) {
        std::vector<Kind> const & kinds = option.m_Kinds;
        if (option.m_Option->count() > 0 && std::find(kinds.begin(), kinds.end(), layout.m_Kind) == kinds.end()) {
            std::string fitting;
            for (Kind const kind : kinds) {
                fitting += (fitting.empty() ? "" : ", ") + NameOf(kind);
            }
            throw CLI::ValidationError(option.m_Option->get_name(),
                                       Text("this is for the layouts %1, not for %2", "Program", fitting,
                                            NameOf(layout.m_Kind)));
        }
    }
    if (layout.m_Kind == Kind::Tiled && !layout.m_Paper) {
        throw CLI::ValidationError("--paper", Text("tiles need to know their paper, such as --paper A4", "Program"));
    }
    if (layout.m_Fit && *layout.m_Fit != Renderer::FitTypeScale) {
        if (!layout.m_Paper) {
            throw CLI::ValidationError("--fit", Text("pages are fitted to a paper, such as --paper A4", "Program"));
        }
        if (layout.m_Scale) {
            throw CLI::ValidationError("--scale", Text("a scale of one's own goes with --fit actual", "Program"));
        }
    }
}

}

void AddLayoutOptions(CLI::App & verb, PrintLayout & layout)
{
    auto const positive = [](int least) { return NumberBetween(least, 100'000); };
    std::string const lengths = Text("a length such as 10mm, or two such as 10x5mm", "Program");
    AddRead(verb, "layout", layout.m_Kind, OneOf(LayoutNames),
            Text("one of single, tiled, nup, book, booklet", "Program"),
            Text("single (the default), tiled, nup, book or booklet", "Help"));
    AddRead(verb, "paper", layout.m_Paper, &ReadPaper,
            Text("a paper: A0 to A8, B3 to B6, Letter, Legal, Tabloid, Executive, or a size such as 320x450mm", "Program"),
            Text("Paper by name (A4, Letter) or as WxH with mm, cm, in or pt; by default made to measure", "Help"));
    AddRead(
        verb, "pages", layout.m_Pages,
        [](std::string const & text) -> std::optional<std::string> {
            String problem;
            return !ParsePrintPages(text, -1, {0}).empty() && CheckPrintPages(text, problem) ? std::optional(text)
                                                                                           : std::nullopt;
        },
        Text("a choice of pages such as 1-8,3", "Program"),
        Text("Pages by number from 1, such as 1-8,3; by default all", "Help"));
    verb.add_option("--chapters", layout.m_Chapters,
                    Text("Chapters by number or name, such as 2,4-6; by default all", "Help"))
        ->type_name(Text("VALUE", "Help"));
    auto * const fit = AddRead(verb, "fit", layout.m_Fit,
                               OneOf(std::map<std::string, Renderer::FitTypeEnum>{{"actual", Renderer::FitTypeScale},
                                                                                  {"shrink", Renderer::FitTypeShrink},
                                                                                  {"fill", Renderer::FitTypeFill}}),
                               Text("one of actual, shrink, fill", "Program"),
                               Text("actual size, shrink to the paper (the default where there is one), or fill it", "Help"));
    AddRead(verb, "scale", layout.m_Scale, &ReadScale, Text("a scale between 1% and 10000%", "Program"),
            Text("Enlarge or reduce: 70% or 0.7", "Help"));
    AddRead(verb, "orientation", layout.m_Orientation,
            OneOf(std::map<std::string, Renderer::OrientationEnum>{{"auto", Renderer::OrientationAuto},
                                                                   {"portrait", Renderer::OrientationPortrait},
                                                                   {"landscape", Renderer::OrientationLandscape}}),
            Text("one of auto, portrait, landscape", "Program"),
            Text("auto (the default), portrait or landscape", "Help"));
    verb.add_flag("--bleed", layout.m_IncludeBleed, Text("Let pages go beyond their edge by their bleed", "Help"));
    verb.add_flag("--marks", layout.m_Marks, Text("Draw crop marks", "Help"));

    std::vector<OptionOfLayouts> options{{fit, {Kind::Single, Kind::NUp, Kind::Book, Kind::Booklet}}};
    auto const only = [&](CLI::Option * option, std::vector<Kind> kinds) {
        options.push_back({option, std::move(kinds)});
        return option;
    };
    std::string const number = Text("NUMBER", "Help");
    auto const addNumber = [&](char const * name, int & value, int least, std::string const & purpose) {
        only(verb.add_option(name, value, purpose)->type_name(number)->check(positive(least)), {Kind::NUp});
    };
    addNumber("--rows", layout.m_Rows, 1, Text("nup: rows of a sheet, by default 2", "Help"));
    addNumber("--columns", layout.m_Columns, 1, Text("nup: columns of a sheet, by default 2", "Help"));
    addNumber("--repeat", layout.m_Repeat, 1, Text("nup: cells that each page takes, by default 1", "Help"));
    addNumber("--skip", layout.m_Skip, 0, Text("nup: cells to leave empty at the start", "Help"));
    only(AddRead(verb, "margins", layout.m_Margins, &ReadLengths, lengths,
                 Text("nup: margins of the sheet, 10mm or 10x5mm", "Help")),
         {Kind::NUp});
    only(AddRead(verb, "gaps", layout.m_Gaps, &ReadLengths, lengths, Text("nup: gaps between pages", "Help")),
         {Kind::NUp});
    only(verb.add_flag("--fill", layout.m_Fill, Text("nup: fill the last sheet from the first page on", "Help")),
         {Kind::NUp});
    only(AddRead(verb, "overlap", layout.m_Overlap, &ReadLength, Text("a length such as 10mm", "Program"),
                 Text("tiled: strip that neighbouring tiles share, by default none", "Help")),
         {Kind::Tiled});
    only(verb.add_flag("--vertical", layout.m_Vertical, Text("book, booklet: pages one above the other", "Help")),
         {Kind::Book, Kind::Booklet});
    only(verb.add_flag("--blank-first", layout.m_BlankFirst, Text("book, booklet: a blank before the first page", "Help")),
         {Kind::Book, Kind::Booklet});
    verb.callback([&layout, options] { CheckTogether(layout, options); });
}

}
