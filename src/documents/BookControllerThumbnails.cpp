#include "core/BookController.h"
#include "framework/kernel/ArchiveThumbnails.h"

namespace Book
{

Kernel::Counted<Kernel::ArchiveThumbnails> BookController::CreateThumbnails() const
{
    // A preview is made from the bitmap of the key chapter's first spread, and no document draws bitmaps of its spreads:
    // book files have no preview pictures.
    return nullptr;
}

}
