#pragma once

#include "app/BookSession.h"
#include "app/Json.h"
#include "app/Verbs.h"

#include <filesystem>
#include <functional>

namespace App
{

/// What a verb that changes one book works with, while `EditBook` has the book open.
class BookEdit
{
public:
    using ChapterPtr = Kernel::Counted<Book::BookChapter const>;

    BookEdit(BookSession & session, Listener & listener, std::filesystem::path file)
        : m_Session(session),
          m_Listener(listener),
          m_File(std::move(file))
    {
    }

    /// The chapter that the user calls so, or null with an error.
    [[nodiscard]] ChapterPtr Find(std::string const & chapter);
    /// The same for several: each once, in the order in which they were named. Empty after an error.
    [[nodiscard]] BookSession::ChapterList Find(std::vector<std::string> const & chapters);
    /// An error about the book.
    void Error(char const * kind, std::string const & text);
    /// The full path of a document that may become a chapter; empty with an error if it can't.
    [[nodiscard]] std::string CheckDocument(std::string const & file);
    /// A line for people.
    void Say(std::string const & line) { m_Lines.push_back(line); }
    /// "3. The storm"
    [[nodiscard]] std::string Describe(ChapterPtr const & chapter) const;

    BookSession & m_Session;
    Listener & m_Listener;
    /// The book's file.
    std::filesystem::path m_File;
    Import::MessageList m_Messages;
    std::vector<std::string> m_Lines;
    /// What the verb adds to the JSON result.
    Json m_Result = Json::object();
};

/// What becomes of the book's file once a verb has done its change.
enum class Saving
{
    /// Saved if the book says that it has changes.
    IfDirty,
    /// Saved in any case: the change is one that a book does not count as unsaved work.
    Always,
    /// This file is only read: what is written, if anything, is another one.
    Never
};

/// What happens after the change itself.
struct EditPlan
{
    Saving m_Saving = Saving::IfDirty;
    /// Numbers of pages, lists and notes run on through the changed list.
    bool m_Renumbers = false;
};

/// Locks and opens the book in `file`, does `change`, renumbers, saves, closes, and tells the user. If `change` or the
/// commands that it ran leave an error, the book's file stays as it was. Gives the exit code.
int EditBook(VerbContext & context, std::string const & file, EditPlan plan,
             std::function<void(BookEdit &)> const & change);

/// The same for a book that is made anew in `file`, which must not exist.
int MakeBook(VerbContext & context, std::string const & file, EditPlan plan,
             std::function<void(BookEdit &)> const & change);

/// What a verb does about a file that is there already.
enum class Existing
{
    Refuse,
    /// Refuse, and name the option --force as the remedy.
    RefuseUnlessForced,
    Replace
};

/// The full path of a book's file to be written, with ".kvbook" where the user named no extension. Empty, with an error
/// that names the remedy, if the folder is missing, or something stands in the way.
[[nodiscard]] std::filesystem::path CheckTarget(std::string const & file, Existing existing,
                                                Import::MessageList & messages);

}
