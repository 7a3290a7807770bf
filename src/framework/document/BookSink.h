#pragma once

#include "framework/kernel/Counted.h"
#include "framework/kernel/StringT.h"

struct AnchorInfo;
class AnchorInstance;
class AnchorVisitor;
class DocumentController;
class DomainCommand;

/// By this the documents ask about the publication that they are part of. Whoever answers must not take a reader lock of
/// a book, and finds the document's writer lock given up for the time of the call if a command of the document asks.
class BookSink
{
public:
    [[nodiscard]] virtual bool IsAnyTocOutOfDate(Kernel::Counted<DocumentController const> document) = 0;
    [[nodiscard]] virtual bool IsIndexOutOfDate(Kernel::Counted<DocumentController const> document) = 0;
    [[nodiscard]] virtual bool IsInBook(Kernel::Counted<DocumentController const> document) = 0;
    /// Commands for `VantraController::EnqueueCommand` with this document.
    [[nodiscard]] virtual Kernel::Counted<DomainCommand>
    MakeUpdateIndexCommand(Kernel::Counted<DocumentController const> document) = 0;
    [[nodiscard]] virtual Kernel::Counted<DomainCommand>
    MakeUpdateAllTocsCommand(Kernel::Counted<DocumentController const> document) = 0;
    /// A command was handed in for this document that no document can run: true if the sink has taken it on.
    virtual bool HandleCommand(Kernel::Counted<DocumentController const> document,
                               Kernel::Counted<DomainCommand> command) = 0;
    /// Visits the anchors of all chapters; false if the document is in no book.
    virtual bool GetAnchors(AnchorVisitor & visitor, Kernel::Counted<DocumentController const> document) = 0;
    [[nodiscard]] virtual bool IsAnchorPointValid(Kernel::Counted<AnchorInstance const> instance,
                                                  Kernel::Counted<DocumentController const> document) = 0;
    /// What is known of an anchor in another chapter, by its uid; null if nothing is. Valid to the end of the calling
    /// turn.
    [[nodiscard]] virtual AnchorInfo const * GetAnchorInfo(String const & uid,
                                                           Kernel::Counted<DocumentController const> document) = 0;
    /// The anchor lies in an earlier chapter.
    [[nodiscard]] virtual bool IsAnchorAbove(String const & uid,
                                             Kernel::Counted<DocumentController const> document) = 0;
    /// Passwords of placed files, kept for the session. Empty: none.
    [[nodiscard]] virtual String GetPasswordForGuid(String guid, Kernel::Counted<DocumentController const> document) = 0;
    virtual void SetPasswordForGuid(String guid, String password,
                                    Kernel::Counted<DocumentController const> document) = 0;
    virtual ~BookSink() = default;
};
