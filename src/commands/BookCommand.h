#pragma once

#include "core/BookController.h"
#include "framework/kernel/ClassProperties.h"
#include "framework/kernel/CommandCoverage.h"
#include "framework/kernel/DomainCommand.h"
#include "framework/kernel/Serialisable.h"

namespace Book
{

/// Base of everything that is done to a book, or on its behalf, on its queue.
///
/// Built on any thread with all that it needs, handed to `BookCollection::EnqueueCommand`, used once. `Do` and `Notify`
/// run on the thread that works the book's queue, under the book's writer lock. A book command cannot be undone and
/// does not stack: what it changed is final. It does not make the book unsaved either: that is the business of the
/// operations that it calls. Commands are no data: written into a stream they leave no trace.
class BookCommand : public DomainCommand, public Kernel::Serialisable
{
public:
    void Undo() override {}
    void Redo() override {}
    [[nodiscard]] Kernel::Counted<const DomainController> GetDomainController() const override;
    [[nodiscard]] Kernel::Counted<DomainController> GetDomainController() override;
    void PostDequeueWithMutableDomainController(Kernel::NonCounted<DomainController> controller) override;
    void DoAndUpdateCaches() override { Do(); }
    void UndoAndUpdateCaches() override {}
    void RedoAndUpdateCaches() override {}
    void NotifyWithCacheUpdates(std::vector<Kernel::Counted<Kernel::Notification>> & notifications) override
    {
        Notify(notifications);
    }
    [[nodiscard]] bool ShouldStackForUndo() const override { return false; }
    /// Sets the book, as dequeueing does.
    virtual void PostLoad(Kernel::NonCounted<BookController> book);

    /// Nothing to say, unless a command has.
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications) override;
    void Save(Kernel::OutSerialiser & out) const override;
    bool Load(Kernel::InSerialiser const & in, Kernel::FileStore & store, unsigned short version) override;

    /// The book whose queue has taken the command; null before, and where that was no book.
    [[nodiscard]] Kernel::Counted<BookController> GetBookController();
    [[nodiscard]] Kernel::Counted<BookController const> GetBookController() const;

    [[nodiscard]] Kernel::ClassProperties const & GetObjectClassProperties() const override;
    static Kernel::ClassProperties const & GetTypeClassProperties();

protected:
    /// A notification of the family, with its book in front of its own arguments.
    template <typename TNotification, typename... TArguments>
    void Tell(std::vector<Kernel::Counted<Kernel::Notification>> & notifications, TArguments &&... arguments) const
    {
        notifications.push_back(
            Kernel::MakeCounted<TNotification>(GetBookController(), std::forward<TArguments>(arguments)...));
    }

private:
    static Kernel::ClassProperties const ms_ClassProperties;

    /// Not counted: the queue that runs the command keeps its book.
    BookController * m_BookController = nullptr;
};

}

/// In the body of a command class that streams can name, behind its public part. Its default constructor is protected:
/// only `CreateObject` makes an empty command.
#define KORVANE_BOOK_COMMAND(Class)                                                                                    \
public:                                                                                                                \
    [[nodiscard]] Kernel::ClassProperties const & GetObjectClassProperties() const override;                           \
    static Kernel::ClassProperties const & GetTypeClassProperties();                                                   \
    static Kernel::Counted<Kernel::Serialisable> CreateObject();                                                       \
                                                                                                                       \
private:                                                                                                               \
    static Kernel::ClassProperties const ms_ClassProperties

/// In its source, inside namespace Book: its description for streams, and its place in the list of command names.
#define KORVANE_DEFINE_BOOK_COMMAND(Class, uid)                                                                        \
    Kernel::ClassProperties const Class::ms_ClassProperties(Kernel::ClassUID(uid), &Class::CreateObject, 1, {},        \
                                                            &BookCommand::GetTypeClassProperties());                   \
    Kernel::ClassProperties const & Class::GetObjectClassProperties() const                                            \
    {                                                                                                                  \
        return ms_ClassProperties;                                                                                     \
    }                                                                                                                  \
    Kernel::ClassProperties const & Class::GetTypeClassProperties()                                                    \
    {                                                                                                                  \
        return ms_ClassProperties;                                                                                     \
    }                                                                                                                  \
    Kernel::Counted<Kernel::Serialisable> Class::CreateObject()                                                        \
    {                                                                                                                  \
        return Kernel::Counted<Kernel::Serialisable>(new Class);                                                       \
    }                                                                                                                  \
    static Kernel::ClassPropertiesBase::Init const s_##Class##Init(Class::GetTypeClassProperties());                   \
    static const bool s_##Class##Covered = (CommandCoverage::Instance().Register(typeid(Class), "Book::" #Class), true)
