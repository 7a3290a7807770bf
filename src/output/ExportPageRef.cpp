#include "output/ExportPageRef.h"

#include <algorithm>

namespace Book
{

ExportPageForm FormOf(ExportPageEntry const & entry, int spreadPageCount)
{
    if (entry.empty()) {
        return ExportPageForm::Nothing;
    }
    ExportPageRef const & first = entry.front();
    ExportPageRef const & last = entry.back();
    bool const oneSpread = !first.IsPadding() && std::all_of(entry.begin(), entry.end(), [&](ExportPageRef const & ref) {
        return ref.m_Chapter == first.m_Chapter && ref.m_Spread == first.m_Spread;
    });
    if (oneSpread) {
        return static_cast<int>(entry.size()) == spreadPageCount ? ExportPageForm::WholeSpread
                                                                 : ExportPageForm::PageOfSpread;
    }
    if (first.IsPadding()) {
        return last.IsPadding() ? ExportPageForm::Nothing : ExportPageForm::PadThenPage;
    }
    if (last.IsPadding()) {
        return ExportPageForm::PageThenPad;
    }
    bool const merged = entry.size() >= 2 && !entry[1].IsPadding() && entry[1].m_Chapter != first.m_Chapter;
    return merged ? ExportPageForm::Merged : ExportPageForm::Nothing;
}

ExportPageRef const * FirstReal(ExportPageEntry const & entry)
{
    auto const found =
        std::find_if(entry.begin(), entry.end(), [](ExportPageRef const & ref) { return !ref.IsPadding(); });
    return found == entry.end() ? nullptr : &*found;
}

}
