#pragma once

#include "framework/document/DocumentController.h"
#include "framework/kernel/Archive.h"
#include "framework/kernel/ArchiveThumbnails.h"
#include "framework/kernel/RawData.h"

#include <vector>

/// Reads a document from its file and writes it; the form of the file is in docs/file-format.md.
class DocumentFile
{
public:
    static constexpr char const * DocumentItem = "doc.dat";

    explicit DocumentFile(DocumentController & document) : m_Document(document) {}

    /// Fills the empty document. False, with `failure` filled, if the content is no good.
    [[nodiscard]] bool Load(Kernel::Archive & archive, OpenDocumentFailedNotification & failure);

    /// The format version of a document's file; false if it has none.
    [[nodiscard]] static bool ReadVersion(Kernel::Archive & archive, unsigned int & version);

    /// What a save writes: taken under the document's lock, written without it.
    struct Content
    {
        struct Item
        {
            String m_Name;
            Kernel::Counted<Kernel::RawData const> m_Data;
            /// Compressed already, or read as it lies.
            bool m_Stored = true;
        };
        Kernel::Counted<Kernel::RawData const> m_Document;
        std::vector<Item> m_Items;
        /// For file managers; null for none.
        Kernel::Counted<Kernel::ArchiveThumbnails> m_Thumbnails;
        /// The pictures that could not be read any more.
        std::vector<String> m_LostPictures;
    };

    /// The document's own item, with the metadata as they are. What is in `links` is named as that says.
    [[nodiscard]] Kernel::Counted<Kernel::RawData const> WriteDocument(DocumentLinks const & links) const;
    /// The preview in the document's file; null if it has none.
    [[nodiscard]] Kernel::Counted<Kernel::RawData const> ReadPreview() const;
    /// The layouts and pictures beside it, and the preview: that of a document that keeps one is as the document is now;
    /// others take along what their file has.
    void WriteItems(Content & content) const;
    /// Writes the content to a file and opens it again for reading, shared or exclusive. Null, with `result` filled, if
    /// it can't; the target is untouched then. Needs no lock.
    [[nodiscard]] static Kernel::Counted<Kernel::Archive> WriteArchive(Content const & content, String const & path,
                                                                       Kernel::FileLock * ownLock,
                                                                       Kernel::FileLock::Kind kind,
                                                                       DocumentSaveResult & result);

private:
    [[nodiscard]] Kernel::Counted<Kernel::ArchiveThumbnails> MakeThumbnails() const;
    bool Read(Kernel::InSerialiser const & in, unsigned short version);
    void LoadLayout(TextFlow & flow, std::size_t number, std::uint64_t hash, Kernel::Archive & archive);

    friend class DocumentStreamItem;

    DocumentController & m_Document;
    /// Between `Read` and the layouts.
    std::vector<std::uint64_t> m_LayoutHashes;
    std::vector<bool> m_HasLayout;
};
