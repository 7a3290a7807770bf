#pragma once

#include "framework/document/DocumentLinks.h"
#include "framework/document/DocumentMetadata.h"
#include "framework/document/DocumentPictures.h"
#include "framework/document/DocumentSection.h"
#include "framework/document/PageSetup.h"
#include "framework/document/RunningTextNode.h"
#include "framework/document/SpreadNode.h"
#include "framework/document/Swatches.h"
#include "framework/document/TextFlow.h"
#include "framework/kernel/InSerialiser.h"
#include "framework/kernel/OutSerialiser.h"
#include "framework/kernel/Serialisable.h"
#include "framework/story/AnchorData.h"

#include <optional>

/// The parts of a document as they stand in its file. Plain carriers: `DocumentFile` fills them from a document and
/// makes a document of them. docs/file-format.md lists their tags.

class DocumentNode;

/// Gives a record its registered description, which is the static `ms_ClassProperties` of the class.
template <typename TRecord>
class DocumentRecord : public Kernel::Serialisable
{
public:
    [[nodiscard]] Kernel::ClassProperties const & GetObjectClassProperties() const override
    {
        return TRecord::ms_ClassProperties;
    }
    [[nodiscard]] static Kernel::Counted<Kernel::Serialisable> CreateObject() { return Kernel::MakeCounted<TRecord>(); }
};

/// Title, author and the like.
class MetadataRecord : public DocumentRecord<MetadataRecord>
{
public:
    static Kernel::ClassProperties const ms_ClassProperties;
    void Save(Kernel::OutSerialiser & out) const override;
    bool Load(Kernel::InSerialiser const & in, Kernel::FileStore & store, unsigned short version) override;

    DocumentMetadata::Values m_Values;
};

/// The shape of the pages.
class PageSetupRecord : public DocumentRecord<PageSetupRecord>
{
public:
    static Kernel::ClassProperties const ms_ClassProperties;
    void Save(Kernel::OutSerialiser & out) const override;
    bool Load(Kernel::InSerialiser const & in, Kernel::FileStore & store, unsigned short version) override;

    PageSetup m_Setup;
};

/// One section.
class SectionRecord : public DocumentRecord<SectionRecord>
{
public:
    static Kernel::ClassProperties const ms_ClassProperties;
    void Save(Kernel::OutSerialiser & out) const override;
    bool Load(Kernel::InSerialiser const & in, Kernel::FileStore & store, unsigned short version) override;

    DocumentSection::Values m_Values;
};

/// One swatch.
class SwatchRecord : public DocumentRecord<SwatchRecord>
{
public:
    static Kernel::ClassProperties const ms_ClassProperties;
    void Save(Kernel::OutSerialiser & out) const override;
    bool Load(Kernel::InSerialiser const & in, Kernel::FileStore & store, unsigned short version) override;

    Swatch m_Swatch;
};

/// One item on a spread or master. The fields that are used depend on the kind.
class ItemRecord : public DocumentRecord<ItemRecord>
{
public:
    static Kernel::ClassProperties const ms_ClassProperties;
    void Save(Kernel::OutSerialiser & out) const override;
    bool Load(Kernel::InSerialiser const & in, Kernel::FileStore & store, unsigned short version) override;

    [[nodiscard]] static Kernel::Counted<ItemRecord> FromNode(Node const & node, DocumentNode const & document,
                                                              DocumentLinks const & links);
    /// Null for a record that makes no sense. A text frame is entered in `frames`, by flow and place in the chain.
    [[nodiscard]] Kernel::JailCounted<Node>
    MakeNode(std::vector<std::vector<Kernel::JailCounted<TextFrameNode>>> & frames) const;

    [[nodiscard]] NodeChildListType GetList() const { return static_cast<NodeChildListType>(m_List); }

private:
    std::uint8_t m_Kind = 0;
    std::uint8_t m_List = NodeChildListItems;
    Kernel::RectT<double> m_Rect;
    std::int32_t m_Flow = -1;
    std::int32_t m_Frame = -1;
    String m_Path;
    String m_Guid;
    bool m_Protected = false;
    std::vector<std::uint8_t> m_PartFields;
    std::vector<String> m_PartTexts;
    std::uint8_t m_Alignment = 0;
    String m_Style;
    std::optional<Raster::Colour> m_Fill;
    std::optional<Raster::Colour> m_Stroke;
    double m_StrokeWidth = 0;
};

/// One spread or master spread.
class SpreadRecord : public DocumentRecord<SpreadRecord>
{
public:
    static Kernel::ClassProperties const ms_ClassProperties;
    void Save(Kernel::OutSerialiser & out) const override;
    bool Load(Kernel::InSerialiser const & in, Kernel::FileStore & store, unsigned short version) override;

    void FromNode(SpreadNode const & spread, DocumentNode const & document, DocumentLinks const & links);
    /// Pages of version 1 had no bleed of their own: they get the document's.
    void CompleteBleed(Kernel::RectT<double> const & bleed);
    /// Gives the node its pages and those items that make sense.
    void FillNode(SpreadNode & spread, std::vector<std::vector<Kernel::JailCounted<TextFrameNode>>> & frames) const;

    String m_Name;
    std::vector<Kernel::RectT<double>> m_TextRects;

private:
    std::vector<SpreadPage> m_Pages;
    std::vector<Kernel::Counted<ItemRecord>> m_Items;
    bool m_TransparentBackground = false;
    bool m_LacksBleed = false;
};

/// One text flow: its story, and the hash of what its layout was made from. The layout itself lies in items of its own.
class FlowRecord : public DocumentRecord<FlowRecord>
{
public:
    static Kernel::ClassProperties const ms_ClassProperties;
    void Save(Kernel::OutSerialiser & out) const override;
    bool Load(Kernel::InSerialiser const & in, Kernel::FileStore & store, unsigned short version) override;

    Kernel::Counted<Story::Story> m_Story;
    bool m_Growing = false;
    TextFlowPurpose m_Purpose = TextFlowPurpose::Text;
    bool m_HasLayout = false;
    std::uint64_t m_LayoutHash = 0;
    std::vector<TextFlow::FontStamp> m_Fonts;
};

/// One bookmark.
class BookmarkRecord : public DocumentRecord<BookmarkRecord>
{
public:
    static Kernel::ClassProperties const ms_ClassProperties;
    void Save(Kernel::OutSerialiser & out) const override;
    bool Load(Kernel::InSerialiser const & in, Kernel::FileStore & store, unsigned short version) override;

    Kernel::Counted<Story::AnchorData> m_Data;
};

/// One picture that the document holds; its bytes are an item of their own.
class PictureRecord : public DocumentRecord<PictureRecord>
{
public:
    static Kernel::ClassProperties const ms_ClassProperties;
    void Save(Kernel::OutSerialiser & out) const override;
    bool Load(Kernel::InSerialiser const & in, Kernel::FileStore & store, unsigned short version) override;

    String m_Id;
    DocumentPictures::Entry m_Entry;
};
