#pragma once

#include "framework/document/DocumentStore.h"
#include "framework/kernel/TimeStamp.h"
#include "framework/raster/Picture.h"
#include "framework/render/PlacedDrawing.h"

#include <map>
#include <memory>
#include <optional>

/// What a picture of the text shows: a file that the document holds, and of a PDF file which page. In text form, as the
/// story carries it, the id, with "#2" behind it for another page than the first.
struct PictureReference
{
    String m_Id;
    int m_Page = 1;

    [[nodiscard]] String ToString() const;
    [[nodiscard]] static PictureReference Parse(String const & text);
};

/// The picture files that a document holds, by id: pixels and drawings. Pictures of the text name them by that id.
///
/// A picture's bytes stay in the document's file until they are asked for. Reading is safe on any thread; adding and
/// removing are for the document's writer lock.
class DocumentPictures : public virtual Kernel::Countable
{
public:
    struct Entry
    {
        /// The file that it was taken from, as a path, and what that file was then.
        String m_SourcePath;
        Kernel::TimeStamp m_SourceTime;
        std::uint64_t m_Size = 0;
        /// Vectors; nothing for pixels.
        std::optional<Renderer::RenderTree::PlacedDrawing::Kind> m_DrawingKind;
        /// A PDF that can't be read without a password.
        bool m_IsProtected = false;
    };

    explicit DocumentPictures(Kernel::Counted<DocumentStore> store) : m_Store(std::move(store)) {}

    /// The id of a picture, made from its content: the same bytes are held once.
    [[nodiscard]] static String IdOf(std::vector<unsigned char> const & bytes);
    /// Takes a picture's bytes in and gives its id.
    String Add(Raster::Picture::Bytes bytes, Entry entry);
    /// Null if there is no such picture or its bytes can't be read or are no picture; then `problem` tells why. Kept
    /// for the next caller.
    [[nodiscard]] Kernel::Counted<Raster::Picture const> Get(String const & id, Raster::PictureProblem & problem) const;
    /// The same for a drawing. `password` is that of a protected PDF; it stays in memory.
    [[nodiscard]] Kernel::Counted<Renderer::RenderTree::PlacedDrawing const>
    GetDrawing(PictureReference const & reference, String const & password, Raster::PictureProblem & problem) const;
    /// What is held under the id; nothing if there is no such picture.
    [[nodiscard]] std::optional<Entry> FindEntry(String const & id) const;
    /// The bytes, from memory or from the file; null if they are lost.
    [[nodiscard]] Raster::Picture::Bytes GetBytes(String const & id) const;
    [[nodiscard]] std::map<String, Entry> GetEntries() const;
    /// Drops all that `isUsed` does not want.
    template <typename TPredicate>
    void RemoveUnless(TPredicate const & isUsed)
    {
        Kernel::ScopedLock const lock(m_Lock);
        std::erase_if(m_Entries, [&isUsed](auto const & entry) { return !isUsed(entry.first); });
    }
    /// For loading: a picture whose bytes lie in the file.
    void AddStored(String const & id, Entry entry);
    /// For saving: all bytes are in the file now and need not be kept.
    void DropBytes();

    /// Name of the picture's item in the document's file.
    [[nodiscard]] static String ItemName(String const & id) { return String("pictures/") + id.View(); }

private:
    struct Held
    {
        Entry m_Entry;
        Raster::Picture::Bytes m_Bytes;
        Kernel::Counted<Raster::Picture const> m_Picture;
        /// By page and password.
        std::map<std::pair<int, String>, Kernel::Counted<Renderer::RenderTree::PlacedDrawing const>> m_Drawings;
    };

    Kernel::Counted<DocumentStore> m_Store;
    mutable Kernel::CriticalSection m_Lock;
    mutable std::map<String, Held> m_Entries KORVANE_GUARDED_BY(m_Lock);
};
