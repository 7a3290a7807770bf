#pragma once

#include "framework/document/DocumentController.h"

/// Brings a document's layouts and pages in step with its text, styles and sections.
///
/// The main flow grows and shrinks the document: each of its frames gets a page, made from the masters, and the pages
/// are laid on spreads by their numbers. Under the document's writer lock, or before anybody else knows it.
class DocumentComposer
{
public:
    explicit DocumentComposer(DocumentController & document)
        : m_Controller(document),
          m_Document(*document.GetDocument())
    {
    }

    ComposeOutcome Compose(bool force, bool * abort);

    /// What the flow's layout depends on: text, styles, geometry, fields, version of the composer.
    [[nodiscard]] std::uint64_t HashOf(TextFlow const & flow) const;

private:
    [[nodiscard]] Kernel::RectT<double> TextRectOf(std::size_t pageOfFlow) const;
    bool ComposeFlow(TextFlow & flow, bool force);
    bool ShapePages(TextFlow & flow);
    void PlaceFrames(TextFlow & flow);

    DocumentController & m_Controller;
    DocumentNode & m_Document;
};
