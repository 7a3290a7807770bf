#include "framework/document/DocumentFile.h"

#include "framework/document/DocumentLinks.h"
#include "framework/document/DocumentRecords.h"
#include "framework/document/DocumentSaveFailure.h"
#include "framework/document/MasterSpreadNode.h"
#include "framework/document/SpreadPreview.h"
#include "framework/document/VantraController.h"
#include "framework/kernel/FileSystem.h"
#include "framework/kernel/Format.h"
#include "framework/kernel/InSerialiserFile.h"
#include "framework/kernel/MemoryStreams.h"
#include "framework/kernel/OutSerialiserFile.h"
#include "framework/story/ByteStream.h"

using Kernel::IDTag;

namespace
{

constexpr IDTag RootTag("Docu");

String LayoutItemName(char const * kind, std::size_t flow)
{
    return 0 == flow ? String(kind) + ".dat" : Kernel::Format("%1-%2.dat", kind, flow);
}

Kernel::Counted<Kernel::RawData const> ToRawData(std::vector<std::byte> const & bytes)
{
    Kernel::Counted<Kernel::RawData> const data = Kernel::MakeCounted<Kernel::RawData>(bytes.size());
    std::copy_n(reinterpret_cast<std::uint8_t const *>(bytes.data()), bytes.size(), data->GetMutableData());
    return data;
}

std::span<std::byte const> AsBytes(Kernel::RawData const & data)
{
    return std::as_bytes(data.GetSpan());
}

template <typename TRecord, typename TValue, typename TSet>
std::vector<Kernel::Counted<TRecord>> ToRecords(std::vector<TValue> const & values, TSet const & set)
{
    std::vector<Kernel::Counted<TRecord>> records;
    for (TValue const & value : values) {
        records.push_back(Kernel::MakeCounted<TRecord>());
        set(*records.back(), value);
    }
    return records;
}

/// Which profiles a document names of its own; the defaults have no bytes.
void SaveProfile(Kernel::OutSerialiser & out, IDTag tag, Kernel::Consolidated<Raster::ICCProfile> const & profile)
{
    if (profile) {
        out.SaveData(tag, profile->GetBytes());
    }
}

void LoadProfile(Kernel::InSerialiser const & in, IDTag tag, Kernel::Consolidated<Raster::ICCProfile> & profile)
{
    std::span<std::uint8_t const> bytes;
    if (in.LoadData(tag, bytes)) {
        String reason;
        profile = Raster::ICCProfile::FromBytes({bytes.begin(), bytes.end()}, reason);
    }
}

}

/// The stream of the document's own item.
class DocumentStreamItem : public Kernel::FileStoreItem
{
public:
    static Kernel::FileStoreItemType const ms_FileStoreItemType;

    explicit DocumentStreamItem(DocumentFile & file) : m_File(file) {}

    /// `DocumentFile` writes the bytes by itself, as it has to compare them first.
    void Save(Kernel::OutStream & stream, Kernel::FileStoreOut &) const override
    {
        Kernel::Counted<Kernel::RawData const> const data = m_File.WriteDocument({});
        stream.Write(data->GetData(), data->GetSize());
    }
    bool Load(Kernel::InStream & stream, Kernel::FileStore & store) override
    {
        Kernel::Counted<Kernel::InSerialiserFile> const in = Kernel::InSerialiserFile::ParseWithChecks(
            stream, store, Kernel::InSerialiser::DelayLoadsBehaviour::CheckAll, {}, {});
        if (!in || in->GetRootTag() != RootTag) {
            return false;
        }
        if (DocumentController::FormatVersion < in->GetVersion()) {
            throw Kernel::FutureVersionException(store.GetPath(), Kernel::ClassUID(RootTag.Value()), in->GetVersion(),
                                                 DocumentController::FormatVersion);
        }
        return m_File.Read(*in, in->GetVersion());
    }
    [[nodiscard]] Kernel::FileStoreItemType const & GetObjectFileStoreItemType() const override
    {
        return ms_FileStoreItemType;
    }

private:
    DocumentFile & m_File;
};

Kernel::FileStoreItemType const DocumentStreamItem::ms_FileStoreItemType(Kernel::ClassUID("DcDo"), nullptr,
                                                                         Kernel::Nestable::No,
                                                                         Kernel::Recoverable::Yes);

bool DocumentFile::Load(Kernel::Archive & archive, OpenDocumentFailedNotification & failure)
{
    using Failure = OpenDocumentFailedNotification;
    try {
        if (!archive.HasItem(DocumentItem)) {
            failure.SetResult(
                Failure::ItemMissing,
                Kernel::Format(Kernel::LocalisedString("The file \"%1\" holds no document.", "Open document"),
                               archive.GetPath()),
                DocumentItem);
            return false;
        }
        DocumentStreamItem item(*this);
        if (!archive.LoadFile(DocumentItem, item)) {
            failure.SetResult(
                Failure::Corrupt,
                Kernel::Format(Kernel::LocalisedString(
                                   "The document \"%1\" is damaged. Take it from a backup, or make it anew from "
                                   "its sources.",
                                   "Open document"),
                               archive.GetPath()),
                DocumentItem);
            return false;
        }
        auto const & flows = m_Document.GetDocument()->GetTextFlows();
        for (std::size_t i = 0; i < flows.size(); ++i) {
            if (m_HasLayout[i]) {
                LoadLayout(*flows[i], i, m_LayoutHashes[i], archive);
            }
        }
        return true;
    } catch (Kernel::ArchiveCorruptionException const & exception) {
        failure.SetResult(Failure::Corrupt, exception.GetMessage(), DocumentItem);
    } catch (Kernel::FutureVersionException const & exception) {
        failure.SetResult(Failure::FutureVersion, exception.GetMessage(), DocumentItem);
    } catch (Kernel::Exception const & exception) {
        failure.SetResult(Failure::CannotReadFile, exception.GetMessage(), DocumentItem);
    }
    return false;
}

bool DocumentFile::ReadVersion(Kernel::Archive & archive, unsigned int & version)
{
    try {
        Kernel::Counted<Kernel::RawData const> const data = archive.ReadItem(DocumentItem);
        if (!data) {
            return false;
        }
        Kernel::MemoryInStream stream(data, archive.GetPath());
        Kernel::Counted<Kernel::InSerialiserFile> const in = Kernel::InSerialiserFile::ParseWithChecks(
            stream, archive, Kernel::InSerialiser::DelayLoadsBehaviour::Delay, {}, {});
        if (!in || in->GetRootTag() != RootTag) {
            return false;
        }
        version = in->GetVersion();
        return true;
    } catch (Kernel::Exception const &) {
        // A file that can't be read is told of by who loads it.
        return false;
    }
}

void DocumentFile::LoadLayout(TextFlow & flow, std::size_t number, std::uint64_t hash, Kernel::Archive & archive)
{
    // A layout that can't be read is not worth an error: the text is set again.
    Kernel::Counted<Kernel::RawData const> const facts = archive.ReadItem(LayoutItemName("places", number));
    if (!facts) {
        return;
    }
    Story::ByteReader reader(AsBytes(*facts));
    Kernel::Counted<Story::Layout> layout = Story::Layout::LoadFacts(reader);
    String const glyphItem = LayoutItemName("layout", number);
    if (!layout || !archive.HasItem(glyphItem)) {
        return;
    }
    Kernel::Counted<DocumentStore const> const store = m_Document.m_Store;
    flow.SetLayout(std::move(layout), hash, [store, glyphItem](Story::Layout & target) {
        Kernel::Counted<Kernel::RawData const> const data = store->ReadItem(glyphItem);
        return data &&
               target.LoadGlyphData(std::make_shared<Kernel::Counted<Kernel::RawData const>>(data), AsBytes(*data));
    });
    for (TextFlow::FontStamp const & font : flow.GetFonts()) {
        Kernel::TimeStamp time;
        if (!Kernel::FileSystem::GetModifiedTime(font.m_Path, time) || time != font.m_Time) {
            // The file is another one: it may still be the same font.
            if (!flow.EnsureGlyphData()) {
                flow.SetLayout(nullptr, 0, nullptr);
            }
            return;
        }
    }
}

bool DocumentFile::Read(Kernel::InSerialiser const & in, unsigned short version)
{
    m_Document.m_FromOlderVersion = version < DocumentController::FormatVersion;
    DocumentNode & node = *m_Document.GetDocument();

    String guid;
    Kernel::Counted<MetadataRecord> metadata;
    bool restricted = false;
    std::int32_t format = static_cast<std::int32_t>(Raster::Format::Rgba8);
    Raster::ICCManager::ICCProfileSet profiles;
    in.LoadType(IDTag("guid"), guid);
    in.LoadType(IDTag("rest"), restricted);
    in.LoadObject(IDTag("meta"), metadata);
    in.LoadType(IDTag("frmt"), format);
    LoadProfile(in, IDTag("prgb"), profiles.m_Rgb);
    LoadProfile(in, IDTag("pgry"), profiles.m_Grey);
    LoadProfile(in, IDTag("pcmy"), profiles.m_Cmyk);
    LoadProfile(in, IDTag("plab"), profiles.m_Lab);
    in.LoadType(IDTag("intn"), profiles.m_Intent);
    in.LoadType(IDTag("bpcm"), profiles.m_BlackPointCompensation);
    if (!Raster::IsFormat(format)) {
        return false;
    }

    bool hasBookmarks = false;
    std::vector<Kernel::Counted<BookmarkRecord>> bookmarkRecords;
    in.LoadType(IDTag("hbkm"), hasBookmarks);
    in.LoadObjects(IDTag("bkmk"), bookmarkRecords);
    Kernel::Counted<PDFBookmarkManager> bookmarks;
    if (hasBookmarks) {
        bookmarks = Kernel::MakeCounted<PDFBookmarkManager>();
        for (Kernel::Counted<BookmarkRecord> const & record : bookmarkRecords) {
            if (record) {
                bookmarks->Add(record->m_Data);
            }
        }
    }
    m_Document.m_Restricted = restricted;
    m_Document.m_Facts.Change([&](DocumentFacts & facts) {
        facts.m_Guid = guid;
        if (metadata) {
            facts.m_Metadata = Kernel::MakeCounted<DocumentMetadata>(metadata->m_Values);
        }
        facts.m_Colours = {static_cast<Raster::Format>(format), profiles};
        facts.m_Bookmarks = bookmarks;
    });

    Kernel::Counted<PageSetupRecord> setup;
    if (!in.LoadObject(IDTag("setu"), setup) || !setup) {
        return false;
    }
    node.SetPageSetup(setup->m_Setup);
    String publication;
    in.LoadType(IDTag("publ"), publication);
    node.SetPublicationTitle(publication);

    std::vector<Kernel::Counted<SectionRecord>> sectionRecords;
    in.LoadObjects(IDTag("sect"), sectionRecords);
    std::vector<DocumentSection::Values> sections;
    for (Kernel::Counted<SectionRecord> const & record : sectionRecords) {
        if (!record) {
            return false;
        }
        sections.push_back(record->m_Values);
    }
    node.SetSections(std::move(sections));

    Kernel::Counted<Story::StyleSheet> styles;
    if (in.LoadObject(IDTag("styl"), styles) && styles) {
        node.SetStyleSheet(styles);
    }
    Kernel::Counted<Story::Index> index;
    if (in.LoadObject(IDTag("indx"), index) && index) {
        node.AdoptIndex(index);
    }
    std::vector<Kernel::Counted<SwatchRecord>> swatchRecords;
    in.LoadObjects(IDTag("swat"), swatchRecords);
    std::vector<Swatch> swatches;
    for (Kernel::Counted<SwatchRecord> const & record : swatchRecords) {
        if (record) {
            swatches.push_back(record->m_Swatch);
        }
    }
    node.SetSwatches(Kernel::Counted<Swatches const>(Kernel::MakeCounted<Swatches>(std::move(swatches))));

    std::vector<Kernel::Counted<PictureRecord>> pictures;
    in.LoadObjects(IDTag("pict"), pictures);
    for (Kernel::Counted<PictureRecord> const & record : pictures) {
        if (record) {
            m_Document.GetPictures().AddStored(record->m_Id, record->m_Entry);
        }
    }
    node.UpdateEmbeddedDocuments();

    std::vector<Kernel::Counted<FlowRecord>> flows;
    in.LoadObjects(IDTag("flow"), flows);
    if (std::any_of(flows.begin(), flows.end(), [](auto const & record) { return !record; })) {
        return false;
    }
    std::vector<std::vector<Kernel::JailCounted<TextFrameNode>>> frames(flows.size());
    std::vector<Kernel::Counted<SpreadRecord>> masters;
    std::vector<Kernel::Counted<SpreadRecord>> spreads;
    in.LoadObjects(IDTag("mast"), masters);
    in.LoadObjects(IDTag("sprd"), spreads);
    for (Kernel::Counted<SpreadRecord> const & record : masters) {
        if (!record) {
            return false;
        }
        Kernel::Counted<MasterSpreadNode> const master = Kernel::MakeCounted<MasterSpreadNode>();
        master->SetName(record->m_Name);
        master->SetTextRects(record->m_TextRects);
        record->CompleteBleed(setup->m_Setup.m_Bleed);
        record->FillNode(*master, frames);
        node.AppendChild(NodeChildListMasters, master);
    }
    for (Kernel::Counted<SpreadRecord> const & record : spreads) {
        if (!record) {
            return false;
        }
        Kernel::Counted<SpreadNode> const spread = Kernel::MakeCounted<SpreadNode>();
        record->CompleteBleed(setup->m_Setup.m_Bleed);
        record->FillNode(*spread, frames);
        node.AppendChild(NodeChildListSpreads, spread);
    }
    for (std::size_t i = 0; i < flows.size(); ++i) {
        Kernel::Counted<TextFlow> const flow = Kernel::MakeCounted<TextFlow>(flows[i]->m_Story);
        flow->SetGrowing(flows[i]->m_Growing);
        flow->SetPurpose(flows[i]->m_Purpose);
        flow->SetFrames(std::move(frames[i]));
        flow->SetSavedFonts(std::move(flows[i]->m_Fonts));
        node.AddTextFlow(flow);
        m_LayoutHashes.push_back(flows[i]->m_LayoutHash);
        m_HasLayout.push_back(flows[i]->m_HasLayout);
    }
    return true;
}

Kernel::Counted<Kernel::RawData const> DocumentFile::WriteDocument(DocumentLinks const & links) const
{
    DocumentNode const & node = *m_Document.GetDocument();
    Kernel::Counted<DocumentFacts const> const facts = m_Document.m_Facts.Get();
    Kernel::MemoryOutStream stream;
    Kernel::CollectingFileStoreOut store(true);
    Kernel::OutSerialiserFile out(stream, store, RootTag, DocumentController::FormatVersion);

    out.SaveType(IDTag("guid"), facts->m_Guid);
    bool const restricted = m_Document.GetRestricted();
    out.SaveType(IDTag("rest"), restricted);
    Kernel::Counted<MetadataRecord> const metadata = Kernel::MakeCounted<MetadataRecord>();
    metadata->m_Values = facts->m_Metadata->GetValues();
    out.SaveObject(IDTag("meta"), metadata, false);
    out.SaveType(IDTag("frmt"), static_cast<std::int32_t>(facts->m_Colours.m_Format));
    Raster::ICCManager::ICCProfileSet const & profiles = facts->m_Colours.m_Profiles;
    SaveProfile(out, IDTag("prgb"), profiles.m_Rgb);
    SaveProfile(out, IDTag("pgry"), profiles.m_Grey);
    SaveProfile(out, IDTag("pcmy"), profiles.m_Cmyk);
    SaveProfile(out, IDTag("plab"), profiles.m_Lab);
    out.SaveType(IDTag("intn"), profiles.m_Intent);
    out.SaveType(IDTag("bpcm"), profiles.m_BlackPointCompensation);

    bool const hasBookmarks = static_cast<bool>(facts->m_Bookmarks);
    out.SaveType(IDTag("hbkm"), hasBookmarks);
    std::vector<Kernel::Counted<BookmarkRecord>> bookmarks;
    if (hasBookmarks) {
        for (auto const & [uid, data] : facts->m_Bookmarks->GetData()) {
            bookmarks.push_back(Kernel::MakeCounted<BookmarkRecord>());
            bookmarks.back()->m_Data = data;
        }
    }
    out.SaveObjects(IDTag("bkmk"), bookmarks);

    Kernel::Counted<PageSetupRecord> const setup = Kernel::MakeCounted<PageSetupRecord>();
    setup->m_Setup = node.GetPageSetup();
    out.SaveObject(IDTag("setu"), setup, false);
    out.SaveType(IDTag("publ"), node.GetPublicationTitle());
    out.SaveObjects(IDTag("sect"),
                    ToRecords<SectionRecord>(node.GetAllSections(), [](SectionRecord & record, auto const & section) {
                        record.m_Values = section->GetValues();
                    }));
    out.SaveObject(IDTag("styl"), node.GetStyleSheet(), false);
    out.SaveObject(IDTag("indx"), node.GetIndex(), false);
    out.SaveObjects(IDTag("swat"), ToRecords<SwatchRecord>(
                                       node.GetSwatches()->GetAll(),
                                       [](SwatchRecord & record, Swatch const & swatch) { record.m_Swatch = swatch; }));
    std::vector<Kernel::Counted<PictureRecord>> pictures;
    for (auto const & [id, entry] : m_Document.GetPictures().GetEntries()) {
        pictures.push_back(Kernel::MakeCounted<PictureRecord>());
        pictures.back()->m_Id = id;
        pictures.back()->m_Entry = entry;
        if (auto const link = links.m_Pictures.find(id); link != links.m_Pictures.end()) {
            pictures.back()->m_Entry.m_SourcePath = link->second;
        }
    }
    out.SaveObjects(IDTag("pict"), pictures);
    out.SaveObjects(IDTag("flow"),
                    ToRecords<FlowRecord>(node.GetTextFlows(), [](FlowRecord & record, auto const & flow) {
                        record.m_Story = flow->GetStory();
                        record.m_Growing = flow->IsGrowing();
                        record.m_Purpose = flow->GetPurpose();
                        record.m_HasLayout = static_cast<bool>(flow->GetLayout());
                        record.m_LayoutHash = flow->GetLayoutHash();
                        record.m_Fonts = flow->GetFonts();
                    }));
    std::vector<Kernel::Counted<SpreadRecord>> masters;
    for (int i = 0; i < node.GetMasterCount(); ++i) {
        Kernel::JailCounted<MasterSpreadNode> const master = node.GetMasterAtIndex(i);
        masters.push_back(Kernel::MakeCounted<SpreadRecord>());
        masters.back()->m_Name = master->GetName();
        masters.back()->m_TextRects = master->GetTextRects();
        masters.back()->FromNode(*master, node, links);
    }
    out.SaveObjects(IDTag("mast"), masters);
    std::vector<Kernel::Counted<SpreadRecord>> spreads;
    for (int i = 0; i < node.GetSpreadCount(); ++i) {
        spreads.push_back(Kernel::MakeCounted<SpreadRecord>());
        spreads.back()->FromNode(*node.GetSpreadAtIndex(i), node, links);
    }
    out.SaveObjects(IDTag("sprd"), spreads);
    out.Close();
    return stream.RelinquishOwnership();
}

void DocumentFile::WriteItems(Content & content) const
{
    auto const & flows = m_Document.GetDocument()->GetTextFlows();
    for (std::size_t i = 0; i < flows.size(); ++i) {
        Kernel::Counted<Story::Layout const> const layout = flows[i]->GetLayout();
        if (!layout) {
            continue;
        }
        String const glyphItem = LayoutItemName("layout", i);
        Kernel::Counted<Kernel::RawData const> glyphs;
        if (layout->HasGlyphData() && flows[i]->EnsureGlyphData()) {
            Story::ByteWriter writer;
            layout->SaveGlyphData(writer);
            glyphs = ToRawData(writer.GetBytes());
        } else {
            glyphs = m_Document.m_Store->ReadItem(glyphItem);
        }
        if (glyphs) {
            Story::ByteWriter writer;
            layout->SaveFacts(writer);
            content.m_Items.push_back({LayoutItemName("places", i), ToRawData(writer.GetBytes()), true});
            content.m_Items.push_back({glyphItem, glyphs, true});
        }
    }
    for (auto const & [id, entry] : m_Document.GetPictures().GetEntries()) {
        Raster::Picture::Bytes const bytes = m_Document.GetPictures().GetBytes(id);
        if (bytes) {
            Kernel::Counted<Kernel::RawData> const data = Kernel::MakeCounted<Kernel::RawData>(bytes->size());
            std::copy(bytes->begin(), bytes->end(), data->GetMutableData());
            content.m_Items.push_back({DocumentPictures::ItemName(id), data, true});
        } else {
            content.m_LostPictures.push_back(entry.m_SourcePath);
        }
    }
    content.m_Thumbnails = MakeThumbnails();
}

Kernel::Counted<Kernel::RawData const> DocumentFile::ReadPreview() const
{
    using Thumbnails = Kernel::ArchiveThumbnails;
    return m_Document.m_Store->ReadItem(Thumbnails::GetItemName(Thumbnails::FileType::Png));
}

Kernel::Counted<Kernel::ArchiveThumbnails> DocumentFile::MakeThumbnails() const
{
    if (!VantraController::GetInstance().ArePreviewsWanted()) {
        return nullptr;
    }
    Kernel::Counted<Kernel::RawData const> png;
    if (m_Document.m_KeepsCacheBitmap) {
        if (auto const bitmap = m_Document.GetDocumentCacheBitmap(0, true)) {
            png = SpreadPreview::EncodeFirst(*bitmap, Kernel::Counted<DocumentController const>(&m_Document));
        }
    } else {
        png = ReadPreview();
    }
    if (!png) {
        return nullptr;
    }
    auto thumbnails = Kernel::MakeCounted<Kernel::ArchiveThumbnails>();
    thumbnails->AddFile(Kernel::ArchiveThumbnails::FileType::Png, png);
    return thumbnails;
}

Kernel::Counted<Kernel::Archive> DocumentFile::WriteArchive(Content const & content, String const & path,
                                                            Kernel::FileLock * ownLock, Kernel::FileLock::Kind kind,
                                                            DocumentSaveResult & result)
{
    using General = Kernel::FileStoreCompressionHintGeneral;
    General const deflated(General::CompressionLevel::Fast, Kernel::CompressionPredictorType::None, 0);
    General const asItLies(General::CompressionLevel::Stored, Kernel::CompressionPredictorType::None, 0);

    Kernel::Archive::CreateResult created;
    Kernel::Counted<Kernel::Archive> const archive =
        Kernel::Archive::CreateWithTemporary(path, DocumentController::FileType, created, ownLock);
    if (!archive) {
        SetSaveFailure(result, created);
        return nullptr;
    }
    bool const stored = StoreArchive(result, archive, [&] {
        Kernel::ArchiveSessionHandle session;
        if (Kernel::Archive::SessionResult::Success !=
            archive->CreateSessionAdv(session, Kernel::Archive::SessionType::Whole, nullptr, false)) {
            return false;
        }
        session->SaveBytes(DocumentItem, deflated, content.m_Document);
        for (Content::Item const & item : content.m_Items) {
            session->SaveBytes(item.m_Name, item.m_Stored ? asItLies : deflated, item.m_Data);
        }
        session->SetThumbnails(content.m_Thumbnails);
        archive->CloseSession(session, false);
        return true;
    });
    if (!stored) {
        return nullptr;
    }
    Kernel::Counted<Kernel::FileLock> const lock = archive->GetLock();
    if (lock) {
        lock->ChangeKind(kind);
    }
    Kernel::Archive::OpenResult opened = Kernel::Archive::OpenResult::Success;
    Kernel::Counted<Kernel::Archive> const reopened =
        lock ? Kernel::Archive::OpenLocked(lock, DocumentController::FileType, opened)
             : Kernel::Archive::Open(path, Kernel::Archive::OpenMode::Read, DocumentController::FileType, opened);
    if (!reopened) {
        result.SetResult(DocumentSaveResult::Unknown, Kernel::Archive::GetResultText(opened, path));
    }
    return reopened;
}
