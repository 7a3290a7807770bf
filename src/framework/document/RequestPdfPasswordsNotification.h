#pragma once

#include "framework/document/DocumentNotification.h"
#include "framework/kernel/Question.h"
#include "framework/kernel/StringT.h"

#include <functional>
#include <map>
#include <set>

namespace Kernel
{
class DataSource;
}

/// Asks the user for the passwords of placed files. The front end keeps the notification while it asks, then calls
/// `Answer`.
class RequestPdfPasswordsNotification : public DocumentNotification
{
public:
    using Sources = std::set<Kernel::Counted<Kernel::DataSource const>>;
    using Passwords = std::map<Kernel::Counted<Kernel::DataSource const>, String>;

    /// \param answer called exactly once, as a turn of the document's queue under its writer lock, with what was
    ///        entered; with an empty map if nothing was
    RequestPdfPasswordsNotification(Sources const & sources, Kernel::Counted<DocumentController const> document,
                                    std::function<void(Passwords const &)> answer);

    [[nodiscard]] Sources const & GetSources() const { return m_Sources; }

    /// For whom the document is opened: if that closes, nobody needs the passwords any more, and the question answers
    /// itself. Before it is sent.
    void EndWith(Kernel::Counted<DomainController> const & asker) const { m_Question.EndWith(asker); }

    /// What the user entered. Safe on any thread; false if the question was answered before.
    bool Answer(Passwords const & passwords) const;

    [[nodiscard]] bool MustProcessWithoutBookLock() const override { return true; }

protected:
    ~RequestPdfPasswordsNotification() override;
    void OnPassedEveryLine() override;

private:
    Sources const m_Sources;
    std::function<void(Passwords const &)> const m_Answer;
    Kernel::Question m_Question;
};
