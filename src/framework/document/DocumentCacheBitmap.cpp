#include "framework/document/DocumentCacheBitmap.h"

#include "framework/document/DocumentCommand.h"
#include "framework/document/DocumentNotifications.h"
#include "framework/document/SpreadPreview.h"
#include "framework/document/VantraController.h"
#include "framework/kernel/DomainBackgroundTaskCommand.h"

namespace
{

bool LookSame(Kernel::Counted<Raster::DynamicBitmap const> const & a,
              Kernel::Counted<Raster::DynamicBitmap const> const & b)
{
    return a && b ? a->GetFormat() == b->GetFormat() && a->GetWidth() == b->GetWidth() &&
                        a->GetPixels() == b->GetPixels()
                  : !a && !b;
}

class UpdateCacheBitmapCommand final : public DocumentCommand, public DomainBackgroundTaskCommand
{
public:
    explicit UpdateCacheBitmapCommand(Kernel::Counted<DocumentCacheBitmap> picture) : m_Picture(std::move(picture)) {}

    [[nodiscard]] Kernel::LocalisedString GetDescription() const override { return {}; }
    void PostDequeueWithMutableDomainController(Kernel::NonCounted<DomainController> controller) override
    {
        DocumentCommand::PostDequeueWithMutableDomainController(controller);
        DomainBackgroundTaskCommand::PostDequeueWithMutableDomainController(controller);
    }
    void Do() override
    {
        m_Changed = m_Picture->Render(*GetDocument());
        m_Picture->Clean();
    }
    void Undo() override {}
    void Redo() override {}
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications) override
    {
        Kernel::JailCounted<SpreadNode> const spread = GetDocument()->GetDocument()->GetSpreadAtIndex(0);
        if (m_Changed && spread) {
            notifications.push_back(Kernel::MakeCounted<DocumentCacheBitmapChangedNotification>(
                Kernel::Counted<DocumentController const>(GetDocument().Get()), spread));
        }
    }
    [[nodiscard]] bool ShouldStackForUndo() const override { return false; }
    [[nodiscard]] bool ClearsPreviewCommands() const override { return false; }
    [[nodiscard]] bool CanIgnoreIfQueueOccupied() const override { return true; }

private:
    Kernel::Counted<DocumentCacheBitmap> const m_Picture;
    bool m_Changed = false;
};

}

DocumentCacheBitmap::DocumentCacheBitmap() : BackgroundTask(Interval, false, true) {}

Kernel::Counted<DomainCommand> DocumentCacheBitmap::GenerateCommand()
{
    if (!VantraController::GetInstance().ArePreviewsWanted()) {
        Clean();
        return nullptr;
    }
    return Kernel::MakeCounted<UpdateCacheBitmapCommand>(Kernel::Counted<DocumentCacheBitmap>(this));
}

Kernel::Counted<Raster::DynamicBitmap const> DocumentCacheBitmap::Get() const
{
    Kernel::ScopedLock const lock(m_PictureLock);
    return m_Picture;
}

bool DocumentCacheBitmap::IsCurrent(std::uint64_t changes) const
{
    Kernel::ScopedLock const lock(m_PictureLock);
    return m_IsRendered && m_Changes == changes;
}

bool DocumentCacheBitmap::Render(DocumentController const & document)
{
    std::uint64_t const changes = document.GetAppearanceCount();
    Kernel::Counted<Raster::DynamicBitmap const> picture =
        SpreadPreview::Render(Kernel::Counted<DocumentController const>(&document), 0);
    Kernel::ScopedLock const lock(m_PictureLock);
    bool const changed = !LookSame(picture, m_Picture);
    if (changed) {
        m_Picture = std::move(picture);
    }
    m_Changes = changes;
    m_IsRendered = true;
    return changed;
}
