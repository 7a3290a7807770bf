#pragma once

#include "app/BookSession.h"
#include "app/FileSight.h"

namespace App
{

/// Keeps an open book true to its files, and tells of each chapter that changes. The files are looked at from outside,
/// which is cheap; where something has moved, the book's own pass over its chapters does the work.
///
/// For the program's main thread.
class BookWatch
{
public:
    /// \param renumbers pages run on anew through the book when a chapter's have changed, and the book is saved
    BookWatch(Console & console, BookSession & session, Listener & listener, bool renumbers);

    /// Looks at everything, and tells of every chapter.
    void Begin();
    /// Tells of what has changed since the last look. False if nothing has.
    bool Look();

private:
    /// What a line tells of a chapter.
    struct State
    {
        Book::BookChapter::Status m_Status = Book::BookChapter::Status::Ok;
        std::string m_Pages;
        int m_PageCount = 0;

        friend bool operator==(State const &, State const &) = default;
    };

    [[nodiscard]] std::vector<FileSight> LookAtFiles() const;
    [[nodiscard]] std::vector<State> ReadStates() const;
    /// The book's pass, and the numbers if they are wanted.
    void Refresh();
    /// Tells of those chapters whose state is another one than before; of all where there was none.
    void Tell(std::vector<State> const & before, std::vector<State> const & now);
    void TellChapter(std::size_t index, State const * before, State const & now);
    void TellMessages(Import::MessageList const & messages);

    Console & m_Console;
    BookSession & m_Session;
    Listener & m_Listener;
    bool const m_Renumbers;
    std::vector<FileSight> m_Files;
    std::vector<State> m_States;
};

}
