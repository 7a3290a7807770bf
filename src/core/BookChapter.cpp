#include "core/BookChapter.h"

#include "core/ChapterFacts.h"
#include "core/SpreadWalk.h"
#include "framework/document/DocumentMetadata.h"
#include "framework/kernel/Assert.h"
#include "framework/kernel/FileSystem.h"
#include "framework/kernel/InSerialiser.h"
#include "framework/kernel/OutSerialiser.h"
#include "framework/kernel/Path.h"
#include "framework/raster/ICCProfile.h"
#include "framework/story/Story.h"

namespace Book
{

Kernel::ClassProperties const BookChapter::ms_ClassProperties(Kernel::ClassUID("BkCh"), &BookChapter::CreateObject, 1,
                                                              {}, nullptr);
static Kernel::ClassPropertiesBase::Init const s_BookChapterInit(BookChapter::GetTypeClassProperties());

BookChapter::UpdateSession::UpdateSession(BookChapter & chapter) : m_Chapter(chapter)
{
    m_Chapter.m_WriterLock.lock();
    if (++m_Chapter.m_SessionDepth == 1) {
        m_Chapter.m_Draft = std::make_shared<ChapterFacts>(*m_Chapter.m_Facts.Get());
        m_Chapter.m_DraftOwner = std::this_thread::get_id();
    }
}

BookChapter::UpdateSession::~UpdateSession()
{
    if (--m_Chapter.m_SessionDepth == 0) {
        m_Chapter.m_DraftOwner = std::thread::id();
        m_Chapter.m_Facts.Set(std::move(m_Chapter.m_Draft));
        m_Chapter.m_Draft.reset();
    }
    m_Chapter.m_WriterLock.unlock();
}

BookChapter::BookChapter() : m_Facts(std::make_shared<const ChapterFacts>()) {}

BookChapter::BookChapter(String const & path)
{
    ChapterFacts facts;
    facts.m_Path = path;
    facts.m_Name = Kernel::Path::GetFileNameWithoutExtension(path);
    facts.m_CachedStartPage = 0;
    m_Facts.Set(std::make_shared<const ChapterFacts>(std::move(facts)));
}

BookChapter::~BookChapter() = default;

BookChapter::Facts BookChapter::Now() const
{
    // Only the thread that set the owner can find itself there.
    return m_DraftOwner.load() == std::this_thread::get_id() ? Facts(m_Draft) : m_Facts.Get();
}

template <typename TChange>
auto BookChapter::Change(const TChange & change)
{
    const UpdateSession session(*this);
    return change(*m_Draft);
}

String BookChapter::GetName() const
{
    return Now()->m_Name;
}

String BookChapter::GetPath() const
{
    return Now()->m_Path;
}

bool BookChapter::HasPath(String const & path) const
{
    if (m_DraftOwner.load() == std::this_thread::get_id()) {
        return m_Draft->m_Path == path;
    }
    return m_Facts.Look([&path](Facts const & facts) { return facts->m_Path == path; });
}

int BookChapter::GetCachedStartPage() const
{
    return Now()->m_CachedStartPage;
}

int BookChapter::GetStartFromPage() const
{
    return Now()->m_StartFromPage;
}

int BookChapter::GetEndnoteSequenceStart() const
{
    return Now()->m_EndnoteSequenceStart;
}

int BookChapter::GetEndnoteSequenceEnd() const
{
    return Now()->m_EndnoteSequenceEnd;
}

Raster::Format BookChapter::GetColourFormat() const
{
    return Now()->m_ColourFormat;
}

Kernel::UnitValue::UnitType BookChapter::GetUnitType() const
{
    return Now()->m_UnitType;
}

Kernel::Counted<Kernel::UnitValueConverter const> BookChapter::GetUnitConverter() const
{
    return Now()->m_UnitConverter;
}

Kernel::Counted<const DocumentMetadata> BookChapter::GetMetadata() const
{
    return Now()->m_Metadata;
}

Kernel::Consolidated<Raster::ICCProfile> BookChapter::GetProfile() const
{
    return Now()->m_Profile;
}

Raster::ICCManager::ICCProfileSet BookChapter::GetProfiles() const
{
    return Now()->m_Profiles;
}

Kernel::Counted<Story::Story const> BookChapter::GetEndnotes() const
{
    return Now()->m_Endnotes;
}

PreflightResult::Status BookChapter::GetPreflightStatus() const
{
    return Now()->m_PreflightStatus;
}

String BookChapter::GetPreflightDescription() const
{
    return Now()->m_PreflightDescription;
}

Kernel::Counted<PreflightResults const> BookChapter::GetPreflightResults() const
{
    return Now()->m_PreflightResults;
}

Kernel::TimeStamp BookChapter::GetTimeStamp() const
{
    return Now()->m_TimeStamp;
}

Snapshot<std::vector<SpreadInfo>> BookChapter::GetSpreadInfo() const
{
    return Now()->m_SpreadInfo;
}

Snapshot<std::vector<AnchorInfo>> BookChapter::GetAnchors() const
{
    return Now()->m_Anchors;
}

bool BookChapter::HasBleed() const
{
    return Now()->m_HasBleed;
}

bool BookChapter::IsFacingPages() const
{
    return Now()->m_IsFacingPages;
}

bool BookChapter::IsVerticalStack() const
{
    return Now()->m_IsVerticalStack;
}

bool BookChapter::IsKey() const
{
    return Now()->m_IsKey;
}

bool BookChapter::HasEndnotesMarker() const
{
    return Now()->m_HasEndnotesMarker;
}

bool BookChapter::ContainsIndex() const
{
    return Now()->m_ContainsIndex;
}

bool BookChapter::IsRestricted() const
{
    return Now()->m_Restricted;
}

bool BookChapter::AreAnchorsDirty() const
{
    return Now()->m_AnchorsDirty;
}

String BookChapter::DescribePages() const
{
    return Now()->m_Pages;
}

BookChapter::Status BookChapter::GetStatus() const
{
    const Facts facts = Now();
    return facts->m_Restricted ? Status::Restricted : facts->m_Status;
}

String BookChapter::GetStatusDescription() const
{
    return DescribeStatus(GetStatus());
}

Kernel::LocalisedString BookChapter::DescribeStatus(Status status)
{
    switch (status) {
    case Status::Ok:
        return Kernel::LocalisedString("Status: OK", "Chapter Status");
    case Status::OpenForEdit:
        return Kernel::LocalisedString("Status: Open for edit", "Chapter Status");
    case Status::Locked:
        return Kernel::LocalisedString("Status: Locked", "Chapter Status");
    case Status::NotFound:
        return Kernel::LocalisedString("Status: Not found or accessible", "Chapter Status");
    case Status::OutOfDate:
        return Kernel::LocalisedString("Status: Out of date", "Chapter Status");
    case Status::Restricted:
        return Kernel::LocalisedString("Status: Restricted", "Chapter Status");
    }
    return {};
}

bool BookChapter::IsValid() const
{
    const Status status = GetStatus();
    return status == Status::Ok || status == Status::OpenForEdit || status == Status::OutOfDate;
}

void BookChapter::SetName(String const & name)
{
    Change([&](ChapterFacts & facts) { facts.m_Name = name; });
}

void BookChapter::SetPath(String const & path)
{
    Change([&](ChapterFacts & facts) { facts.m_Path = path; });
}

void BookChapter::SetCachedStartPage(int page)
{
    Change([&](ChapterFacts & facts) { facts.m_CachedStartPage = page; });
}

void BookChapter::SetStartFromPage(int page)
{
    Change([&](ChapterFacts & facts) { facts.m_StartFromPage = page; });
}

void BookChapter::SetColourFormat(Raster::Format format)
{
    Change([&](ChapterFacts & facts) { facts.m_ColourFormat = format; });
}

void BookChapter::SetUnitType(Kernel::UnitValue::UnitType type)
{
    Change([&](ChapterFacts & facts) { facts.m_UnitType = type; });
}

void BookChapter::SetUnitConverter(Kernel::Counted<Kernel::UnitValueConverter const> converter)
{
    Change([&](ChapterFacts & facts) { facts.m_UnitConverter = std::move(converter); });
}

void BookChapter::SetMetadata(Kernel::Counted<const DocumentMetadata> metadata)
{
    Change([&](ChapterFacts & facts) { facts.m_Metadata = std::move(metadata); });
}

void BookChapter::SetProfile(Kernel::Consolidated<Raster::ICCProfile> profile)
{
    Change([&](ChapterFacts & facts) { facts.m_Profile = std::move(profile); });
}

void BookChapter::SetProfiles(const Raster::ICCManager::ICCProfileSet & profiles)
{
    Change([&](ChapterFacts & facts) { facts.m_Profiles = profiles; });
}

void BookChapter::SetHasBleed(bool hasBleed)
{
    Change([&](ChapterFacts & facts) { facts.m_HasBleed = hasBleed; });
}

void BookChapter::SetIsFacingPages(bool isFacingPages)
{
    Change([&](ChapterFacts & facts) { facts.m_IsFacingPages = isFacingPages; });
}

void BookChapter::SetIsVerticalStack(bool isVerticalStack)
{
    Change([&](ChapterFacts & facts) { facts.m_IsVerticalStack = isVerticalStack; });
}

void BookChapter::SetIsKey(bool isKey)
{
    Change([&](ChapterFacts & facts) { facts.m_IsKey = isKey; });
}

void BookChapter::SetHasEndnotesMarker(bool hasMarker)
{
    Change([&](ChapterFacts & facts) { facts.m_HasEndnotesMarker = hasMarker; });
}

void BookChapter::SetContainsIndex(bool containsIndex)
{
    Change([&](ChapterFacts & facts) { facts.m_ContainsIndex = containsIndex; });
}

void BookChapter::SetRestricted(bool restricted)
{
    Change([&](ChapterFacts & facts) { facts.m_Restricted = restricted; });
}

void BookChapter::SetSpreadInfo(std::vector<SpreadInfo> const & spreads)
{
    Change([&](ChapterFacts & facts) {
        if (&spreads != &*facts.m_SpreadInfo) {
            facts.m_SpreadInfo = Snapshot(spreads);
        }
    });
}

void BookChapter::SetEndnotes(Kernel::Counted<Story::Story const> endnotes, int start, int end)
{
    Change([&](ChapterFacts & facts) {
        facts.m_Endnotes = std::move(endnotes);
        facts.m_EndnoteSequenceStart = start;
        facts.m_EndnoteSequenceEnd = end;
    });
}

void BookChapter::SetAnchors(std::vector<AnchorInfo> const & anchors)
{
    Change([&](ChapterFacts & facts) {
        if (&anchors != &*facts.m_Anchors) {
            facts.m_Anchors = Snapshot(anchors);
        }
        facts.m_AnchorsDirty = false;
    });
}

void BookChapter::SetAnchorsDirty()
{
    Change([](ChapterFacts & facts) {
        facts.m_Anchors = {};
        facts.m_AnchorsDirty = true;
    });
}

bool BookChapter::SetStatus(Status status)
{
    return Change([&](ChapterFacts & facts) { return std::exchange(facts.m_Status, status) != status; });
}

bool BookChapter::SetPages(String const & pages)
{
    return Change([&](ChapterFacts & facts) { return !(std::exchange(facts.m_Pages, pages) == pages); });
}

bool BookChapter::SetPreflightStatus(PreflightResult::Status status, String const & description)
{
    return Change([&](ChapterFacts & facts) {
        bool const otherStatus = std::exchange(facts.m_PreflightStatus, status) != status;
        bool const otherText = !(std::exchange(facts.m_PreflightDescription, description) == description);
        return otherStatus && otherText;
    });
}

void BookChapter::SetPreflightResults(Kernel::Counted<PreflightResults const> results)
{
    Change([&](ChapterFacts & facts) { facts.m_PreflightResults = std::move(results); });
}

bool BookChapter::UpdateTimeStamp()
{
    Kernel::TimeStamp time;
    if (!Kernel::FileSystem::GetModifiedTime(GetPath(), time)) {
        return false;
    }
    return Change([&](ChapterFacts & facts) { return std::exchange(facts.m_TimeStamp, time) != time; });
}

bool BookChapter::WouldUpdateTimeStamp() const
{
    const Facts facts = Now();
    Kernel::TimeStamp time;
    return Kernel::FileSystem::GetModifiedTime(facts->m_Path, time) && time != facts->m_TimeStamp;
}

String BookChapter::GetPassword(String guid) const
{
    Kernel::ScopedLock const lock(m_PasswordsLock);
    const auto found = m_Passwords.find(guid);
    return found == m_Passwords.end() ? String() : found->second;
}

void BookChapter::SetPassword(String guid, String password)
{
    Kernel::ScopedLock const lock(m_PasswordsLock);
    m_Passwords.insert_or_assign(std::move(guid), std::move(password));
}

int BookChapter::GetPageCount() const
{
    return SpreadWalk::PageCount(*GetSpreadInfo());
}

int BookChapter::GetExportingPageCount() const
{
    return SpreadWalk::ExportingPageCount(*GetSpreadInfo());
}

bool BookChapter::AllNonExporting() const
{
    return SpreadWalk::AllNonExporting(*GetSpreadInfo());
}

void BookChapter::GetFirstExportingSpreadAndPage(int & spread, int & page) const
{
    SpreadWalk::Place const place = SpreadWalk::FirstExporting(*GetSpreadInfo());
    spread = place.m_Spread;
    page = place.m_Page;
}

void BookChapter::GetLastExportingSpreadAndPage(int & spread, int & page) const
{
    SpreadWalk::Place const place = SpreadWalk::LastExporting(*GetSpreadInfo());
    spread = place.m_Spread;
    page = place.m_Page;
}

void BookChapter::GetNextExportingSpreadAndPage(int & spread, int & page) const
{
    SpreadWalk::Place const place = SpreadWalk::NextExporting(*GetSpreadInfo(), {spread, page});
    spread = place.m_Spread;
    page = place.m_Page;
}

bool BookChapter::IsDoublePageStart() const
{
    return SpreadWalk::IsDoublePageStart(*GetSpreadInfo());
}

bool BookChapter::HasHangingPageEnd() const
{
    return SpreadWalk::HasHangingPageEnd(*GetSpreadInfo());
}

bool BookChapter::CanMergeWithPrevious(Kernel::Counted<BookChapter const> previous) const
{
    if (!previous) {
        return false;
    }
    const Facts ours = Now();
    const Facts theirs = previous->Now();
    return ours->m_IsFacingPages && theirs->m_IsFacingPages && ours->m_IsVerticalStack == theirs->m_IsVerticalStack &&
           !SpreadWalk::IsDoublePageStart(*ours->m_SpreadInfo) &&
           SpreadWalk::HasHangingPageEnd(*theirs->m_SpreadInfo) &&
           SpreadWalk::JoinsPrevious(*ours->m_SpreadInfo, *theirs->m_SpreadInfo, ours->m_IsVerticalStack);
}

int BookChapter::GetPrePagePaddingCount(Kernel::Counted<BookChapter const> previous, bool padStrays,
                                        bool mergeStrays) const
{
    if (!previous || !padStrays || (mergeStrays && CanMergeWithPrevious(previous))) {
        return 0;
    }
    return SpreadWalk::PaddingAfter(*GetSpreadInfo(), *previous->GetSpreadInfo());
}

void BookChapter::SetInClose(bool inClose) const
{
    Kernel::ScopedLock const lock(m_InCloseLock);
    m_InClose = inClose;
    if (!inClose && m_OnCloseFinished) {
        m_OnCloseFinished();
        m_OnCloseFinished = nullptr;
    }
}

bool BookChapter::IsInClose(std::function<void()> onCloseFinished) const
{
    Kernel::ScopedLock const lock(m_InCloseLock);
    if (!m_InClose) {
        return false;
    }
    m_OnCloseFinished = std::move(onCloseFinished);
    return true;
}

void BookChapter::Save(Kernel::OutSerialiser & out) const
{
    Facts const facts = Now();
    out.SaveType("path", facts->m_Path);
    out.SaveType("page", facts->m_Pages);
    out.SaveType("name", facts->m_Name);
    out.SaveType("isky", facts->m_IsKey);
    out.SaveType("sfpg", facts->m_StartFromPage);
    out.SaveType("endm", facts->m_HasEndnotesMarker);
    out.SaveType("lmod", facts->m_TimeStamp);
}

bool BookChapter::Load(Kernel::InSerialiser const & in, Kernel::FileStore &, unsigned short)
{
    Change([&](ChapterFacts & facts) {
        in.LoadType("path", facts.m_Path);
        in.LoadType("page", facts.m_Pages);
        in.LoadType("name", facts.m_Name);
        in.LoadType("isky", facts.m_IsKey);
        in.LoadType("sfpg", facts.m_StartFromPage);
        in.LoadType("endm", facts.m_HasEndnotesMarker);
        in.LoadType("lmod", facts.m_TimeStamp);
    });
    return true;
}

Kernel::ClassProperties const & BookChapter::GetObjectClassProperties() const
{
    return ms_ClassProperties;
}

Kernel::ClassProperties const & BookChapter::GetTypeClassProperties()
{
    return ms_ClassProperties;
}

Kernel::Counted<Kernel::Serialisable> BookChapter::CreateObject()
{
    return Kernel::MakeCounted<BookChapter>();
}

}
