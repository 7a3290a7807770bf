#pragma once

#include "framework/document/Anchors.h"
#include "framework/kernel/Serialisable.h"

#include <map>

/// Bookmarks that anchors stand for, known by the anchors' uids: names and order that a book keeps above its chapters.
///
/// Shared between threads once it hangs in a document or book: change a clone and put that in its place.
class PDFBookmarkManager : public Kernel::Serialisable
{
public:
    PDFBookmarkManager();
    ~PDFBookmarkManager() override;

    [[nodiscard]] Kernel::Counted<PDFBookmarkManager> Clone() const;
    /// The other lacks a bookmark that this one holds, or has it under another name. What the other holds beyond that
    /// is no difference: once a chapter has taken in the book's bookmarks, keeping its own, the two agree, so that
    /// opening a chapter again changes nothing. Null differs from a manager that holds any.
    [[nodiscard]] bool IsLogicallyDifferent(Kernel::Counted<PDFBookmarkManager const> other) const;
    /// Takes in the bookmarks among the anchors: new ones are added, known ones take the anchor's name. Others stay.
    void Reconcile(Kernel::Counted<Anchors const> anchors);
    /// Adds one bookmark, or replaces the one of its uid.
    void Add(Kernel::Counted<Story::AnchorData> data);
    /// The anchor's data, null if no bookmark has the uid.
    [[nodiscard]] Kernel::Counted<Story::AnchorData> GetDataFromUid(String const & uid) const;
    [[nodiscard]] std::size_t GetCount() const { return m_Data.size(); }
    [[nodiscard]] std::map<String, Kernel::Counted<Story::AnchorData>> const & GetData() const { return m_Data; }

    void Save(Kernel::OutSerialiser & out) const override;
    /// A bookmark that makes no sense is left out.
    bool Load(Kernel::InSerialiser const & in, Kernel::FileStore & store, unsigned short version) override;
    [[nodiscard]] Kernel::ClassProperties const & GetObjectClassProperties() const override;
    static Kernel::ClassProperties const & GetTypeClassProperties();

private:
    static Kernel::ClassProperties const ms_ClassProperties;

    std::map<String, Kernel::Counted<Story::AnchorData>> m_Data;
};
