#include "core/BookController.h"

#include "core/UpdateChaptersTask.h"
#include "framework/document/DocumentController.h"
#include "framework/document/DocumentSaveFailure.h"
#include "framework/document/DocumentSaveResult.h"
#include "framework/document/OpenDocumentFailedNotification.h"
#include "framework/document/PDFBookmarkManager.h"
#include "framework/kernel/Archive.h"
#include "framework/kernel/ArchiveExceptions.h"
#include "framework/kernel/ArchiveSession.h"
#include "framework/kernel/ArchiveThumbnails.h"
#include "framework/kernel/FileStore.h"
#include "framework/kernel/FileStoreCompressionHint.h"
#include "framework/kernel/Format.h"
#include "framework/kernel/InSerialiserFile.h"
#include "framework/kernel/OutSerialiserFile.h"
#include "framework/kernel/PortablePath.h"
#include "framework/raster/DynamicBitmap.h"
#include "framework/render/FileExportOptions.h"
#include "framework/story/AnchorData.h"
#include "framework/story/Index.h"

namespace Book
{

namespace
{

constexpr Kernel::IDTag FileType("KvBk");
constexpr Kernel::IDTag RootTag("Book");
constexpr unsigned short FormatVersion = 1;
constexpr char const * ItemName = "doc.dat";

/// The chapter's record as it stands in a book file beside which its copy lies at `path`.
Kernel::Counted<BookChapter> PackagedRecord(BookChapter const & chapter, String const & path, String const & bookPath)
{
    Kernel::Counted<BookChapter> const record = Kernel::MakeCounted<BookChapter>(path);
    record->UpdateTimeStamp();
    record->SetPath(Kernel::PortablePath::Make(path, bookPath));
    record->SetPages(chapter.DescribePages());
    record->SetName(chapter.GetName());
    record->SetIsKey(chapter.IsKey());
    record->SetStartFromPage(chapter.GetStartFromPage());
    record->SetHasEndnotesMarker(chapter.HasEndnotesMarker());
    return record;
}

/// As an object of a class that streams can hold; null if its class is none.
template <typename T>
Kernel::Counted<Kernel::Serialisable const> AsSerialisable(Kernel::Counted<T const> const & object)
{
    return Kernel::CountedCast<Kernel::Serialisable const>(object);
}

/// Reads an object field; a missing one leaves the target alone.
template <typename T>
void LoadPublished(Kernel::InSerialiser const & in, Kernel::IDTag tag, Published<Kernel::Counted<T const>> & target)
{
    Kernel::Counted<Kernel::Serialisable> object;
    if (in.LoadObjectI(tag, object, true)) {
        target.Set(Kernel::CountedCast<T const>(object));
    }
}

}

Kernel::FileStoreItemType const BookController::ms_FileStoreItemType(Kernel::ClassUID("BkCt"),
                                                                     &BookController::CreateObject,
                                                                     Kernel::Nestable::Yes, Kernel::Recoverable::No);
static Kernel::FileStoreItemType::Init const s_BookControllerInit(BookController::GetTypeFileStoreItemType());

Kernel::FileStoreItemType const & BookController::GetObjectFileStoreItemType() const
{
    return ms_FileStoreItemType;
}

Kernel::FileStoreItemType const & BookController::GetTypeFileStoreItemType()
{
    return ms_FileStoreItemType;
}

Kernel::Counted<Kernel::FileStoreItem> BookController::CreateObject()
{
    return Kernel::MakeCounted<BookController>();
}

BookController::ChapterList BookController::RecordsToWrite(ChapterList chapters) const
{
    for (Kernel::Counted<BookChapter> & chapter : chapters) {
        auto const packaged = m_PackagedPaths.find(chapter);
        if (packaged != m_PackagedPaths.end()) {
            chapter = PackagedRecord(*chapter, packaged->second, m_SavePath.Get());
        }
    }
    return chapters;
}

void BookController::Save(Kernel::OutStream & stream, Kernel::FileStoreOut & store) const
{
    Kernel::OutSerialiserFile out(stream, store, RootTag, FormatVersion);
    out.SetFilePath(m_SavePath.Get());
    Snapshot<ChapterList> const chapters = Chapters();
    if (out.IsFullSave()) {
        out.SaveObjects("Chps", RecordsToWrite(*chapters));
    } else {
        for (Kernel::Counted<BookChapter> const & chapter : chapters) {
            out.SaveObjectEnumeratePathsOnlyI(chapter);
        }
    }
    out.SaveSharedObject(
        "ExpO", Kernel::Consolidated<Kernel::SharedSerialisable>(
                    Kernel::CountedCast<Kernel::SharedSerialisable const>(m_ExportOptions.Get().GetCounted())));
    out.SaveObject("Indx", AsSerialisable(m_MasterIndex.Get()), true);
    out.SaveType("PStr", m_PadStrays.load());
    out.SaveType("MStr", m_MergeStrays.load());
    SynchroniseSettings const settings = m_SynchroniseSettings.Get();
    // Not in the order of the members: files are compared byte by byte, so the order stays as it is.
    out.SaveType("SySw", settings.m_Swatches);
    out.SaveType("SyTb", settings.m_TableStyles);
    out.SaveType("SyTx", settings.m_TextStyles);
    out.SaveType("SyMs", settings.m_MasterPages);
    out.SaveObject("Thum", AsSerialisable(m_Thumbnail.Get()), true);
    out.SaveObject("MBok", AsSerialisable(m_PDFBookmarks.Get()), true);
    out.Close();
}

bool BookController::Load(Kernel::InStream & stream, Kernel::FileStore & store)
{
    auto const in = Kernel::InSerialiserFile::ParseWithChecks(
        stream, store, Kernel::InSerialiser::DelayLoadsBehaviour::CheckAll, {}, {});
    if (!in) {
        return false;
    }
    ChapterList chapters;
    if (in->LoadObjects("Chps", chapters)) {
        for (Kernel::Counted<BookChapter> const & chapter : chapters) {
            if (chapter) {
                chapter->SetPath(Kernel::PortablePath::Resolve(chapter->GetPath(), store.GetPath()));
            }
        }
        m_Chapters.Set(Snapshot(std::move(chapters)));
    }
    Kernel::Consolidated<Kernel::SharedSerialisable> shared;
    if (in->LoadSharedObjectI("ExpO", shared)) {
        m_ExportOptions.Set(Kernel::Consolidated<Renderer::FileExportOptions>(
            Kernel::CountedCast<Renderer::FileExportOptions const>(shared.GetCounted())));
    }
    LoadPublished(*in, "Indx", m_MasterIndex);
    bool pad = m_PadStrays;
    bool merge = m_MergeStrays;
    SynchroniseSettings settings = m_SynchroniseSettings.Get();
    in->LoadType("PStr", pad);
    in->LoadType("MStr", merge);
    in->LoadType("SySw", settings.m_Swatches);
    in->LoadType("SyTb", settings.m_TableStyles);
    in->LoadType("SyTx", settings.m_TextStyles);
    in->LoadType("SyMs", settings.m_MasterPages);
    m_PadStrays = pad;
    m_MergeStrays = merge;
    m_SynchroniseSettings.Set(settings);
    LoadPublished(*in, "Thum", m_Thumbnail);
    LoadPublished(*in, "MBok", m_PDFBookmarks);
    return true;
}

bool BookController::LoadBook(String const & path, OpenDocumentFailedNotification & result)
{
    auto openResult = Kernel::Archive::OpenResult::Success;
    auto const archive = Kernel::Archive::Open(path, Kernel::Archive::OpenMode::Read, FileType, openResult);
    if (!archive) {
        SetNotifyResultFromError(result, openResult);
        return false;
    }
    result.SetArchiveOpened(true);
    bool loaded = false;
    try {
        loaded = archive->LoadFile(ItemName, *this);
    } catch (Kernel::ArchiveCorruptionException const & exception) {
        result.SetResult(OpenDocumentFailedNotification::Corrupt, exception.GetMessage(), ItemName);
        return false;
    } catch (Kernel::FutureVersionException const & exception) {
        result.SetResult(OpenDocumentFailedNotification::FutureVersion, exception.GetMessage(), ItemName);
        return false;
    } catch (std::exception const & exception) {
        result.SetResult(OpenDocumentFailedNotification::NotADocument, exception.what(), ItemName);
        return false;
    }
    if (!loaded) {
        result.SetResult(OpenDocumentFailedNotification::NotADocument,
                         Kernel::Format(Kernel::LocalisedString("%1 holds no book.", "Book file"), path), ItemName);
        return false;
    }
    SetPath(path);
    StartBackgroundTaskPump();
    return true;
}

void BookController::SaveBookAsPackage(DocumentSaveResult & result, String const & path, ChapterPaths packaged)
{
    m_PackagedPaths = std::move(packaged);
    SaveBookAsCopy(result, path);
    m_PackagedPaths.clear();
}

void BookController::SaveBook(DocumentSaveResult & result)
{
    SaveBookAsCopy(result, GetPath());
}

void BookController::SaveBookAsCopy(DocumentSaveResult & result, String const & path)
{
    // What changes while the file is written has not reached it, and still asks to be saved afterwards.
    unsigned long long const changesInFile = m_Changes;
    m_SavePath.Set(path);
    Kernel::Archive::CreateResult created;
    auto const archive = Kernel::Archive::CreateWithTemporary(path, FileType, created);
    if (!archive) {
        SetSaveFailure(result, created);
        return;
    }
    bool const stored = StoreArchive(result, archive, [&] {
        Kernel::ArchiveSessionHandle session;
        if (archive->CreateSessionAdv(session, Kernel::Archive::SessionType::Whole, nullptr, false) !=
            Kernel::Archive::SessionResult::Success) {
            // The next save has to ask for a name.
            SetPath(String());
            return false;
        }
        session->SetThumbnails(CreateThumbnails());
        Kernel::FileStoreCompressionHintGeneral const hint(
            Kernel::FileStoreCompressionHintGeneral::CompressionLevel::Fast, Kernel::CompressionPredictorType::None, 0);
        session->SaveFile(ItemName, hint, *this);
        archive->CloseSession(session, false);
        session.Release();
        return true;
    });
    if (!stored) {
        return;
    }
    result.SetResult(DocumentSaveResult::Success);
    result.SetSuccess(true);
    m_SavedChanges = changesInFile;
    m_SavePath.Set(String());
    SetPath(path);
}

}
