#include "app/BookEdit.h"
#include "app/VerbList.h"
#include "commands/AddChapterCommand.h"
#include "commands/ReplaceChapterCommand.h"
#include "core/BookChapter.h"
#include "import/Text.h"

#include <algorithm>

namespace App
{

using Import::Text;

namespace
{

struct NewOptions
{
    std::string m_Book;
    std::vector<std::string> m_Files;
};

struct AddOptions
{
    std::string m_Book;
    std::vector<std::string> m_Files;
    std::string m_Before;
};

struct ReplaceOptions
{
    std::string m_Book;
    std::string m_Chapter;
    std::string m_File;
};

/// Full paths of all files, or none with an error for each that can't become a chapter.
std::vector<String> CheckDocuments(BookEdit & edit, std::vector<std::string> const & files)
{
    std::vector<String> paths;
    for (std::string const & file : files) {
        String const path(edit.CheckDocument(file));
        if (!path.Empty() && paths.end() != std::find(paths.begin(), paths.end(), path)) {
            edit.m_Messages.Error("chapter-twice", {file}, Text("This file is named twice.", "Program"));
        }
        paths.push_back(path);
    }
    return edit.m_Messages.HasErrors() ? std::vector<String>() : paths;
}

/// A file of an older version stays out of the book if the answer to the question was no.
void TellWhatStayedOut(BookEdit & edit, std::vector<String> const & paths)
{
    Import::MessageList const heard = edit.m_Listener.TakeMessages();
    edit.m_Messages.Append(heard);
    auto const isUnanswered = [](Import::Message const & message) { return "unanswered" == message.m_Kind; };
    bool const wasRefused = std::none_of(heard.All().begin(), heard.All().end(), isUnanswered);
    for (String const & path : paths) {
        if (!edit.m_Session.GetBook()->ContainsChapter(path)) {
            edit.m_Messages.Add(wasRefused ? Import::Severity::Warning : Import::Severity::Error, "chapter-left-out",
                                {path.ToStd()}, Text("The document was left out of the book.", "Program"));
        }
    }
}

/// The book itself takes in what it can't open, as it may become readable one day; its user meant a whole document.
void RefuseUnusable(BookEdit & edit, BookEdit::ChapterPtr const & chapter)
{
    if (!chapter->IsValid()) {
        edit.m_Messages.Error("chapter-unusable", {chapter->GetPath().ToStd()},
                              Text("The document cannot be used (%1), so the book is as it was.", "Program",
                                   chapter->GetStatusDescription()));
    }
}

void AddDocuments(BookEdit & edit, std::vector<std::string> const & files, std::string const & before)
{
    BookEdit::ChapterPtr const next = before.empty() ? nullptr : edit.Find(before);
    std::vector<String> const paths = CheckDocuments(edit, files);
    if (edit.m_Messages.HasErrors() || paths.empty()) {
        return;
    }
    edit.m_Session.Run(Kernel::MakeCounted<Book::AddChapterCommand>(paths, next));
    edit.m_Session.WaitForRest();
    TellWhatStayedOut(edit, paths);
    for (auto const & chapter : edit.m_Session.GetChapters()) {
        if (paths.end() != std::find(paths.begin(), paths.end(), chapter->GetPath())) {
            RefuseUnusable(edit, chapter);
            edit.Say(Text("Added chapter %1.", "Program", edit.Describe(chapter)));
        }
    }
}

void ReplaceDocument(BookEdit & edit, ReplaceOptions const & options)
{
    BookEdit::ChapterPtr const old = edit.Find(options.m_Chapter);
    std::string const path = edit.CheckDocument(options.m_File);
    if (!old || path.empty()) {
        return;
    }
    std::string const was = edit.Describe(old);
    int const start = old->GetStartFromPage();
    edit.m_Session.Run(Kernel::MakeCounted<Book::ReplaceChapterCommand>(old, String(path)));
    edit.m_Session.WaitForRest();
    BookEdit::ChapterPtr const chapter = edit.m_Session.GetBook()->GetChapterFromPath(String(path));
    if (!chapter) {
        return;
    }
    RefuseUnusable(edit, chapter);
    edit.Say(Text("Chapter %1 is now the document %2.", "Program", was, path));
    if (0 != start && start != chapter->GetStartFromPage()) {
        std::string const number = std::to_string(edit.m_Session.GetBook()->IndexFromChapter(chapter) + 1);
        edit.m_Messages.Note("start-page", {edit.m_File.string()},
                             Text("The chapter started at page %1 and now goes on from the one before; \"korvane "
                                  "start-page\" with chapter %2 and that number sets it again.",
                                  "Program", start, number));
    }
}

}

void AddNewVerb(VerbList & verbs)
{
    auto const options = std::make_shared<NewOptions>();
    CLI::App & verb =
        verbs.Add("new", Text("Make a book file", "Help"), "  korvane new lighthouse.kvbook arrival.kvdoc storm.kvdoc",
                  [options](VerbContext & context) {
                      return MakeBook(context, options->m_Book, {Saving::Always, true}, [&](BookEdit & edit) {
                          edit.Say(Text("Made %1.", "Program", edit.m_File.string()));
                          AddDocuments(edit, options->m_Files, {});
                      });
                  });
    verb.add_option("BOOK", options->m_Book, Text("The book file to make", "Help"))->required();
    verb.add_option("FILE", options->m_Files, Text("Documents (.kvdoc) that become its chapters", "Help"));
    verbs.AddAnswers(verb);
}

void AddAddVerb(VerbList & verbs)
{
    auto const options = std::make_shared<AddOptions>();
    CLI::App & verb =
        verbs.Add("add", Text("Add documents to a book as chapters", "Help"),
                  "  korvane add lighthouse.kvbook prologue.kvdoc --before 1", [options](VerbContext & context) {
                      return EditBook(context, options->m_Book, {Saving::IfDirty, true}, [&](BookEdit & edit) {
                          AddDocuments(edit, options->m_Files, options->m_Before);
                      });
                  });
    verb.add_option("BOOK", options->m_Book, Text("The book file", "Help"))->required();
    verb.add_option("FILE", options->m_Files, Text("Documents (.kvdoc), in their order", "Help"))->required();
    verb.add_option("--before", options->m_Before,
                    Text("The chapter in front of which they go, by number, file or name; by default the end", "Help"))
        ->type_name(Text("CHAPTER", "Help"));
    verbs.AddAnswers(verb);
}

void AddReplaceVerb(VerbList & verbs)
{
    auto const options = std::make_shared<ReplaceOptions>();
    CLI::App & verb =
        verbs.Add("replace", Text("Put another document in the place of a chapter", "Help"),
                  "  korvane replace lighthouse.kvbook 3 storm-revised.kvdoc", [options](VerbContext & context) {
                      return EditBook(context, options->m_Book, {Saving::IfDirty, true},
                                      [&](BookEdit & edit) { ReplaceDocument(edit, *options); });
                  });
    verb.add_option("BOOK", options->m_Book, Text("The book file", "Help"))->required();
    verb.add_option("CHAPTER", options->m_Chapter, Text("The chapter, by number, file or name", "Help"))->required();
    verb.add_option("FILE", options->m_File, Text("The document (.kvdoc) that takes its place", "Help"))->required();
    verbs.AddAnswers(verb);
}

}
