#include "framework/document/DocumentPictures.h"

#include "framework/kernel/Assert.h"
#include "framework/kernel/Format.h"
#include "framework/kernel/HashAccumulator.h"

#include <charconv>

String PictureReference::ToString() const
{
    return 1 == m_Page ? m_Id : m_Id + "#" + Kernel::ToString(m_Page);
}

PictureReference PictureReference::Parse(String const & text)
{
    std::string_view const view = text.View();
    std::size_t const mark = view.rfind('#');
    PictureReference reference{text};
    if (std::string_view::npos != mark) {
        int page = 0;
        auto const [end, error] = std::from_chars(view.data() + mark + 1, view.data() + view.size(), page);
        if (std::errc() == error && view.data() + view.size() == end && 0 < page) {
            reference = {String(view.substr(0, mark)), page};
        }
    }
    return reference;
}

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
    auto const [place, isNew] = m_Entries.try_emplace(id, Held{entry, std::move(bytes), nullptr, {}});
    if (!isNew) {
        // The same content, from where it lies now.
        place->second.m_Entry = std::move(entry);
    }
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
        problem.m_Text = Kernel::LocalisedString("The document does not hold the picture any more.", "Picture");
        return nullptr;
    }
    if (!found->second.m_Picture) {
        found->second.m_Picture = Raster::Picture::FromBytes(bytes, found->second.m_Entry.m_SourcePath, problem);
    }
    return found->second.m_Picture;
}

Kernel::Counted<Renderer::RenderTree::PlacedDrawing const>
DocumentPictures::GetDrawing(PictureReference const & reference, String const & password,
                             Raster::PictureProblem & problem) const
{
    std::pair<int, String> const key{reference.m_Page, password};
    Renderer::RenderTree::PlacedDrawing::Source source{nullptr, String(), reference.m_Page, password};
    {
        Kernel::ScopedLock const lock(m_Lock);
        auto const found = m_Entries.find(reference.m_Id);
        if (found != m_Entries.end()) {
            auto const known = found->second.m_Drawings.find(key);
            if (known != found->second.m_Drawings.end()) {
                return known->second;
            }
            source.m_Path = found->second.m_Entry.m_SourcePath;
        }
    }
    source.m_Bytes = GetBytes(reference.m_Id);
    if (!source.m_Bytes) {
        problem.m_Code = Raster::PictureProblem::Code::NotFound;
        problem.m_Path = source.m_Path;
        problem.m_Text = Kernel::LocalisedString("The document does not hold the picture any more.", "Picture");
        return nullptr;
    }
    auto const drawing = Renderer::RenderTree::PlacedDrawing::Open(std::move(source), problem);
    Kernel::ScopedLock const lock(m_Lock);
    auto const found = m_Entries.find(reference.m_Id);
    if (drawing && found != m_Entries.end()) {
        found->second.m_Drawings.insert_or_assign(key, drawing);
    }
    return drawing;
}

std::optional<DocumentPictures::Entry> DocumentPictures::FindEntry(String const & id) const
{
    Kernel::ScopedLock const lock(m_Lock);
    auto const found = m_Entries.find(id);
    return found == m_Entries.end() ? std::nullopt : std::optional(found->second.m_Entry);
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
    m_Entries.insert_or_assign(id, Held{std::move(entry), nullptr, nullptr, {}});
}

void DocumentPictures::DropBytes()
{
    Kernel::ScopedLock const lock(m_Lock);
    for (auto & [id, held] : m_Entries) {
        held.m_Bytes = nullptr;
        held.m_Picture = nullptr;
        held.m_Drawings.clear();
    }
}
