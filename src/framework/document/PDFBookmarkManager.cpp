#include "framework/document/PDFBookmarkManager.h"

#include "framework/document/DocumentRecords.h"

Kernel::ClassProperties const PDFBookmarkManager::ms_ClassProperties(
    Kernel::ClassUID("PdBM"),
    [] { return Kernel::Counted<Kernel::Serialisable>(Kernel::MakeCounted<PDFBookmarkManager>()); }, 1, {}, nullptr);
static Kernel::ClassPropertiesBase::Init const s_PDFBookmarkManagerInit(PDFBookmarkManager::GetTypeClassProperties());

Kernel::ClassProperties const & PDFBookmarkManager::GetObjectClassProperties() const
{
    return ms_ClassProperties;
}

Kernel::ClassProperties const & PDFBookmarkManager::GetTypeClassProperties()
{
    return ms_ClassProperties;
}

void PDFBookmarkManager::Save(Kernel::OutSerialiser & out) const
{
    std::vector<Kernel::Counted<BookmarkRecord>> records;
    for (auto const & [uid, data] : m_Data) {
        records.push_back(Kernel::MakeCounted<BookmarkRecord>());
        records.back()->m_Data = data;
    }
    out.SaveObjects("bkmk", records);
}

bool PDFBookmarkManager::Load(Kernel::InSerialiser const & in, Kernel::FileStore &, unsigned short)
{
    std::vector<Kernel::Counted<BookmarkRecord>> records;
    in.LoadObjects("bkmk", records);
    for (Kernel::Counted<BookmarkRecord> const & record : records) {
        if (record) {
            Add(record->m_Data);
        }
    }
    return true;
}

PDFBookmarkManager::PDFBookmarkManager() = default;
PDFBookmarkManager::~PDFBookmarkManager() = default;

Kernel::Counted<PDFBookmarkManager> PDFBookmarkManager::Clone() const
{
    Kernel::Counted<PDFBookmarkManager> const clone = Kernel::MakeCounted<PDFBookmarkManager>();
    clone->m_Data = m_Data;
    return clone;
}

bool PDFBookmarkManager::IsLogicallyDifferent(Kernel::Counted<PDFBookmarkManager const> other) const
{
    for (auto const & [uid, data] : m_Data) {
        Kernel::Counted<Story::AnchorData> const theirs = other ? other->GetDataFromUid(uid) : nullptr;
        if (!theirs || theirs->GetName() != data->GetName()) {
            return true;
        }
    }
    return false;
}

void PDFBookmarkManager::Reconcile(Kernel::Counted<Anchors const> anchors)
{
    for (Kernel::Counted<AnchorInstance const> const & anchor : *anchors) {
        if (String const uid = anchor->GetUid(); anchor->IsPDFBookmark() && !uid.Empty()) {
            m_Data[uid] = anchor->GetAnchor();
        }
    }
}

void PDFBookmarkManager::Add(Kernel::Counted<Story::AnchorData> data)
{
    m_Data[data->GetUid()] = data;
}

Kernel::Counted<Story::AnchorData> PDFBookmarkManager::GetDataFromUid(String const & uid) const
{
    auto const found = m_Data.find(uid);
    return found == m_Data.end() ? nullptr : found->second;
}
