#include "import/Template.h"

#include "import/SourceText.h"
#include "import/StyleReader.h"
#include "import/Text.h"

#include <algorithm>
#include <array>

namespace Import
{

namespace
{

struct PaperSize
{
    std::string_view m_Name;
    double m_Width;
    double m_Height;
};

constexpr double g_Millimetre = 72 / 25.4;

/// ISO 216 and the two American sizes, upright, in millimetres.
constexpr std::array g_Papers{
    PaperSize{"A4", 210, 297}, PaperSize{"A5", 148, 210},         PaperSize{"A6", 105, 148},
    PaperSize{"B5", 176, 250}, PaperSize{"letter", 215.9, 279.4}, PaperSize{"halfletter", 139.7, 215.9},
};

Raster::Colour ToRaster(Story::Colour const & colour)
{
    auto const & c = colour.m_Components;
    switch (colour.m_Space) {
    case Story::Colour::Space::RGB:
        return Raster::Colour::Rgb(c[0], c[1], c[2]);
    case Story::Colour::Space::CMYK:
        return Raster::Colour::Cmyk(c[0], c[1], c[2], c[3]);
    case Story::Colour::Space::Grey:
    case Story::Colour::Space::Lab:
        break;
    }
    return Raster::Colour::Grey(c[0]);
}

/// "{book} · {page}" into its parts; false at a name that is no field.
bool SplitFields(std::string_view text, std::vector<RunningTextPart> & parts)
{
    while (!text.empty()) {
        std::size_t const open = text.find('{');
        if (0 < open) {
            parts.push_back({RunningTextField::Text, String(text.substr(0, open))});
            text.remove_prefix(std::min(open, text.size()));
            continue;
        }
        std::size_t const close = text.find('}');
        std::string_view const name = std::string_view::npos == close ? text : text.substr(1, close - 1);
        if ("page" == name) {
            parts.push_back({RunningTextField::PageNumber, {}});
        } else if ("book" == name) {
            parts.push_back({RunningTextField::PublicationTitle, {}});
        } else if ("chapter" == name) {
            parts.push_back({RunningTextField::DocumentTitle, {}});
        } else {
            return false;
        }
        text.remove_prefix(close + 1);
    }
    return true;
}

class TemplateReader
{
public:
    TemplateReader(toml::table const & table, std::string const & file, MessageList & messages)
        : m_Reader(table, "", file, messages),
          m_File(file),
          m_Messages(messages)
    {
    }

    Template Read()
    {
        m_Reader.Text("name", m_Result.m_Name);
        std::string description;
        m_Reader.Text("description", description);
        m_Reader.Texts("bullets", m_Result.m_Bullets);
        if (m_Result.m_Bullets.empty()) {
            m_Result.m_Bullets.emplace_back("\u2022");
        }
        ReadColours();
        ReadPage();
        ReadStyles();
        ReadMasters();
        m_Reader.ReportUnknown();
        return std::move(m_Result);
    }

private:
    struct Margins
    {
        double m_Top = 56;
        double m_Bottom = 72;
        double m_Inside = 56;
        double m_Outside = 64;
    };

    void ReadColours()
    {
        auto const * table = m_Reader.Table("colours");
        if (!table) {
            return;
        }
        TomlReader reader(*table, "colours.", m_File, m_Messages);
        for (auto const & [key, node] : *table) {
            std::string text;
            if (!reader.Text(key.str(), text)) {
                continue;
            }
            if (auto const colour = ReadColour(text, m_Colours)) {
                m_Colours.emplace(key.str(), *colour);
                m_Result.m_Settings.m_Swatches.push_back({String(key.str()), ToRaster(*colour)});
            } else {
                reader.Refuse(
                    node, key.str(),
                    Text("a colour such as \"#8a1c1c\", \"grey(0.4)\" or \"cmyk(0, 0.9, 0.8, 0.2)\"", "Source"));
            }
        }
    }

    void ReadPaper(TomlReader & reader, PageSetup & setup)
    {
        auto const * node = reader.Find("size");
        if (!node) {
            return;
        }
        if (auto const * name = node->as_string()) {
            auto const paper = std::find_if(g_Papers.begin(), g_Papers.end(),
                                            [&](PaperSize const & p) { return p.m_Name == name->get(); });
            if (paper != g_Papers.end()) {
                setup.m_PageSize = {paper->m_Width * g_Millimetre, paper->m_Height * g_Millimetre};
                return;
            }
        } else if (auto const * pair = node->as_array(); pair && 2 == pair->size()) {
            double width = 0;
            double height = 0;
            auto const first = (*pair)[0].value<std::string>();
            auto const second = (*pair)[1].value<std::string>();
            if (first && second && ReadLength(*first, width) && ReadLength(*second, height) && 72 <= width &&
                72 <= height) {
                setup.m_PageSize = {width, height};
                return;
            }
        }
        reader.Refuse(
            *node, "size",
            Text("\"A4\", \"A5\", \"A6\", \"B5\", \"letter\", \"halfletter\" or two lengths of at least an inch",
                 "Source"));
    }

    void ReadPage()
    {
        auto const * table = m_Reader.Table("page");
        if (!table) {
            return;
        }
        PageSetup & setup = m_Result.m_Settings.m_PageSetup;
        TomlReader reader(*table, "page.", m_File, m_Messages);
        ReadPaper(reader, setup);
        reader.Switch("facing", setup.m_FacingPages);
        double bleed = 0;
        if (reader.Length("bleed", bleed)) {
            setup.m_Bleed = {bleed, bleed, bleed, bleed};
        }
        int start = 0;
        if (reader.Choice("chapter-start", {"next", "right"}, start)) {
            setup.m_ChapterStart = 1 == start ? ChapterStart::RightPage : ChapterStart::NextPage;
        }
        reader.Length("grid", setup.m_GridIncrement);
        reader.Length("grid-start", setup.m_GridStart);
        int colour = 0;
        if (reader.Choice("colour", {"rgb", "grey", "cmyk"}, colour)) {
            m_Result.m_Settings.m_Format = 1 == colour   ? Raster::Format::GreyAlpha8
                                           : 2 == colour ? Raster::Format::Cmyka8
                                                         : Raster::Format::Rgba8;
        }
        if (auto const * margins = reader.Table("margins")) {
            TomlReader lengths(*margins, "page.margins.", m_File, m_Messages);
            lengths.Length("top", m_Margins.m_Top);
            lengths.Length("bottom", m_Margins.m_Bottom);
            lengths.Length("inside", m_Margins.m_Inside);
            lengths.Length("outside", m_Margins.m_Outside);
            lengths.ReportUnknown();
        }
        reader.ReportUnknown();
        m_Result.m_Measure = setup.m_PageSize.width - m_Margins.m_Inside - m_Margins.m_Outside;
        double const height = setup.m_PageSize.height - m_Margins.m_Top - m_Margins.m_Bottom;
        if (m_Result.m_Measure < 36 || height < 72) {
            m_Messages.Error("toml-value", reader.PlaceOf(*table),
                             Text("The margins leave no room for text on the page.", "Source"));
        }
    }

    void ReadStyles()
    {
        auto sheet = Kernel::MakeCounted<Story::StyleSheet>();
        Story::AttSet glyphAtts;
        Story::AttSet paragraphAtts;
        if (auto const * table = m_Reader.Table("text")) {
            TomlReader reader(*table, "text.", m_File, m_Messages);
            ReadStyleAttributes(reader, m_Colours, glyphAtts, &paragraphAtts);
            reader.ReportUnknown();
        }
        sheet->SetDefaults(glyphAtts, paragraphAtts);
        ReadStyleList(
            "paragraph", [&](Story::TextStyle style) { sheet->SetParagraphStyle(std::move(style)); }, true);
        ReadStyleList(
            "character", [&](Story::TextStyle style) { sheet->SetCharacterStyle(std::move(style)); }, false);
        m_Result.m_Settings.m_Styles = sheet;
    }

    template <typename Add>
    void ReadStyleList(std::string const & kind, Add && add, bool hasParagraph)
    {
        auto const * list = m_Reader.Table(kind);
        if (!list) {
            return;
        }
        TomlReader styles(*list, kind + ".", m_File, m_Messages);
        for (auto const & [key, node] : *list) {
            auto const * table = styles.Table(key.str());
            if (!table) {
                continue;
            }
            TomlReader reader(*table, kind + "." + std::string(key.str()) + ".", m_File, m_Messages);
            Story::TextStyle style;
            style.m_Name = String(key.str());
            std::string base;
            if (reader.Text("based-on", base)) {
                style.m_BasedOn = String(base);
                if (!list->contains(base)) {
                    reader.Refuse(*reader.Find("based-on"), "based-on",
                                  Text("the name of another style under [%1]", "Source", kind));
                }
            }
            ReadStyleAttributes(reader, m_Colours, style.m_GlyphAtts, hasParagraph ? &style.m_ParagraphAtts : nullptr);
            reader.ReportUnknown();
            add(std::move(style));
        }
    }

    void ReadMasters()
    {
        auto const * list = m_Reader.Table("master");
        DocumentSettings & settings = m_Result.m_Settings;
        if (list) {
            for (auto const & [key, node] : *list) {
                MasterSettings & master = settings.m_Masters.emplace_back();
                master.m_Name = String(key.str());
                PlaceText(master);
                if (auto const * table = node.as_table()) {
                    ReadMaster(*table, std::string(key.str()), master);
                } else {
                    m_Messages.Error("toml-value", m_Reader.PlaceOf(node),
                                     Text("\"%1\" has to be a table.", "Source", "master." + std::string(key.str())));
                }
            }
        }
        auto const has = [&](char const * name) {
            return std::any_of(settings.m_Masters.begin(), settings.m_Masters.end(),
                               [&](MasterSettings const & master) { return master.m_Name == name; });
        };
        for (char const * name : {"body", "first"}) {
            if (!has(name)) {
                MasterSettings & master = settings.m_Masters.emplace_back();
                master.m_Name = name;
                PlaceText(master);
            }
        }
        settings.m_PageSetup.m_BodyMaster = "body";
        settings.m_PageSetup.m_FirstMaster = "first";
        m_Result.m_TitleMaster = has("title") ? "title" : "";
    }

    void PlaceText(MasterSettings & master) const
    {
        auto const & size = m_Result.m_Settings.m_PageSetup.m_PageSize;
        double const bottom = size.height - m_Margins.m_Bottom;
        master.m_Right.m_TextRect = {m_Margins.m_Inside, m_Margins.m_Top, size.width - m_Margins.m_Outside, bottom};
        master.m_Left.m_TextRect = {m_Margins.m_Outside, m_Margins.m_Top, size.width - m_Margins.m_Inside, bottom};
    }

    void ReadMaster(toml::table const & table, std::string const & name, MasterSettings & master)
    {
        TomlReader reader(table, "master." + name + ".", m_File, m_Messages);
        double top = 0;
        if (reader.Length("top", top)) {
            master.m_Left.m_TextRect.top = top;
            master.m_Right.m_TextRect.top = top;
        }
        for (char const * kind : {"running", "rule"}) {
            auto const * node = reader.Find(kind);
            auto const * items = node ? node->as_array() : nullptr;
            if (node && !items) {
                reader.Refuse(*node, kind, Text("a list of tables, written [[master.%1.%2]]", "Source", name, kind));
                continue;
            }
            for (std::size_t at = 0; items && at < items->size(); ++at) {
                if (auto const * item = (*items)[at].as_table()) {
                    ReadItem(*item, "master." + name + "." + kind + ".", 'u' == kind[1] && 'l' == kind[2], master);
                } else {
                    reader.Refuse(*node, kind,
                                  Text("a list of tables, written [[master.%1.%2]]", "Source", name, kind));
                }
            }
        }
        reader.ReportUnknown();
    }

    void ReadItem(toml::table const & table, std::string const & prefix, bool isRule, MasterSettings & master)
    {
        TomlReader reader(table, prefix, m_File, m_Messages);
        auto const & size = m_Result.m_Settings.m_PageSetup.m_PageSize;
        int side = 2;
        reader.Choice("page", {"left", "right", "both"}, side);
        double bottom = m_Margins.m_Top / 2;
        reader.Length("from-top", bottom);
        double fromBottom = 0;
        if (reader.Length("from-bottom", fromBottom)) {
            bottom = size.height - fromBottom;
        }
        RunningTextSettings text;
        ShapeSettings shape;
        double thickness = 0.5;
        int alignment = 3;
        if (isRule) {
            reader.Length("thickness", thickness);
            std::string name = "grey(0)";
            reader.Text("colour", name);
            auto const colour = ReadColour(name, m_Colours);
            if (!colour) {
                reader.Refuse(*reader.Find("colour"), "colour", Text("a colour, or a name from [colours]", "Source"));
            }
            shape.m_Fill = ToRaster(colour.value_or(Story::Colour{}));
        } else {
            std::string pattern;
            std::string style = "Running head";
            reader.Text("style", style);
            text.m_Style = String(style);
            reader.Choice("align", {"left", "centre", "right", "outside", "inside"}, alignment);
            if (!reader.Text("text", pattern) || !SplitFields(pattern, text.m_Parts)) {
                m_Messages.Error("toml-value", reader.PlaceOf(table),
                                 Text("\"%1\" has to be a text in which {book}, {chapter} and {page} stand for those.",
                                      "Source", prefix + "text"));
            }
        }
        reader.ReportUnknown();
        for (bool const isLeft : {true, false}) {
            if ((0 == side && !isLeft) || (1 == side && isLeft)) {
                continue;
            }
            MasterPageSettings & page = isLeft ? master.m_Left : master.m_Right;
            double const left = page.m_TextRect.left;
            double const right = page.m_TextRect.right;
            if (isRule) {
                shape.m_Rect = {left, bottom - thickness, right, bottom};
                page.m_Shapes.push_back(shape);
            } else {
                int const actual = alignment < 3 ? alignment : (3 == alignment) == isLeft ? 0 : 2;
                text.m_Alignment = static_cast<RunningTextAlignment>(actual);
                text.m_Rect = {left, bottom - 20, right, bottom};
                page.m_RunningTexts.push_back(text);
            }
        }
    }

    TomlReader m_Reader;
    std::string const & m_File;
    MessageList & m_Messages;
    Template m_Result;
    ColourTable m_Colours{{"black", Story::Colour::Grey(0)}, {"white", Story::Colour::Grey(1)}};
    Margins m_Margins;
};

}

std::optional<Template> ReadTemplateText(std::string const & text, std::string const & shownName,
                                         MessageList & messages)
{
    auto const table = ParseToml(text, shownName, messages);
    if (!table) {
        return std::nullopt;
    }
    MessageList own;
    Template result = TemplateReader(*table, shownName, own).Read();
    messages.Append(own);
    if (own.HasErrors()) {
        return std::nullopt;
    }
    result.m_Hash = HashBytes(text);
    return result;
}

std::optional<Template> ReadTemplate(std::filesystem::path const & path, MessageList & messages)
{
    std::string const shown = path.filename().string();
    auto const text = ReadSourceText(path, shown, messages);
    auto result = text ? ReadTemplateText(*text, shown, messages) : std::nullopt;
    if (result) {
        result->m_Path = path;
    }
    return result;
}

}
