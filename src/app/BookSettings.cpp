#include "app/BookSettings.h"

#include "import/Text.h"

#include <charconv>
#include <cmath>
#include <type_traits>

namespace App
{

using Import::Text;

namespace
{

/// The words are the same in every language, so that scripts run everywhere; those that the table shows are understood
/// as well.
bool ReadValue(std::string const & text, bool & value)
{
    bool const isYes = "yes" == text || "on" == text || "true" == text || Text("yes", "Setting") == text;
    bool const isNo = "no" == text || "off" == text || "false" == text || Text("no", "Setting") == text;
    value = isYes || (value && !isNo);
    return isYes || isNo;
}

template <typename TNumber>
bool ReadNumber(std::string const & text, TNumber least, TNumber most, TNumber & value)
{
    TNumber read{};
    auto const [end, error] = std::from_chars(text.data(), text.data() + text.size(), read);
    // Written so that what is no number fails both comparisons.
    bool const isGood = std::errc() == error && end == text.data() + text.size() && least <= read && read <= most;
    value = isGood ? read : value;
    return isGood;
}

/// BCP 47 in its outlines: letters, digits and hyphens, beginning with two or three letters; or nothing.
bool ReadLanguage(std::string const & text, String & value)
{
    std::size_t const first = std::min(text.find('-'), text.size());
    bool isGood = text.empty() || (2 <= first && first <= 8);
    for (std::size_t at = 0; at < text.size(); ++at) {
        char const c = text[at];
        bool const isLetter = ('a' <= c && c <= 'z') || ('A' <= c && c <= 'Z');
        isGood = isGood && (isLetter || (first < at && (('0' <= c && c <= '9') || '-' == c)) || first == at);
    }
    if (isGood) {
        value = String(text);
    }
    return isGood;
}

/// Builds the rows. `TPart` finds the field in the settings.
class Rows
{
public:
    template <typename TPart>
    void Switch(SettingGroup group, char const * name, std::string meaning, TPart part)
    {
        m_Rows.push_back(
            {group, name, std::move(meaning), "yes|no",
             [part](BookSettings const & settings) { return Json(bool(part(settings))); },
             [part](BookSettings & settings, std::string const & text) { return ReadValue(text, part(settings)); }});
    }

    template <typename TNumber, typename TPart>
    void Number(char const * name, std::string meaning, TNumber least, TNumber most, TPart part)
    {
        std::string values;
        if constexpr (std::is_integral_v<TNumber>) {
            values = std::to_string(least) + "-" + std::to_string(most);
        } else {
            values = Json(static_cast<long>(least)).dump() + "-" + Json(static_cast<long>(most)).dump();
        }
        m_Rows.push_back({SettingGroup::Export, name, std::move(meaning), values,
                          [part](BookSettings const & settings) { return Json(part(settings)); },
                          [part, least, most](BookSettings & settings, std::string const & text) {
                              return ReadNumber<TNumber>(text, least, most, part(settings));
                          }});
    }

    std::vector<BookSetting> m_Rows;
};

std::vector<BookSetting> MakeRows()
{
    using Group = SettingGroup;
    Rows rows;
    rows.Switch(
        Group::Strays, "pad-strays",
        Text("Blank pages where a chapter would begin on the wrong side of a spread", "Help"),
        [](auto & s) -> auto & { return s.m_PadStrays; });
    rows.Switch(
        Group::Strays, "merge-strays",
        Text("A chapter's first page may share the spread with the last page before it", "Help"),
        [](auto & s) -> auto & { return s.m_MergeStrays; });
    rows.Switch(
        Group::Synchronise, "synchronise-swatches",
        Text("Synchronising carries colours over from the style source", "Help"),
        [](auto & s) -> auto & { return s.m_Synchronise.m_Swatches; });
    rows.Switch(
        Group::Synchronise, "synchronise-text-styles", Text("Synchronising carries text styles over", "Help"),
        [](auto & s) -> auto & { return s.m_Synchronise.m_TextStyles; });
    rows.Switch(
        Group::Synchronise, "synchronise-table-styles", Text("Synchronising carries table styles over", "Help"),
        [](auto & s) -> auto & { return s.m_Synchronise.m_TableStyles; });
    rows.Switch(
        Group::Synchronise, "synchronise-master-pages", Text("Synchronising carries master pages over", "Help"),
        [](auto & s) -> auto & { return s.m_Synchronise.m_MasterPages; });
    rows.Switch(
        Group::Export, "bleed", Text("Pages go beyond their trimmed edge by the bleed", "Help"),
        [](auto & s) -> auto & { return s.m_IncludesBleed; });
    rows.Switch(
        Group::Export, "crop-marks", Text("Crop marks round each page", "Help"),
        [](auto & s) -> auto & { return s.m_Pdf.m_PrintersMarks.m_CropMarks; });
    rows.Switch(
        Group::Export, "registration-marks", Text("Registration marks round each page", "Help"),
        [](auto & s) -> auto & { return s.m_Pdf.m_PrintersMarks.m_RegistrationMarks; });
    rows.Number(
        "marks-offset", Text("Points from the trimmed page to the marks", "Help"), 0.0, 72.0,
        [](auto & s) -> auto & { return s.m_Pdf.m_PrintersMarks.m_Offset; });
    rows.Number(
        "marks-length", Text("Length of the marks in points", "Help"), 1.0, 72.0,
        [](auto & s) -> auto & { return s.m_Pdf.m_PrintersMarks.m_Length; });
    rows.Number(
        "marks-width", Text("Width of the marks' lines in points", "Help"), 0.0, 10.0,
        [](auto & s) -> auto & { return s.m_Pdf.m_PrintersMarks.m_LineWidth; });
    rows.Switch(
        Group::Export, "links", Text("Links that can be clicked", "Help"),
        [](auto & s) -> auto & { return s.m_Pdf.m_Hyperlinks; });
    rows.Switch(
        Group::Export, "bookmarks", Text("An outline of bookmarks", "Help"),
        [](auto & s) -> auto & { return s.m_Pdf.m_Bookmarks; });
    rows.Number(
        "open-bookmarks", Text("Levels of the outline that are shown open", "Help"), 0, 99,
        [](auto & s) -> auto & { return s.m_Pdf.m_OpenBookmarkLevels; });
    rows.Switch(
        Group::Export, "page-labels", Text("Page labels as the chapters number their pages", "Help"),
        [](auto & s) -> auto & { return s.m_Pdf.m_PageLabels; });
    rows.Number(
        "picture-dpi", Text("Pixels to the inch to which finer pictures are reduced; 0 for no limit", "Help"), 0.0,
        9600.0, [](auto & s) -> auto & { return s.m_Pdf.m_PictureDpiLimit; });
    rows.Number(
        "picture-dpi-warning", Text("Warn of pictures with fewer pixels to the inch; 0 for never", "Help"), 0.0, 9600.0,
        [](auto & s) -> auto & { return s.m_Pdf.m_PictureDpiWarning; });
    rows.Switch(
        Group::Export, "keep-16-bit", Text("Pictures of 16 bits a channel keep them", "Help"),
        [](auto & s) -> auto & { return s.m_Pdf.m_Keep16Bit; });
    rows.Switch(
        Group::Export, "output-intent", Text("Name the printing condition that the file is meant for", "Help"),
        [](auto & s) -> auto & { return s.m_Pdf.m_OutputIntent; });
    rows.Switch(
        Group::Export, "metadata", Text("Embed the documents' metadata", "Help"),
        [](auto & s) -> auto & { return s.m_EmbedsMetadata; });
    rows.m_Rows.push_back({Group::Export, "language",
                           Text("Language of the file, such as en-GB; empty for that of the first chapter", "Help"),
                           Text("TAG", "Help"),
                           [](BookSettings const & settings) { return Json(settings.m_Pdf.m_Language.ToStd()); },
                           [](BookSettings & settings, std::string const & text) {
                               return ReadLanguage(text, settings.m_Pdf.m_Language);
                           }});
    return rows.m_Rows;
}

}

BookSettings BookSettings::Of(Book::BookController const & book)
{
    BookSettings settings;
    settings.m_PadStrays = book.IsPadStrays();
    settings.m_MergeStrays = book.IsMergeStrays();
    settings.m_Synchronise = book.GetSynchroniseSettings();
    auto const options = book.GetExportOptions();
    if (auto const * const pdf = dynamic_cast<Renderer::FileExportOptionsPDF const *>(options.Get())) {
        settings.m_IncludesBleed = pdf->GetIncludeBleed();
        settings.m_EmbedsMetadata = pdf->GetEmbedMetadata();
        settings.m_Pdf = pdf->GetSettings();
    }
    return settings;
}

Kernel::Consolidated<Renderer::FileExportOptions> BookSettings::MakeExportOptions() const
{
    auto const options = Kernel::MakeCounted<Renderer::FileExportOptionsPDF>();
    options->SetSettings(m_Pdf);
    options->SetIncludeBleed(m_IncludesBleed);
    options->SetEmbedMetadata(m_EmbedsMetadata);
    return Kernel::Consolidated<Renderer::FileExportOptions>(
        Kernel::Counted<Renderer::FileExportOptions const>(options));
}

std::vector<BookSetting> const & ListBookSettings()
{
    static std::vector<BookSetting> const rows = MakeRows();
    return rows;
}

std::string DescribeValue(Json const & value)
{
    if (value.is_boolean()) {
        return value.get<bool>() ? Text("yes", "Setting") : Text("no", "Setting");
    }
    if (value.is_string()) {
        return value.get<std::string>().empty() ? Text("none", "Setting") : value.get<std::string>();
    }
    if (value.is_number_float() && std::floor(value.get<double>()) == value.get<double>()) {
        return std::to_string(static_cast<long>(value.get<double>()));
    }
    return value.dump();
}

}
