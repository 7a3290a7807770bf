#pragma once

#include "framework/document/ExportableInterface.h"
#include "framework/document/XMPTree.h"

namespace Raster
{
struct ExportOptions;
}

/// What a document tells about itself. An immutable value: a change puts another object in its place.
class DocumentMetadata : public virtual Kernel::Countable
{
public:
    struct Values
    {
        String m_Title;
        String m_Author;
        String m_Subject;
        /// Separated by commas.
        String m_Tags;
        /// BCP 47, such as "en-GB".
        String m_Language;
        /// UTC, as in 2026-11-21T06:30:00Z; empty if not known.
        String m_Created;
        String m_Modified;
        /// When the document was last prepared for output; kept in memory only.
        String m_Output;

        friend bool operator==(Values const &, Values const &) = default;
    };

    DocumentMetadata() = default;
    explicit DocumentMetadata(Values values) : m_Values(std::move(values)) {}

    [[nodiscard]] Values const & GetValues() const { return m_Values; }
    [[nodiscard]] String const & GetTitle() const { return m_Values.m_Title; }
    [[nodiscard]] String const & GetAuthor() const { return m_Values.m_Author; }
    [[nodiscard]] String const & GetSubject() const { return m_Values.m_Subject; }
    [[nodiscard]] String const & GetTags() const { return m_Values.m_Tags; }
    [[nodiscard]] String const & GetLanguage() const { return m_Values.m_Language; }

    /// The metadata as XMP (ISO 16684-1), for a file made from the document. What `result` and `options` know of the
    /// file is put in; both may be null.
    [[nodiscard]] Kernel::Counted<XMPTree const>
    GetCurrentXMPTreeForExport(Kernel::Counted<DocumentController const> document,
                               ExportableInterface::ExportResult const * result,
                               Raster::ExportOptions const * options) const;

private:
    Values m_Values;
};
