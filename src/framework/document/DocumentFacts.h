#pragma once

#include "framework/document/Anchors.h"
#include "framework/document/DocumentMetadata.h"
#include "framework/document/PDFBookmarkManager.h"
#include "framework/document/PreflightResults.h"
#include "framework/kernel/CriticalSection.h"
#include "framework/kernel/ThreadSafety.h"
#include "framework/kernel/UnitValue.h"
#include "framework/kernel/UnitValueConverter.h"
#include "framework/raster/Format.h"
#include "framework/raster/ICCManager.h"

#include <optional>

/// What other threads ask a document without its lock. An immutable snapshot once it is published.
class DocumentFacts : public virtual Kernel::Countable
{
public:
    /// A format with the profiles that its numbers are meant in.
    struct ColourSettings
    {
        enum Raster::Format m_Format = Raster::Format::Rgba8;
        Raster::ICCManager::ICCProfileSet m_Profiles;
    };

    [[nodiscard]] enum Raster::Format GetFormat() const
    {
        return m_Override ? m_Override->m_Format : m_Colours.m_Format;
    }
    [[nodiscard]] Raster::ICCManager::ICCProfileSet const & GetProfiles() const
    {
        return m_Override ? m_Override->m_Profiles : m_Colours.m_Profiles;
    }

    String m_Guid;
    Kernel::Counted<DocumentMetadata const> m_Metadata = Kernel::MakeCounted<DocumentMetadata>();
    ColourSettings m_Colours;
    /// Conversion for output, over the document's own settings; never saved.
    std::optional<ColourSettings> m_Override;
    /// How many outputs have laid it on: it goes with the last of them.
    int m_OverrideUses = 0;
    Kernel::Counted<PDFBookmarkManager const> m_Bookmarks;
    Kernel::Counted<PreflightResults const> m_Preflight;
    Kernel::Counted<Anchors const> m_Anchors;
};

/// The present snapshot. Safe on any thread.
class PublishedDocumentFacts
{
public:
    /// Never null.
    [[nodiscard]] Kernel::Counted<DocumentFacts const> Get() const;
    /// Publishes a copy of the present snapshot with a change. Writers take turns.
    template <typename TChange>
    void Change(TChange const & change)
    {
        Kernel::ScopedLock const lock(m_Lock);
        Kernel::Counted<DocumentFacts> facts = Kernel::MakeCounted<DocumentFacts>(*m_Facts);
        change(*facts);
        m_Facts = facts;
    }

private:
    mutable Kernel::CriticalSection m_Lock;
    Kernel::Counted<DocumentFacts const> m_Facts KORVANE_GUARDED_BY(m_Lock) = Kernel::MakeCounted<DocumentFacts>();
};
