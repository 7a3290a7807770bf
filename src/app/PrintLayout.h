#pragma once

#include "app/BookSession.h"
#include "output/Paginator.h"
#include "output/PrintSheet.h"

#include <optional>
#include <string>

namespace CLI
{
class App;
}

namespace App
{

/// How the user wants pages on sheets. Lengths in points.
struct PrintLayout
{
    enum class Kind
    {
        Single,
        Tiled,
        NUp,
        Book,
        Booklet
    };

    Kind m_Kind = Kind::Single;
    /// Not said: each sheet's paper is made to measure.
    std::optional<Kernel::Size> m_Paper;
    /// As the user wrote it; empty for all pages.
    std::string m_Pages;
    /// Chapters by number or name, separated by commas; empty for all.
    std::string m_Chapters;
    /// Not said: shrunk to fit where there is a paper and no scale.
    std::optional<Renderer::FitTypeEnum> m_Fit;
    std::optional<double> m_Scale;
    Renderer::OrientationEnum m_Orientation = Renderer::OrientationAuto;
    bool m_IncludeBleed = false;
    bool m_Marks = false;
    int m_Rows = 2;
    int m_Columns = 2;
    int m_Repeat = 1;
    int m_Skip = 0;
    /// On paper, whatever the scale. Not said: as much as bleed and marks need on a given paper.
    std::optional<Kernel::Size> m_Margins;
    Kernel::Size m_Gaps{};
    bool m_Fill = false;
    double m_Overlap = 0;
    bool m_Vertical = false;
    bool m_BlankFirst = false;

    [[nodiscard]] Book::PrintSettings GetSettings() const;
};

/// Adds the options that fill a layout. They are checked as the command line is read: a value that makes no sense, and an
/// option of another layout than the one that is asked for, are wrong use.
void AddLayoutOptions(CLI::App & verb, PrintLayout & layout);

/// The sheets for a book whose records are up to date. Empty, with the reason in `messages`, if there is nothing to print
/// or there would be too many.
[[nodiscard]] std::vector<Book::PaginatorPage> LaySheets(BookSession const & session, PrintLayout const & layout,
                                                         Import::MessageList & messages);

}
