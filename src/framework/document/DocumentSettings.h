#pragma once

#include "framework/document/DocumentMetadata.h"
#include "framework/document/DocumentPictures.h"
#include "framework/document/DocumentSection.h"
#include "framework/document/PageSetup.h"
#include "framework/document/RunningTextNode.h"
#include "framework/document/Swatches.h"
#include "framework/raster/Format.h"
#include "framework/raster/ICCManager.h"
#include "framework/story/StyleSheet.h"

#include <optional>
#include <vector>

/// A running head or folio of a master. Lengths in points, from the top left of its page.
struct RunningTextSettings
{
    Kernel::RectT<double> m_Rect;
    std::vector<RunningTextPart> m_Parts;
    RunningTextAlignment m_Alignment = RunningTextAlignment::Left;
    /// Paragraph style.
    String m_Style;
};

/// A filled or outlined rectangle of a master.
struct ShapeSettings
{
    Kernel::RectT<double> m_Rect;
    std::optional<Raster::Colour> m_Fill;
    std::optional<Raster::Colour> m_Stroke;
    double m_StrokeWidth = 0;
    /// Lies under the text rather than over it.
    bool m_Under = true;
};

/// One page of a master.
struct MasterPageSettings
{
    /// Where the main text stands.
    Kernel::RectT<double> m_TextRect;
    std::vector<RunningTextSettings> m_RunningTexts;
    std::vector<ShapeSettings> m_Shapes;
};

/// One master: its left and its right page. A document without facing pages uses the right one only.
struct MasterSettings
{
    String m_Name;
    MasterPageSettings m_Left;
    MasterPageSettings m_Right;
};

/// A picture file for the document to hold. `m_Size` of the entry is filled in.
struct PictureSettings
{
    Raster::Picture::Bytes m_Bytes;
    DocumentPictures::Entry m_Entry;
};

/// Everything but the text that a new document is made from: what a template and a chapter's head say.
///
/// A plain value, made by importers; two threads may make documents from copies of one at the same time.
struct DocumentSettings
{
    /// Names the masters of the first page and of the others; both have to be in `m_Masters`.
    PageSetup m_PageSetup;
    std::vector<MasterSettings> m_Masters;
    Kernel::Counted<Story::StyleSheet const> m_Styles;
    std::vector<Swatch> m_Swatches;
    /// The pictures that the text names by `DocumentPictures::IdOf` their bytes. Those that it does not name are
    /// dropped.
    std::vector<PictureSettings> m_Pictures;
    DocumentMetadata::Values m_Metadata;
    /// For running heads: the title of the book.
    String m_PublicationTitle;
    Raster::Format m_Format = Raster::Format::Rgba8;
    Raster::ICCManager::ICCProfileSet m_Profiles;
    /// How the pages are numbered. A document that is made anew from changed sources keeps its start numbers.
    std::vector<DocumentSection::Values> m_Sections;
};
