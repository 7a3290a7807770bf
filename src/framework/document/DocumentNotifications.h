#pragma once

#include "framework/document/DocumentController.h"
#include "framework/document/DocumentNotification.h"
#include "framework/document/DocumentSaveResult.h"
#include "framework/kernel/StringT.h"

class Node;

/// A document has been opened in front.
class NewDocumentNotification : public DocumentNotification
{
public:
    explicit NewDocumentNotification(Kernel::Counted<DocumentController const> document)
        : DocumentNotification(std::move(document))
    {
    }
};

/// Topics of the document's index were added, removed or changed.
class IndexTopicsChangedNotification : public DocumentNotification
{
public:
    explicit IndexTopicsChangedNotification(Kernel::Counted<DocumentController const> document)
        : DocumentNotification(std::move(document))
    {
    }
};

/// Anchors were added, removed, renamed, or have moved to another page.
class AnchorsChangedNotification : public DocumentContentNotification
{
public:
    AnchorsChangedNotification(Kernel::Counted<DocumentController const> document, bool layoutOnly)
        : DocumentContentNotification(std::move(document), layoutOnly)
    {
    }
};

/// Nodes were added, removed or moved in the tree.
class DocumentStructureChangedNotification : public DocumentContentNotification
{
public:
    DocumentStructureChangedNotification(Kernel::Counted<DocumentController const> document, bool layoutOnly)
        : DocumentContentNotification(std::move(document), layoutOnly)
    {
    }
};

/// The text of a story changed.
class StoryChangedNotification : public DocumentContentNotification
{
public:
    StoryChangedNotification(Kernel::Counted<DocumentController const> document, bool layoutOnly)
        : DocumentContentNotification(std::move(document), layoutOnly)
    {
    }
};

/// Pages were added, removed or re-ordered, or spreads took another shape.
class PageStructureChangedNotification : public DocumentNotification
{
public:
    explicit PageStructureChangedNotification(Kernel::Counted<DocumentController const> document)
        : DocumentNotification(std::move(document))
    {
    }
};

class DocumentSectionAddedNotification : public DocumentNotification
{
public:
    explicit DocumentSectionAddedNotification(Kernel::Counted<DocumentController const> document)
        : DocumentNotification(std::move(document))
    {
    }
};

/// A section's number, numbering style, start or inclusion in output changed, or a section was removed.
class DocumentSectionChangedNotification : public DocumentNotification
{
public:
    explicit DocumentSectionChangedNotification(Kernel::Counted<DocumentController const> document)
        : DocumentNotification(std::move(document))
    {
    }
};

/// A preflight check has ended; its results are the document's `GetPreflightResults`.
class PreflightResultsUpdatedNotification : public DocumentNotification
{
public:
    explicit PreflightResultsUpdatedNotification(Kernel::Counted<DocumentController const> document)
        : DocumentNotification(std::move(document))
    {
    }
};

/// A save of a document in front has ended.
class DocumentSaveNotification : public DocumentNotification
{
public:
    DocumentSaveNotification(Kernel::Counted<DocumentController const> document, DocumentSaveResult result);
    ~DocumentSaveNotification() override;

    [[nodiscard]] DocumentSaveResult const & GetResult() const { return m_Result; }

private:
    DocumentSaveResult const m_Result;
};

/// A changed document that nobody has in front could not be written as its last user let go of it. Its bytes were kept
/// beside the file, if that could be done.
class DocumentSaveFailedNotification : public DocumentNotification
{
public:
    /// \param keptPath where the changed document lies now; empty if that could not be written either
    DocumentSaveFailedNotification(Kernel::Counted<DocumentController const> document, String path, String reason,
                                   String keptPath);

    [[nodiscard]] String const & GetPath() const { return m_Path; }
    [[nodiscard]] String const & GetReason() const { return m_Reason; }
    [[nodiscard]] String const & GetKeptPath() const { return m_KeptPath; }

private:
    String const m_Path;
    String const m_Reason;
    String const m_KeptPath;
};

/// The picture of a node, such as a spread, was rendered anew.
class DocumentCacheBitmapChangedNotification : public DocumentNotification
{
public:
    DocumentCacheBitmapChangedNotification(Kernel::Counted<DocumentController const> document,
                                           Kernel::Counted<Node const> node);
    ~DocumentCacheBitmapChangedNotification() override;

    [[nodiscard]] Kernel::Counted<Node const> const & GetNode() const { return m_Node; }

private:
    Kernel::Counted<Node const> const m_Node;
};

/// A user's command was refused because the document is held still.
class CommandRefusedNotification : public DocumentNotification
{
public:
    CommandRefusedNotification(Kernel::Counted<DocumentController const> document, String description, String reason);

    /// The command's description and the reason, in the user's language.
    [[nodiscard]] String const & GetDescription() const { return m_Description; }
    [[nodiscard]] String const & GetReason() const { return m_Reason; }

private:
    String const m_Description;
    String const m_Reason;
};
