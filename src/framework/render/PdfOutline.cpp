#include "framework/render/PdfOutline.h"

#include "framework/render/PdfText.h"
#include "framework/render/Qpdf.h"

#include <unordered_map>

namespace Renderer::RenderTree
{

QPDFObjectHandle MakeOutline(QPDF & pdf, std::vector<Kernel::Counted<PdfBookmark const>> const & bookmarks,
                             int openLevels, std::function<QPDFObjectHandle(PdfBookmark const &)> const & destination)
{
    using Handle = QPDFObjectHandle;
    if (bookmarks.empty()) {
        return Handle::newNull();
    }
    struct Item
    {
        Handle m_Object;
        std::size_t m_Parent = 0;
        int m_Level = 0;
        std::size_t m_First = 0;
        std::size_t m_Last = 0;
        /// Entries below that would show if this one and those above were open.
        long long m_Shown = 0;
    };
    // Item 0 is the root; entries follow in their order.
    std::vector<Item> items(bookmarks.size() + 1);
    std::unordered_map<PdfBookmark const *, std::size_t> places;
    for (std::size_t i = 0; i < items.size(); ++i) {
        Item & item = items[i];
        item.m_Object = pdf.makeIndirectObject(Handle::newDictionary());
        if (i == 0) {
            item.m_Object.replaceKey("/Type", Handle::newName("/Outlines"));
            continue;
        }
        PdfBookmark const & bookmark = *bookmarks[i - 1];
        auto const parent = places.find(bookmark.m_Parent.Get());
        item.m_Parent = bookmark.m_Parent && parent != places.end() ? parent->second : 0;
        item.m_Level = items[item.m_Parent].m_Level + 1;
        places.emplace(&bookmark, i);

        item.m_Object.replaceKey("/Title", Handle::newString(TextString(bookmark.m_Title.View())));
        item.m_Object.replaceKey("/Parent", items[item.m_Parent].m_Object);
        if (Handle target = destination(bookmark); !target.isNull()) {
            item.m_Object.replaceKey("/Dest", target);
        }
        Item & above = items[item.m_Parent];
        if (above.m_First == 0) {
            above.m_First = i;
        } else {
            item.m_Object.replaceKey("/Prev", items[above.m_Last].m_Object);
            items[above.m_Last].m_Object.replaceKey("/Next", item.m_Object);
        }
        above.m_Last = i;
    }
    for (std::size_t i = items.size(); i-- > 0;) {
        Item & item = items[i];
        bool const open = i == 0 || item.m_Level <= openLevels;
        if (item.m_First != 0) {
            item.m_Object.replaceKey("/First", items[item.m_First].m_Object);
            item.m_Object.replaceKey("/Last", items[item.m_Last].m_Object);
            item.m_Object.replaceKey("/Count", Handle::newInteger(open ? item.m_Shown : -item.m_Shown));
        }
        if (i != 0) {
            items[item.m_Parent].m_Shown += 1 + (open ? item.m_Shown : 0);
        }
    }
    return items[0].m_Object;
}

}
