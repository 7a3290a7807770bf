#include "core/BookController.h"
#include "framework/document/SpreadPreview.h"
#include "framework/document/VantraController.h"
#include "framework/kernel/ArchiveThumbnails.h"

namespace Book
{

Kernel::Counted<Kernel::ArchiveThumbnails> BookController::CreateThumbnails() const
{
    if (!VantraController::GetInstance().ArePreviewsWanted()) {
        return nullptr;
    }
    Kernel::Counted<BookChapter const> const key = GetKeyChapter(false);
    Kernel::Counted<Raster::DynamicBitmap const> const bitmap = m_Thumbnail.Get();
    if (!key || !bitmap) {
        return nullptr;
    }
    // A bitmap that is behind the chapter is stretched to the shape that the spread has now. In a book that was loaded
    // and not looked at since, the bitmap's own shape is the last that is known.
    Kernel::Rect shape{0, 0, static_cast<double>(bitmap->GetWidth()), static_cast<double>(bitmap->GetHeight())};
    bool transparent = false;
    auto const spreads = key->GetSpreadInfo();
    if (!spreads.empty()) {
        shape = spreads.begin()->m_SpreadBounds;
        transparent = spreads.begin()->m_SpreadFlag;
    }
    Kernel::Counted<Kernel::RawData> const png = SpreadPreview::Encode(
        *bitmap, shape.Width(), shape.Height(), transparent, key->GetProfile(), key->GetProfiles());
    if (!png) {
        return nullptr;
    }
    auto const thumbnails = Kernel::MakeCounted<Kernel::ArchiveThumbnails>();
    thumbnails->AddFile(Kernel::ArchiveThumbnails::FileType::Png, png);
    return thumbnails;
}

Kernel::Counted<Raster::DynamicBitmap>
BookController::RenderChapterThumbnail(Kernel::Counted<DocumentController const> const & document) const
{
    return SpreadPreview::Render(document, 0);
}

}
