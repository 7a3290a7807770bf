#pragma once

#include "framework/kernel/BackgroundTask.h"
#include "framework/kernel/CriticalSection.h"
#include "framework/kernel/ThreadSafety.h"
#include "framework/raster/DynamicBitmap.h"

class DocumentController;

/// The picture of its first spread that a document in front keeps ready, so that file and list previews cost no
/// rendering when they are wanted.
///
/// Dirty once the document has changed since the picture was made; a second of quiet later a command on the document's
/// queue makes a new one, and posts a `DocumentCacheBitmapChangedNotification` if it looks different. Owned by its
/// document; safe on any thread.
class DocumentCacheBitmap final : public BackgroundTask
{
public:
    /// Milliseconds without a change before the picture is made again.
    static constexpr int Interval = 1000;

    DocumentCacheBitmap();

    /// A command that renders the picture; null if previews are not wanted.
    Kernel::Counted<DomainCommand> GenerateCommand() override;

    /// Null before the first rendering.
    [[nodiscard]] Kernel::Counted<Raster::DynamicBitmap const> Get() const;
    /// The picture shows the document as it is after so many changes.
    [[nodiscard]] bool IsCurrent(std::uint64_t changes) const;
    /// Renders the document's first spread on the calling thread. True if the picture looks different from the one
    /// before. A document without a picture, such as one without pages, has none afterwards.
    bool Render(DocumentController const & document);

private:
    Kernel::CriticalSection m_PictureLock;
    Kernel::Counted<Raster::DynamicBitmap const> m_Picture KORVANE_GUARDED_BY(m_PictureLock);
    /// Changes of the document that the picture shows.
    std::uint64_t m_Changes KORVANE_GUARDED_BY(m_PictureLock) = 0;
    bool m_IsRendered KORVANE_GUARDED_BY(m_PictureLock) = false;
};
