#pragma once

#include "framework/kernel/ClassProperties.h"
#include "framework/kernel/DomainCommand.h"
#include "framework/kernel/Serialisable.h"

class DocumentController;
class Selection;

/// A command on one document. Run by `VantraController`, or by the document's own queue.
///
/// It may be written into a stream, for commands that are kept beyond their run; the base writes nothing. Only classes
/// that a stream can name have properties of their own.
class DocumentCommand : public DomainCommand, public Kernel::Serialisable
{
public:
    [[nodiscard]] Kernel::Counted<DomainController const> GetDomainController() const override;
    [[nodiscard]] Kernel::Counted<DomainController> GetDomainController() override;
    /// Passes the document on to `PostDequeueWithMutableController`; null if the controller is no document.
    void PostDequeueWithMutableDomainController(Kernel::NonCounted<DomainController> controller) override;

    /// The document that it is going to run on. Whoever runs a command by hand, under the document's writer lock, calls
    /// this first.
    virtual void PostDequeueWithMutableController(Kernel::NonCounted<DocumentController> document);
    /// The same for a command that came out of a stream.
    virtual void PostLoad(Kernel::NonCounted<DocumentController> document);
    /// What a front end should have selected after the command; null leaves its selection alone.
    [[nodiscard]] virtual Kernel::Counted<Selection const> GetSelectionAfter() const;
    /// Running it makes the document unsaved. By default what enters the history does.
    [[nodiscard]] virtual bool MakesDOMDirty() const { return ShouldStackForUndo(); }

    void Save(Kernel::OutSerialiser & out) const override;
    bool Load(Kernel::InSerialiser const & in, Kernel::FileStore & store, unsigned short version) override;
    [[nodiscard]] Kernel::ClassProperties const & GetObjectClassProperties() const override;
    static Kernel::ClassProperties const & GetTypeClassProperties();

protected:
    ~DocumentCommand() override;

    /// Not counted: valid from dequeueing to the end of `Notify`, and again while it stands in the document's history.
    [[nodiscard]] Kernel::NonCounted<DocumentController> GetDocument() const { return m_Document; }

private:
    static Kernel::ClassProperties const ms_ClassProperties;

    Kernel::NonCounted<DocumentController> m_Document;
};
