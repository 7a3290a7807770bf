#include "app/BookExport.h"
#include "app/FileCheck.h"
#include "app/Interruption.h"
#include "app/Json.h"
#include "app/VerbList.h"
#include "core/BookChapter.h"
#include "framework/document/DocumentMetadata.h"
#include "import/Text.h"

namespace App
{

namespace fs = std::filesystem;
using Import::Text;

namespace
{

struct ExportOptions
{
    std::string m_Book;
    std::string m_Output;
    bool m_HasMarks = false;
    bool m_IncludesBleed = false;
    bool m_SkipsUpdates = false;
    long long m_FixedTime = -1;
};

/// The language of the first chapter that names one.
std::string LanguageOf(BookSession const & session)
{
    for (auto const & chapter : session.GetChapters()) {
        auto const metadata = chapter->GetMetadata();
        if (metadata && !metadata->GetLanguage().Empty()) {
            return metadata->GetLanguage().ToStd();
        }
    }
    return {};
}

int RunExport(VerbContext & context, ExportOptions const & options)
{
    Import::MessageList messages;
    fs::path const book = FullPath(options.m_Book);
    fs::path const target = FullPath(options.m_Output);
    BookFileLock lock;
    int pages = 0;
    bool isGood = false;
    if (CheckOutput(target, OutputKind::Pdf, messages) && ClaimBook(options.m_Book, options.m_SkipsUpdates, lock, messages)) {
        Listener listener(context.m_Console, context.m_Ask, context.m_Answers);
        BookSession session(context.m_Console, listener);
        isGood = session.OpenUsable(book.string(), messages);
        if (isGood && session.GetChapters().empty()) {
            messages.Error("book-empty", {options.m_Book},
                           Text("The book has no chapters, so there is nothing to write.", "Program"));
            isGood = false;
        }
        if (isGood && !options.m_SkipsUpdates) {
            session.Update(messages);
            isGood = session.Save(book.string(), messages);
        }
        if (isGood && !Interruption::IsRaised()) {
            PdfWishes wishes;
            if (options.m_HasMarks) {
                wishes.m_HasMarks = true;
            }
            if (options.m_IncludesBleed) {
                wishes.m_IncludesBleed = true;
            }
            wishes.m_Language = LanguageOf(session);
            wishes.m_FixedTime = options.m_FixedTime;
            isGood = ExportBook(session, listener, target, wishes, messages);
            for (auto const & chapter : session.GetChapters()) {
                pages += chapter->GetExportingPageCount();
            }
        }
        messages.Append(listener.TakeMessages());
    }
    if (Interruption::IsRaised() && !messages.HasErrors()) {
        messages.Error("interrupted", {}, Text("Interrupted; the PDF was not written.", "Program"));
    }
    isGood = isGood && !messages.HasErrors();

    Console & console = context.m_Console;
    console.EndProgress();
    if (console.Settings().m_IsJson) {
        console.SayResult(Print({{"ok", isGood},
                                 {"output", target.string()},
                                 {"book", book.string()},
                                 {"pages", pages},
                                 {"messages", ToJson(messages)}}));
    }
    console.Tell(messages);
    if (isGood) {
        console.Say(Import::CountText("Wrote %2: %1 page", "Wrote %2: %1 pages", "Program", pages, target.string()));
    }
    return isGood ? ExitFine : ExitFailed;
}

}

void AddExportVerb(VerbList & verbs)
{
    auto const options = std::make_shared<ExportOptions>();
    CLI::App & verb = verbs.Add("export", Text("Write a book (.kvbook) into a PDF", "Help"),
                                "  korvane export my-book/.korvane/book.kvbook -o print.pdf --marks",
                                [options](VerbContext & context) { return RunExport(context, *options); });
    verb.add_option("BOOK", options->m_Book, Text("The book file", "Help"))->required();
    verb.add_option("-o,--output", options->m_Output, Text("The PDF", "Help"))->required()->type_name("OUT.pdf");
    verb.add_flag("--marks", options->m_HasMarks, Text("Crop marks round each page, with the bleed", "Help"));
    verb.add_flag("--bleed", options->m_IncludesBleed, Text("Include the bleed", "Help"));
    verb.add_flag("--no-update", options->m_SkipsUpdates, Text("Leave numbers and references as they are", "Help"));
    verbs.AddFixedTime(verb, options->m_FixedTime);
    verbs.AddAnswers(verb);
}

}
