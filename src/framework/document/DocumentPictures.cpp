#include "framework/document/DocumentPictures.h"

#include "framework/kernel/Assert.h"
#include "framework/kernel/HashAccumulator.h"

String DocumentPictures::IdOf(std::vector<unsigned char> const & bytes)
{
    return Kernel::HashBytes128(bytes.data(), bytes.size()).ToString();
}

String DocumentPictures::Add(Raster::Picture::Bytes bytes, Entry entry)
{
    KORVANE_ASSERT(bytes);
    String const id = IdOf(*bytes);
    entry.m_Size = bytes->size();
    Kernel::ScopedLock const lock(m_Lock);
    m_Entries.try_emplace(id, Held{std::move(entry), std::move(bytes), nullptr});
    return id;
}

Kernel::Counted<Raster::Picture const> DocumentPictures::Get(String const & id, Raster::PictureProblem & problem) const
{
    {
        Kernel::ScopedLock const lock(m_Lock);
        auto const found = m_Entries.find(id);
        if (found != m_Entries.end() && found->second.m_Picture) {
            return found->second.m_Picture;
        }
    }
    Raster::Picture::Bytes const bytes = GetBytes(id);
    Kernel::ScopedLock const lock(m_Lock);
    auto const found = m_Entries.find(id);
    if (found == m_Entries.end() || !bytes) {
        problem.m_Code = Raster::PictureProblem::Code::NotFound;
        problem.m_Text = "The document does not hold the picture any more.";
        return nullptr;
    }
    if (!found->second.m_Picture) {
        found->second.m_Picture = Raster::Picture::FromBytes(bytes, found->second.m_Entry.m_SourcePath, problem);
    }
    return found->second.m_Picture;
}

Raster::Picture::Bytes DocumentPictures::GetBytes(String const & id) const
{
    {
        Kernel::ScopedLock const lock(m_Lock);
        auto const found = m_Entries.find(id);
        if (found == m_Entries.end() || found->second.m_Bytes) {
            return found == m_Entries.end() ? nullptr : found->second.m_Bytes;
        }
    }
    Kernel::Counted<Kernel::RawData const> const data = m_Store->ReadItem(ItemName(id));
    return data ? std::make_shared<std::vector<unsigned char> const>(data->GetData(), data->GetData() + data->GetSize())
                : nullptr;
}

std::map<String, DocumentPictures::Entry> DocumentPictures::GetEntries() const
{
    Kernel::ScopedLock const lock(m_Lock);
    std::map<String, Entry> entries;
    for (auto const & [id, held] : m_Entries) {
        entries.emplace(id, held.m_Entry);
    }
    return entries;
}

void DocumentPictures::AddStored(String const & id, Entry entry)
{
    Kernel::ScopedLock const lock(m_Lock);
    m_Entries.insert_or_assign(id, Held{std::move(entry), nullptr, nullptr});
}

void DocumentPictures::DropBytes()
{
    Kernel::ScopedLock const lock(m_Lock);
    for (auto & [id, held] : m_Entries) {
        held.m_Bytes = nullptr;
        held.m_Picture = nullptr;
    }
}
