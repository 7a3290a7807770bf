#include "app/BookEdit.h"
#include "app/VerbList.h"
#include "commands/DeleteChaptersCommand.h"
#include "commands/MoveChaptersCommand.h"
#include "commands/SetKeyChapterCommand.h"
#include "commands/UpdateChapterSettingsCommand.h"
#include "core/BookChapter.h"
#include "import/Text.h"

#include <algorithm>
#include <charconv>

namespace App
{

using Import::Text;

namespace
{

/// More pages than a reader could turn; numbers beyond it are slips of the finger.
constexpr int g_HighestPage = 999'999;

struct ChapterOptions
{
    std::string m_Book;
    std::vector<std::string> m_Chapters;
    std::string m_Before;
    bool m_GoesToEnd = false;
};

struct StartOptions
{
    std::string m_Book;
    std::string m_Chapter;
    std::string m_Start;
};

void RemoveChapters(BookEdit & edit, ChapterOptions const & options)
{
    auto const chapters = edit.Find(options.m_Chapters);
    if (chapters.empty()) {
        return;
    }
    for (auto const & chapter : chapters) {
        edit.Say(Text("Took chapter %1 out of the book; its document stays in %2.", "Program", edit.Describe(chapter),
                      chapter->GetPath()));
    }
    edit.m_Session.Run(Kernel::MakeCounted<Book::DeleteChaptersCommand>(chapters));
}

void MoveChapters(BookEdit & edit, ChapterOptions const & options)
{
    auto const chapters = edit.Find(options.m_Chapters);
    BookEdit::ChapterPtr before = options.m_GoesToEnd ? nullptr : edit.Find(options.m_Before);
    if (chapters.empty() || edit.m_Messages.HasErrors()) {
        return;
    }
    // In front of one that moves itself means in front of the next that stays.
    auto const moves = [&](BookEdit::ChapterPtr const & chapter) {
        return chapters.end() != std::find(chapters.begin(), chapters.end(), chapter);
    };
    while (before && moves(before)) {
        before = edit.m_Session.GetBook()->GetNextChapter(before);
    }
    edit.m_Session.Run(Kernel::MakeCounted<Book::MoveChaptersCommand>(before, chapters));
    for (auto const & chapter : chapters) {
        edit.Say(Text("Moved; it is now chapter %1.", "Program", edit.Describe(chapter)));
    }
}

void SetKeyChapter(BookEdit & edit, ChapterOptions const & options)
{
    BookEdit::ChapterPtr const chapter = edit.Find(options.m_Chapters.front());
    if (!chapter) {
        return;
    }
    edit.m_Session.Run(Kernel::MakeCounted<Book::SetKeyChapterCommand>(chapter));
    edit.Say(Text("Chapter %1 is now the book's style source.", "Program", edit.Describe(chapter)));
    if (!chapter->IsValid()) {
        edit.m_Messages.Warn("chapter-unusable", {chapter->GetPath().ToStd()},
                             Text("Its document cannot be used now (%1); until it can, the first usable chapter stands "
                                  "in for it.",
                                  "Program", chapter->GetStatusDescription()));
    }
}

/// 0 for "continue", -1 for what is neither that nor a page number.
int ReadStart(std::string const & text)
{
    if ("continue" == text) {
        return 0;
    }
    int page = 0;
    auto const [end, error] = std::from_chars(text.data(), text.data() + text.size(), page);
    if (std::errc() == error && end == text.data() + text.size() && 1 <= page && page <= g_HighestPage) {
        return page;
    }
    return -1;
}

std::string CheckStart(std::string const & text)
{
    return 0 <= ReadStart(text) ? std::string()
                                : Text("\"%1\" is no page to start at: give \"continue\", or a number from 1 to %2.",
                                       "Program", text, g_HighestPage);
}

void SetStartPage(BookEdit & edit, StartOptions const & options)
{
    BookEdit::ChapterPtr const chapter = edit.Find(options.m_Chapter);
    if (!chapter) {
        return;
    }
    int const start = ReadStart(options.m_Start);
    edit.m_Session.Run(Kernel::MakeCounted<Book::UpdateChapterSettingsCommand>(chapter, 0 == start, start));
    edit.Say(0 == start ? Text("Chapter %1 now goes on from the chapter before.", "Program", edit.Describe(chapter))
                        : Text("Chapter %1 now starts at page %2.", "Program", edit.Describe(chapter), start));
}

void AddChapterArguments(CLI::App & verb, ChapterOptions & options)
{
    verb.add_option("BOOK", options.m_Book, Text("The book file", "Help"))->required();
    verb.add_option("CHAPTER", options.m_Chapters, Text("Chapters, by number, file or name", "Help"))->required();
}

}

void AddRemoveVerb(VerbList & verbs)
{
    auto const options = std::make_shared<ChapterOptions>();
    CLI::App & verb =
        verbs.Add("remove", Text("Take chapters out of a book; their documents stay", "Help"),
                  "  korvane remove lighthouse.kvbook 4 appendix.kvdoc", [options](VerbContext & context) {
                      return EditBook(context, options->m_Book, {Saving::IfDirty, true},
                                      [&](BookEdit & edit) { RemoveChapters(edit, *options); });
                  });
    AddChapterArguments(verb, *options);
}

void AddMoveVerb(VerbList & verbs)
{
    auto const options = std::make_shared<ChapterOptions>();
    CLI::App & verb = verbs.Add("move", Text("Move chapters to another place in a book", "Help"),
                                "  korvane move lighthouse.kvbook 5 6 --before 2", [options](VerbContext & context) {
                                    return EditBook(context, options->m_Book, {Saving::IfDirty, true},
                                                    [&](BookEdit & edit) { MoveChapters(edit, *options); });
                                });
    AddChapterArguments(verb, *options);
    CLI::Option_group & place = *verb.add_option_group(Text("Place", "Help"));
    place.add_option("--before", options->m_Before, Text("In front of this chapter, in the order given here", "Help"))
        ->type_name(Text("CHAPTER", "Help"));
    place.add_flag("--end", options->m_GoesToEnd, Text("To the end of the book", "Help"));
    place.require_option(1);
}

void AddKeyVerb(VerbList & verbs)
{
    auto const options = std::make_shared<ChapterOptions>();
    CLI::App & verb = verbs.Add("key", Text("Make a chapter the style source of its book", "Help"),
                                "  korvane key lighthouse.kvbook 2", [options](VerbContext & context) {
                                    return EditBook(context, options->m_Book, {Saving::IfDirty, false},
                                                    [&](BookEdit & edit) { SetKeyChapter(edit, *options); });
                                });
    verb.add_option("BOOK", options->m_Book, Text("The book file", "Help"))->required();
    verb.add_option("CHAPTER", options->m_Chapters, Text("The chapter, by number, file or name", "Help"))
        ->required()
        ->expected(1);
}

void AddStartPageVerb(VerbList & verbs)
{
    auto const options = std::make_shared<StartOptions>();
    CLI::App & verb = verbs.Add("start-page", Text("Set the page that a chapter starts at", "Help"),
                                "  korvane start-page lighthouse.kvbook 2 1\n"
                                "  korvane start-page lighthouse.kvbook 3 continue",
                                [options](VerbContext & context) {
                                    return EditBook(context, options->m_Book, {Saving::Always, true},
                                                    [&](BookEdit & edit) { SetStartPage(edit, *options); });
                                });
    verb.add_option("BOOK", options->m_Book, Text("The book file", "Help"))->required();
    verb.add_option("CHAPTER", options->m_Chapter, Text("The chapter, by number, file or name", "Help"))->required();
    verb.add_option("START", options->m_Start,
                    Text("A page number, or \"continue\" to go on from the chapter before", "Help"))
        ->required()
        ->check(&CheckStart);
}

}
