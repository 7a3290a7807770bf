#pragma once

#include "core/BookChapter.h"

namespace Book
{

/// Everything that a chapter's record knows, as one value: immutable once it is published, so that readers see facts
/// that belong together. What the fields mean is told at `BookChapter`'s getters. Cheap to copy: what is big is shared.
struct ChapterFacts
{
    Kernel::Counted<Kernel::UnitValueConverter const> m_UnitConverter;
    Kernel::Counted<const DocumentMetadata> m_Metadata;
    Kernel::Consolidated<Raster::ICCProfile> m_Profile;
    Raster::ICCManager::ICCProfileSet m_Profiles;
    Snapshot<std::vector<SpreadInfo>> m_SpreadInfo;
    // Until a document has been looked at, unit, format and the three flags of the layout are those of a new one.
    Kernel::UnitValue::UnitType m_UnitType = Kernel::UnitValue::UnitType::Points;
    Raster::Format m_ColourFormat = Raster::Format::Rgba8;
    bool m_AnchorsDirty = false;
    bool m_HasBleed = false;
    bool m_IsFacingPages = false;
    bool m_IsVerticalStack = false;
    int m_StartFromPage = 0;
    bool m_Restricted = false;
    bool m_ContainsIndex = false;
    Kernel::Counted<Story::Story const> m_Endnotes;
    int m_EndnoteSequenceStart = -1;
    int m_EndnoteSequenceEnd = -1;
    PreflightResult::Status m_PreflightStatus{};
    String m_PreflightDescription;
    Kernel::Counted<PreflightResults const> m_PreflightResults;
    BookChapter::Status m_Status = BookChapter::Status::Ok;
    String m_Path;
    String m_Pages;
    String m_Name;
    bool m_HasEndnotesMarker = false;
    bool m_IsKey = false;
    Kernel::TimeStamp m_TimeStamp;
    Snapshot<std::vector<AnchorInfo>> m_Anchors;
    int m_CachedStartPage = 1;
};

}
