#pragma once

#include "app/Json.h"
#include "core/BookController.h"
#include "framework/render/FileExportOptions.h"

#include <functional>
#include <string>
#include <vector>

namespace App
{

/// Everything that the verb "set" can change, as one value.
struct BookSettings
{
    bool m_PadStrays = false;
    bool m_MergeStrays = true;
    Book::BookController::SynchroniseSettings m_Synchronise;
    bool m_IncludesBleed = false;
    bool m_EmbedsMetadata = true;
    Renderer::FileExportOptionsPDF::Settings m_Pdf;

    /// As the book has them; where it keeps no options for PDF, those of new options.
    [[nodiscard]] static BookSettings Of(Book::BookController const & book);
    /// The part of them that an export needs.
    [[nodiscard]] Kernel::Consolidated<Renderer::FileExportOptions> MakeExportOptions() const;
};

/// Which command brings a setting into the book.
enum class SettingGroup
{
    Strays,
    Synchronise,
    Export
};

/// One setting as the user sees it: the name is that of the option without its dashes, and the key in JSON.
struct BookSetting
{
    SettingGroup m_Group;
    char const * m_Name;
    /// What it means, translated.
    std::string m_Meaning;
    /// The values that it takes, for the help.
    std::string m_Values;
    std::function<Json(BookSettings const &)> m_Get;
    /// Takes the user's text over; false if it makes no sense.
    std::function<bool(BookSettings &, std::string const &)> m_Set;
};

/// All settings, in the order in which they are shown.
[[nodiscard]] std::vector<BookSetting> const & ListBookSettings();

/// A setting's value for people: "yes", "no", a number, a text.
[[nodiscard]] std::string DescribeValue(Json const & value);

}
