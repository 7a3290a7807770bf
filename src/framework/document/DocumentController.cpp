#include "framework/document/DocumentController.h"

#include "framework/document/AnchorVisitor.h"
#include "framework/document/DocumentCacheBitmap.h"
#include "framework/document/DocumentComposer.h"
#include "framework/document/DocumentFile.h"
#include "framework/document/DocumentLinks.h"
#include "framework/document/DocumentNotifications.h"
#include "framework/document/DocumentStore.h"
#include "framework/document/DOMVisitor.h"
#include "framework/document/SpreadPreview.h"
#include "framework/document/VantraController.h"
#include "framework/kernel/Clock.h"
#include "framework/kernel/DomainWriterUnlockSession.h"
#include "framework/kernel/FileSystem.h"
#include "framework/kernel/Format.h"
#include "framework/kernel/Path.h"
#include "framework/kernel/Uuid.h"
#include "framework/typeset/FontLibrary.h"

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <optional>
#include <unistd.h>

namespace
{

constexpr char const * PackagedFontFolder = "Fonts";

}

Kernel::Counted<DocumentFacts const> PublishedDocumentFacts::Get() const
{
    Kernel::ScopedLock const lock(m_Lock);
    return m_Facts;
}

DocumentController::DocumentController()
    : m_Store(Kernel::MakeCounted<DocumentStore>()),
      m_Document(Kernel::MakeCounted<DocumentNode>(Kernel::MakeCounted<DocumentPictures>(m_Store))),
      m_UnitConverter(Kernel::MakeCounted<Kernel::UnitValueConverter>(72.0)),
      m_CacheBitmap(Kernel::MakeCounted<DocumentCacheBitmap>())
{
    m_Facts.Change([](DocumentFacts & facts) { facts.m_Guid = Kernel::Uuid().ToString(); });
}

DocumentController::~DocumentController() = default;

void DocumentController::SetMetadata(DocumentMetadata::Values metadata)
{
    m_Facts.Change([&metadata](DocumentFacts & facts) {
        facts.m_Metadata = Kernel::MakeCounted<DocumentMetadata>(std::move(metadata));
    });
}

Kernel::Consolidated<Raster::ICCProfile> DocumentController::GetProfile() const
{
    Kernel::Counted<DocumentFacts const> const facts = m_Facts.Get();
    return facts->GetProfiles().ForSpace(Raster::SpaceOfFormat(facts->GetFormat()));
}

void DocumentController::SetFormatAndProfiles(enum Raster::Format format,
                                              Raster::ICCManager::ICCProfileSet const & profiles)
{
    m_Facts.Change([&](DocumentFacts & facts) { facts.m_Colours = {format, profiles}; });
}

void DocumentController::SetFormatOverride(enum Raster::Format format,
                                           Raster::ICCManager::ICCProfileSet const & profiles)
{
    m_Facts.Change([&](DocumentFacts & facts) {
        facts.m_Override = DocumentFacts::ColourSettings{format, profiles};
        ++facts.m_OverrideUses;
    });
}

bool DocumentController::RemoveFormatOverride()
{
    bool removed = false;
    m_Facts.Change([&removed](DocumentFacts & facts) {
        removed = facts.m_OverrideUses > 0;
        if (removed && --facts.m_OverrideUses == 0) {
            facts.m_Override.reset();
        }
    });
    return removed;
}

void DocumentController::SetPreflightResults(Kernel::Counted<PreflightResults const> results)
{
    m_Facts.Change([&results](DocumentFacts & facts) { facts.m_Preflight = std::move(results); });
}

void DocumentController::SetPDFBookmarkManager(Kernel::Counted<PDFBookmarkManager const> manager)
{
    m_Facts.Change([&manager](DocumentFacts & facts) { facts.m_Bookmarks = std::move(manager); });
}

void DocumentController::CollectAnchors()
{
    AnchorVisitor visitor(false);
    visitor.Visit(m_Document);
    m_Facts.Change([&visitor](DocumentFacts & facts) { facts.m_Anchors = visitor.GetAnchors(); });
    m_AnchorsCurrent = true;
}

Kernel::Counted<Raster::DynamicBitmap const> DocumentController::GetDocumentCacheBitmap(int spreadIndex,
                                                                                       bool current) const
{
    if (spreadIndex != 0) {
        return nullptr;
    }
    if (m_KeepsCacheBitmap) {
        if (current && !m_CacheBitmap->IsCurrent(GetAppearanceCount())) {
            m_CacheBitmap->Render(*this);
        }
        auto const picture = m_CacheBitmap->Get();
        if (picture || current) {
            return picture;
        }
    }
    // What the file says is asked of nobody who changes the document.
    auto const png = current ? nullptr : DocumentFile(const_cast<DocumentController &>(*this)).ReadPreview();
    return png ? SpreadPreview::Decode(*png, GetFormat(), GetProfiles()) : nullptr;
}

void DocumentController::KeepCacheBitmap()
{
    if (!m_KeepsCacheBitmap.exchange(true)) {
        m_CacheBitmap->Dirty();
        AddBackgroundTask(m_CacheBitmap);
    }
}

void DocumentController::SetSoloNode(Kernel::JailCounted<Node> node)
{
    m_SoloNode = std::move(node);
    ++m_LayoutCount;
}

namespace
{

class ProtectedImageFinder : public DOMVisitorT<ProtectedImageFinder>
{
public:
    ProtectedImageFinder()
    {
        AddTerminatingTranslator<EmbeddedDocumentNode>(&ProtectedImageFinder::OnEmbeddedDocument);
    }
    std::vector<Kernel::JailCounted<EmbeddedDocumentNode>> m_Found;

private:
    void OnEmbeddedDocument(EmbeddedDocumentNode & node)
    {
        if (node.IsProtected()) {
            m_Found.emplace_back(&node);
        }
    }
};

}

std::vector<Kernel::JailCounted<EmbeddedDocumentNode>> DocumentController::GetProtectedImages() const
{
    ProtectedImageFinder finder;
    finder.Visit(m_Document);
    return finder.m_Found;
}

ComposeOutcome DocumentController::ComposeText(bool force, bool * abort)
{
    if (!m_TextDirty.exchange(false) && !force) {
        return {};
    }
    ComposeOutcome const outcome = DocumentComposer(*this).Compose(force, abort);
    if (outcome.m_Aborted) {
        m_TextDirty = true;
    }
    if (outcome.m_LayoutChanged || outcome.m_PagesChanged) {
        SetAnchorsOutOfDate();
        ++m_LayoutCount;
    }
    if (outcome.m_PagesChanged) {
        MarkChanged();
    }
    return outcome;
}

void DocumentController::EnsureGlyphs()
{
    AcquireReaderLock();
    auto const & flows = m_Document->GetTextFlows();
    bool const complete =
        std::all_of(flows.begin(), flows.end(), [](auto const & flow) { return flow->EnsureGlyphData(); });
    ReleaseReaderLock();
    if (!complete) {
        AcquireWriterLock();
        ComposeText(true, nullptr);
        ReleaseWriterLock();
    }
}

void DocumentController::UpdateRunningHeads()
{
    String title = GetMetadata()->GetTitle();
    Kernel::Counted<TextFlow> const flow = m_Document->GetMainFlow();
    Kernel::Counted<Story::Layout const> const layout = flow ? flow->GetLayout() : nullptr;
    if (title.Empty() && layout && !layout->GetHeadings().empty()) {
        title = layout->GetString(layout->GetHeadings().front().m_Text);
    }
    m_Document->SetRunningTitle(title);
}

bool DocumentController::StackForUndo(Kernel::Counted<DomainCommand> const & command)
{
    m_History.Add(command);
    MarkChanged();
    return true;
}

void DocumentController::ProcessCommand(Kernel::Counted<DomainCommand> command,
                                        std::vector<Kernel::Counted<Kernel::Notification>> & notifications)
{
    DomainController::ProcessCommand(command, notifications);
    // Nobody composes a background document later on: whoever waits for the command reads true pages.
    if (IsTextDirty() && !GetWantBackgroundTasks() && m_Loaded) {
        AppendComposeNotifications(ComposeText(false, nullptr), notifications);
    }
    if (m_KeepsCacheBitmap && !m_CacheBitmap->IsCurrent(GetAppearanceCount())) {
        m_CacheBitmap->Dirty();
    }
}

void DocumentController::AppendComposeNotifications(
    ComposeOutcome const & outcome, std::vector<Kernel::Counted<Kernel::Notification>> & notifications) const
{
    Kernel::Counted<DocumentController const> const self(this);
    if (outcome.m_PagesChanged) {
        notifications.push_back(Kernel::MakeCounted<PageStructureChangedNotification>(self));
        notifications.push_back(Kernel::MakeCounted<DocumentStructureChangedNotification>(self, true));
    }
    if (outcome.m_LayoutChanged || outcome.m_PagesChanged) {
        notifications.push_back(Kernel::MakeCounted<StoryChangedNotification>(self, true));
        notifications.push_back(Kernel::MakeCounted<AnchorsChangedNotification>(self, true));
    }
}

bool DocumentController::LoadDocument(String const & path, bool inFront, bool asCopy, enum LoadDocumentMode,
                                      Kernel::Counted<LoadDocumentOptions const>,
                                      OpenDocumentFailedNotification & failure, bool)
{
    Kernel::Archive::OpenResult opened = Kernel::Archive::OpenResult::Success;
    auto const mode = asCopy    ? Kernel::Archive::OpenMode::ReadUnlocked
                      : inFront ? Kernel::Archive::OpenMode::ReadExclusive
                                : Kernel::Archive::OpenMode::Read;
    Kernel::Counted<Kernel::Archive> const archive = Kernel::Archive::Open(path, mode, FileType, opened);
    if (!archive) {
        SetNotifyResultFromError(failure, opened);
        return false;
    }
    failure.SetArchiveOpened(true);
    m_Store->SetArchive(archive);
    if (!DocumentFile(*this).Load(*archive, failure)) {
        m_Store->SetArchive(nullptr);
        return false;
    }
    if (!asCopy) {
        SetPath(path);
    }
    m_HoldAlone = inFront;
    if (!asCopy) {
        // A package brings the fonts along that the machine may lack.
        Typeset::FontLibrary::GetInstance().AddFolder(
            Kernel::Path::GetFolderWithSeparator(Kernel::FileSystem::GetAbsolutePath(path)) + PackagedFontFolder);
    }
    m_SavedCount = m_ChangeCount.load();
    SetTextDirty();
    ComposeText(false, nullptr);
    UpdateRunningHeads();
    m_Loaded = true;
    return true;
}

bool DocumentController::HoldFile(bool alone)
{
    Kernel::Counted<Kernel::Archive> const archive = m_Store->GetArchive();
    using Kind = Kernel::FileLock::Kind;
    m_HoldAlone = alone;
    if (!archive || !archive->GetLock()) {
        return true;
    }
    return archive->GetLock()->ChangeKind(alone ? Kind::Exclusive : Kind::Shared) ||
           ::access(archive->GetPath().c_str(), W_OK) != 0;
}

void DocumentController::ShutDownArchive()
{
    m_Store->SetArchive(nullptr);
}

void DocumentController::StopOfflining() const
{
    m_Store->SetArchive(nullptr);
}

bool DocumentController::CheckForOldArchiveVersion(String const & path, unsigned int * version)
{
    Kernel::Archive::OpenResult opened = Kernel::Archive::OpenResult::Success;
    Kernel::Counted<Kernel::Archive> const archive =
        Kernel::Archive::Open(path, Kernel::Archive::OpenMode::ReadUnlocked, FileType, opened);
    unsigned int found = FormatVersion;
    if (!archive || !DocumentFile::ReadVersion(*archive, found)) {
        return false;
    }
    if (version) {
        *version = found;
    }
    return found < FormatVersion;
}

namespace
{

/// ISO 8601, UTC, to the second.
String ToIsoTime(Kernel::TimeStamp time)
{
    auto const moment = std::chrono::sys_seconds(std::chrono::seconds(time.Nanoseconds() / 1'000'000'000));
    auto const day = std::chrono::floor<std::chrono::days>(moment);
    std::chrono::year_month_day const date(day);
    std::chrono::hh_mm_ss const clock(moment - day);
    char text[32];
    std::snprintf(text, sizeof(text), "%04d-%02u-%02uT%02d:%02d:%02dZ", static_cast<int>(date.year()),
                  static_cast<unsigned>(date.month()), static_cast<unsigned>(date.day()),
                  static_cast<int>(clock.hours().count()), static_cast<int>(clock.minutes().count()),
                  static_cast<int>(clock.seconds().count()));
    return text;
}

}

String DocumentController::GetTimeText()
{
    return GetTimeText(Kernel::Clock::Get().Now());
}

String DocumentController::GetTimeText(Kernel::TimeStamp time)
{
    return ToIsoTime(time);
}

namespace
{

/// A file without its pictures would be a loss that nobody sees: better no file.
bool ReportLostPictures(DocumentFile::Content const & content, String const & target, DocumentSaveResult & result)
{
    if (content.m_LostPictures.empty()) {
        return false;
    }
    result.SetResult(
        DocumentSaveResult::SourceDamaged,
        Kernel::Format(Kernel::LocalisedString("The picture \"%1\" in \"%2\" can't be read any more, so the "
                                               "document was not written.",
                                               "Save document"),
                       content.m_LostPictures.front(), target));
    return true;
}

}

void DocumentController::SaveCopy(DocumentSaveResult & result, String const & path)
{
    SaveCopy(result, path, {});
}

void DocumentController::SaveCopy(DocumentSaveResult & result, String const & path, DocumentLinks const & links)
{
    result.SetSuccess(false);
    DocumentFile file(*this);
    DocumentFile::Content content;
    content.m_Document = file.WriteDocument(links);
    file.WriteItems(content);
    if (!ReportLostPictures(content, path, result) &&
        DocumentFile::WriteArchive(content, path, nullptr, Kernel::FileLock::Kind::Shared, result)) {
        result.SetResult(DocumentSaveResult::Success);
        result.SetSuccess(true);
    }
}

void DocumentController::SaveDocument(DocumentSaveResult & result, String const & path)
{
    String const ownPath = GetPath();
    String const target = path.Empty() ? ownPath : path;
    result.SetSuccess(false);
    if (target.Empty()) {
        result.SetResult(DocumentSaveResult::BadName,
                         Kernel::LocalisedString("The document has no file yet.", "Save document"));
        return;
    }
    ComposeText(false, nullptr);
    std::uint64_t const changes = m_ChangeCount;
    Kernel::Counted<Kernel::Archive> const old = target == ownPath ? m_Store->GetArchive() : nullptr;
    DocumentFile file(*this);
    DocumentFile::Content content;
    content.m_Document = file.WriteDocument({});
    if (old) {
        Kernel::Counted<Kernel::RawData const> const present = m_Store->ReadItem(DocumentFile::DocumentItem);
        if (present && std::ranges::equal(present->GetSpan(), content.m_Document->GetSpan())) {
            m_SavedCount = changes;
            result.SetResult(DocumentSaveResult::Success);
            result.SetSuccess(true);
            return;
        }
    }
    DocumentMetadata::Values metadata = GetMetadata()->GetValues();
    metadata.m_Modified = GetTimeText();
    if (metadata.m_Created.Empty()) {
        metadata.m_Created = metadata.m_Modified;
    }
    SetMetadata(std::move(metadata));
    content.m_Document = file.WriteDocument({});
    file.WriteItems(content);
    if (ReportLostPictures(content, target, result)) {
        return;
    }

    Kernel::Counted<DocumentController const> const self(this);
    bool const moves = target != ownPath;
    if (moves && !VantraController::GetInstance().ReservePath(self, target)) {
        result.SetResult(DocumentSaveResult::LockedByOther,
                         Kernel::Format(Kernel::LocalisedString("Another open document is in the file \"%1\". Close "
                                                                "that first, or take another name.",
                                                                "Save document"),
                                        target));
        result.SetConcernsFile(true);
        return;
    }
    Kernel::Counted<Kernel::Archive> written;
    {
        std::optional<DomainWriterUnlockSession> unlocked;
        if (IsWriterLockHeld()) {
            unlocked.emplace(Kernel::Counted<DomainController>(this));
        }
        Kernel::Counted<Kernel::FileLock> const ownLock = old ? old->GetLock() : nullptr;
        auto const kind = m_HoldAlone ? Kernel::FileLock::Kind::Exclusive : Kernel::FileLock::Kind::Shared;
        written = DocumentFile::WriteArchive(content, target, ownLock.Get(), kind, result);
    }
    if (!written) {
        if (moves) {
            VantraController::GetInstance().ReleasePath(self, target);
        }
        return;
    }
    m_Store->SetArchive(written);
    GetPictures().DropBytes();
    if (moves) {
        SetPath(target);
        VantraController::GetInstance().MoveDocumentController(self, target);
    }
    m_FromOlderVersion = false;
    m_SavedCount = changes;
    result.SetResult(DocumentSaveResult::Success);
    result.SetSuccess(true);
}
