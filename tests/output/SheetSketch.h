#pragma once

#include "core/BookChapter.h"
#include "output/Paginator.h"

#include <sstream>
#include <string>
#include <vector>

/// Pages to be put on sheets, and sheets as lines that a person can check on paper.
namespace SheetSketch
{

constexpr Kernel::Rect NoPaper{};
constexpr Kernel::Rect Bleed3{3, 3, 3, 3};

inline Kernel::Counted<Book::BookChapter const> AnyChapter()
{
    static Kernel::Counted<Book::BookChapter const> const chapter =
        Kernel::MakeCounted<Book::BookChapter const>(String("/books/chapter.kvdoc"));
    return chapter;
}

/// One source for each rectangle, numbered from 0.
inline std::vector<Book::PaginatorSource> Sources(std::vector<Kernel::Rect> const & rects, Kernel::Rect const & bleed = {})
{
    std::vector<Book::PaginatorSource> sources;
    for (Kernel::Rect const & rect : rects) {
        Book::PaginatorSource source;
        source.m_Chapter = AnyChapter();
        source.m_Spread = static_cast<int>(sources.size());
        source.m_PageRect = rect;
        source.m_PageBox = bleed;
        source.m_Index = static_cast<int>(sources.size());
        sources.push_back(source);
    }
    return sources;
}

/// `count` pages of 100 by 200.
inline std::vector<Book::PaginatorSource> Pages(int count)
{
    return Sources(std::vector<Kernel::Rect>(static_cast<std::size_t>(count), {0, 0, 100, 200}));
}

inline std::vector<int> AllOf(std::vector<Book::PaginatorSource> const & sources)
{
    std::vector<int> indices;
    for (Book::PaginatorSource const & source : sources) {
        indices.push_back(source.m_Index);
    }
    return indices;
}

inline std::string Text(Kernel::Rect const & rect)
{
    std::ostringstream text;
    text << '(' << rect.left << ' ' << rect.top << ' ' << rect.right << ' ' << rect.bottom << ')';
    return text.str();
}

/// What of a sheet a row looks at.
enum Look : int
{
    Targets = 1, ///< number:piece>place
    Bleeds = 2,  ///< what is rendered with bleed
    Frame = 4,   ///< extent, orientation, placement, scale
    Marks = 8,   ///< edges@x,y
};

inline std::string Describe(Book::PaginatorPage const & sheet, int look)
{
    std::ostringstream text;
    for (Book::PaginatorTarget const & target : sheet.m_Targets) {
        if (look & Targets) {
            text << target.m_Index << ':' << Text(target.m_PageRect) << '>'
                 << Text(target.m_Transform.MapBounds(target.m_PageRect)) << ' ';
        }
        if (look & Bleeds) {
            text << "bleed" << Text(target.m_BleedRect) << ' ';
        }
    }
    if (look & Frame) {
        text << Text(sheet.m_Rect) << " o" << sheet.m_Orientation << " p" << sheet.m_Placement << " x" << sheet.m_Scale
             << ' ';
    }
    if (look & Marks) {
        for (CropMarkPos const & mark : sheet.m_CropMarks) {
            text << mark.m_Edges << '@' << mark.m_X << ',' << mark.m_Y << ' ';
        }
    }
    std::string line = text.str();
    if (!line.empty()) {
        line.pop_back();
    }
    return line;
}

inline std::vector<std::string> Describe(std::vector<Book::PaginatorPage> const & sheets, int look)
{
    std::vector<std::string> lines;
    for (Book::PaginatorPage const & sheet : sheets) {
        lines.push_back(Describe(sheet, look));
    }
    return lines;
}

/// The running numbers on each sheet: "3 0", "-" for a sheet without any.
inline std::vector<std::string> Numbers(std::vector<Book::PaginatorPage> const & sheets)
{
    std::vector<std::string> lines;
    for (Book::PaginatorPage const & sheet : sheets) {
        std::string line;
        for (Book::PaginatorTarget const & target : sheet.m_Targets) {
            line += (line.empty() ? "" : " ") + std::to_string(target.m_Index);
        }
        lines.push_back(line.empty() ? "-" : line);
    }
    return lines;
}

}
