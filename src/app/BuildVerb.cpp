#include "app/BookExport.h"
#include "app/FileCheck.h"
#include "app/Interruption.h"
#include "app/Json.h"
#include "app/VerbList.h"
#include "import/SourceText.h"
#include "import/Text.h"

#include <algorithm>

namespace App
{

namespace fs = std::filesystem;
using Import::Text;

namespace
{

constexpr char const * g_BookName = "book.kvbook";
constexpr char const * g_DefaultTemplate = "novel";

struct BuildOptions
{
    fs::path m_Folder;
    /// Empty: what the manifest says, or FOLDER/NAME.pdf.
    std::string m_Output;
    std::string m_Template;
    std::string m_Work;
    bool m_IsForced = false;
    long long m_FixedTime = -1;
};

/// One run of `korvane build`: the plan, the import, the book and its PDF, in that order.
class Build
{
public:
    Build(VerbContext & context, BuildOptions const & options) : m_Context(context), m_Options(options) {}

    int Run()
    {
        bool const isGood = ReadPlan() && MakeWorkFolder() && RunLocked();
        if (Interruption::IsRaised() && !m_Messages.HasErrors()) {
            m_Messages.Error("interrupted", {}, Text("Interrupted; what was finished before stays.", "Program"));
        }
        return Report(isGood && !m_Messages.HasErrors());
    }

private:
    bool ReadPlan()
    {
        m_Plan = Import::ReadBookPlan(m_Options.m_Folder, m_Messages);
        if (!m_Plan) {
            return false;
        }
        std::string const wanted = !m_Options.m_Template.empty() ? m_Options.m_Template : m_Plan->m_Template;
        // A path on the command line starts from here, one in the manifest from its folder.
        std::error_code error;
        fs::path const base = m_Options.m_Template.empty() ? m_Plan->m_Folder : fs::current_path(error);
        auto const path = Import::FindTemplate(wanted.empty() ? g_DefaultTemplate : wanted, base, m_Messages);
        m_Look = path ? Import::ReadTemplate(*path, m_Messages) : std::nullopt;
        if (!m_Look) {
            return false;
        }
        m_Target = FindTarget();
        return CheckOutput(m_Target, OutputKind::Pdf, m_Messages);
    }

    fs::path FindTarget() const
    {
        if (!m_Options.m_Output.empty()) {
            return FullPath(m_Options.m_Output);
        }
        if (!m_Plan->m_OutputFile.empty()) {
            return (m_Plan->m_Folder / m_Plan->m_OutputFile).lexically_normal();
        }
        fs::path folder = m_Plan->m_Folder;
        folder = folder.filename().empty() ? folder.parent_path() : folder;
        return m_Plan->m_Folder / (folder.filename().string() + ".pdf");
    }

    bool MakeWorkFolder()
    {
        std::error_code error;
        m_Work = m_Options.m_Work.empty() ? m_Plan->m_Folder / ".korvane"
                                          : fs::absolute(m_Options.m_Work, error).lexically_normal();
        m_Book = m_Work / g_BookName;
        fs::create_directories(m_Work, error);
        if (!fs::is_directory(m_Work, error)) {
            m_Messages.Error("work-folder", {m_Work.string()},
                             Text("The work folder cannot be made; name another with --work.", "Program"));
            return false;
        }
        return true;
    }

    /// Hash of what the PDF depends on beside its chapters.
    std::uint64_t OutputFacts() const
    {
        std::string facts =
            m_Plan->m_Title + '\0' + m_Plan->m_Subtitle + '\0' + m_Plan->AuthorsAsText() + '\0' + m_Plan->m_Language;
        for (auto const & chapter : m_Plan->m_Chapters) {
            facts += '\0' + chapter.m_Name + '\0' + chapter.m_Title + '\0' + chapter.m_Part + '\0' + chapter.m_Number;
        }
        facts += m_Plan->m_HasMarks ? 'm' : '-';
        facts += m_Plan->m_IncludesBleed ? 'b' : '-';
        facts += m_Plan->m_EmbedsMetadata ? 'x' : '-';
        facts += m_Plan->m_HasTitlePage ? 't' : '-';
        facts += m_Plan->m_Smart ? 's' : '-';
        facts += std::to_string(m_Options.m_FixedTime);
        return Import::HashBytes(facts, m_Look->m_Hash);
    }

    bool RunLocked()
    {
        std::string problem;
        if (!m_Lock.Take(m_Book, problem)) {
            m_Messages.Error("book-locked", {m_Book.string()}, problem);
            return false;
        }
        Import::Importer importer(*m_Plan, *m_Look, m_Work, Interruption::Flag());
        importer.SetPasswords([this](std::string const & path, bool isWrong) {
            return m_Context.m_Answers.m_Passwords->Find(path, isWrong);
        });
        if (!m_Options.m_IsForced && !m_Messages.HasErrors() && IsOutputCurrent(importer.State()) &&
            importer.IsEverythingCurrent(m_Messages)) {
            m_IsUpToDate = true;
            m_Pages = importer.State().m_Pages;
            return true;
        }
        bool const isImported = importer.Run(m_Chapters, m_Messages, [this](int done, int all) {
            m_Context.m_Console.Progress(Text("Importing chapters", "Program"), static_cast<double>(done) / all);
        });
        if (!isImported || Interruption::IsRaised()) {
            return false;
        }
        if (std::none_of(m_Chapters.begin(), m_Chapters.end(),
                         [](auto const & chapter) { return !chapter.m_Name.empty(); })) {
            return false;
        }
        return IsTargetFree(importer.State()) && SetBook(importer);
    }

    /// False, with an error, if a chapter places the very file that the PDF would replace.
    bool IsTargetFree(Import::WorkState const & state)
    {
        std::error_code error;
        for (auto const & [name, chapter] : state.m_Chapters) {
            for (auto const & [picture, known] : chapter.m_Pictures) {
                if (fs::equivalent((m_Plan->m_Folder / name).parent_path() / picture, m_Target, error)) {
                    m_Messages.Error("target-same", {m_Target.string()},
                                     Text("The chapter %1 places this file, so the book cannot be written over it; name "
                                          "another output.",
                                          "Program", name));
                    return false;
                }
            }
        }
        return true;
    }

    bool IsOutputCurrent(Import::WorkState const & state) const
    {
        return state.m_OutputFacts == OutputFacts() && state.m_OutputFile == m_Target.string() &&
               state.m_OutputStamp.Exists() && state.m_OutputStamp == Import::FileStamp::Of(m_Target) &&
               state.m_BookStamp == Import::FileStamp::Of(m_Book);
    }

    bool SetBook(Import::Importer & importer)
    {
        bool isGood = false;
        {
            Listener listener(m_Context.m_Console, m_Context.m_Ask, m_Context.m_Answers);
            {
                BookSession session(m_Context.m_Console, listener);
                isGood = OpenBook(session) && MakeOutput(session, listener);
                if (session.IsOpen()) {
                    Count(session);
                }
            }
            m_Messages.Append(listener.TakeMessages());
        }
        if (isGood && !m_Messages.HasErrors()) {
            Remember(importer.State());
        }
        return isGood;
    }

    bool OpenBook(BookSession & session)
    {
        std::error_code error;
        if (fs::exists(m_Book, error)) {
            Import::MessageList trouble;
            if (session.Open(m_Book.string(), trouble)) {
                return true;
            }
            // The book of a work folder holds nothing that the sources do not say.
            for (Import::Message const & message : trouble.All()) {
                m_Messages.Warn(message.m_Kind, message.m_Place,
                                message.m_Text + " " + Text("The book is made anew.", "Program"));
            }
            if (!fs::remove(m_Book, error)) {
                m_Messages.Error("book-unreadable", {m_Book.string()},
                                 Text("The damaged book cannot be removed: %1.", "Program", error.message()));
                return false;
            }
        }
        session.Create();
        return session.IsOpen();
    }

    bool MakeOutput(BookSession & session, Listener & listener)
    {
        session.MatchChapters(m_Chapters, m_Plan->m_HasTitlePage);
        session.RefreshChapters();
        session.ReportUnusable(m_Messages);
        if (Interruption::IsRaised()) {
            return false;
        }
        m_Passes = session.Update(m_Messages);
        m_Messages.Append(listener.TakeMessages());
        if (Interruption::IsRaised() || !session.Save(m_Book.string(), m_Messages)) {
            return false;
        }
        PdfWishes wishes;
        wishes.m_HasMarks = m_Plan->m_HasMarks;
        wishes.m_IncludesBleed = m_Plan->m_IncludesBleed;
        wishes.m_EmbedsMetadata = m_Plan->m_EmbedsMetadata;
        wishes.m_Language = m_Plan->m_Language;
        wishes.m_FixedTime = m_Options.m_FixedTime;
        m_IsWritten = ExportBook(session, listener, m_Target, wishes, m_Messages);
        return m_IsWritten;
    }

    void Count(BookSession const & session)
    {
        m_Pages = 0;
        for (auto const & chapter : session.GetChapters()) {
            m_Pages += chapter->GetPageCount();
            m_PageCounts[chapter->GetPath().ToStd()] = {chapter->GetCachedStartPage(), chapter->GetPageCount()};
        }
    }

    void Remember(Import::WorkState & state)
    {
        state.m_OutputFacts = OutputFacts();
        state.m_OutputFile = m_Target.string();
        state.m_OutputStamp = Import::FileStamp::Of(m_Target);
        state.m_BookStamp = Import::FileStamp::Of(m_Book);
        state.m_Pages = m_Pages;
        for (auto & [name, chapter] : state.m_Chapters) {
            chapter.m_DocumentStamp = Import::FileStamp::Of(m_Work / chapter.m_Document);
        }
        std::string problem;
        if (!state.Save(m_Work, problem)) {
            m_Messages.Warn("work-folder", {m_Work.string()},
                            Text("The work folder's memory could not be written (%1); the next run takes longer.",
                                 "Program", problem));
        }
    }

    int Report(bool isGood)
    {
        Console & console = m_Context.m_Console;
        console.EndProgress();
        if (console.Settings().m_IsJson) {
            Json chapters = Json::array();
            for (Import::ImportedChapter const & chapter : m_Chapters) {
                auto const & [start, count] = m_PageCounts[chapter.m_Document.string()];
                chapters.push_back({{"source", chapter.m_Name},
                                    {"title", chapter.m_Title},
                                    {"document", chapter.m_Document.string()},
                                    {"imported", chapter.m_IsFresh},
                                    {"startPage", start},
                                    {"pageCount", count}});
            }
            console.SayResult(Print({{"ok", isGood},
                                     {"upToDate", m_IsUpToDate},
                                     {"output", m_Target.string()},
                                     {"book", m_Book.string()},
                                     {"pages", m_Pages},
                                     {"passes", m_Passes},
                                     {"chapters", chapters},
                                     {"messages", ToJson(m_Messages)}}));
        }
        console.Tell(m_Messages);
        if (m_IsUpToDate) {
            console.Say(Import::CountText("%2 is up to date (%1 page)", "%2 is up to date (%1 pages)", "Program",
                                          m_Pages, m_Target.string()));
        } else if (m_IsWritten) {
            auto const fresh = std::count_if(m_Chapters.begin(), m_Chapters.end(),
                                             [](auto const & chapter) { return chapter.m_IsFresh; });
            console.Say(
                Import::CountText("Wrote %2: %1 page", "Wrote %2: %1 pages", "Program", m_Pages, m_Target.string()) +
                ", " + Text("%1 of %2 documents made anew", "Program", fresh, m_Chapters.size()));
        }
        return isGood ? ExitFine : ExitFailed;
    }

    VerbContext & m_Context;
    BuildOptions const & m_Options;
    Import::MessageList m_Messages;
    std::optional<Import::BookPlan> m_Plan;
    std::optional<Import::Template> m_Look;
    fs::path m_Target;
    fs::path m_Work;
    fs::path m_Book;
    BookFileLock m_Lock;
    std::vector<Import::ImportedChapter> m_Chapters;
    std::map<std::string, std::pair<int, int>> m_PageCounts;
    int m_Pages = 0;
    int m_Passes = 0;
    bool m_IsUpToDate = false;
    bool m_IsWritten = false;
};

}

void AddBuildVerb(VerbList & verbs)
{
    auto const options = std::make_shared<BuildOptions>();
    CLI::App & verb = verbs.Add("build", Text("Set a folder of Markdown chapters into a PDF", "Help"),
                                "  korvane build docs/handbook -o handbook.pdf --template manual\n\n" +
                                    Text("A second run takes only what has changed. Work in progress can be stopped "
                                         "with Ctrl-C.",
                                         "Help"),
                                [options](VerbContext & context) { return Build(context, *options).Run(); });
    verb.add_option("FOLDER", options->m_Folder, Text("Folder with book.toml, SUMMARY.md or Markdown files", "Help"))
        ->required();
    verb.add_option("-o,--output", options->m_Output,
                    Text("The PDF; by default FOLDER/NAME.pdf, or what the manifest says", "Help"))
        ->type_name("OUT.pdf");
    verb.add_option("--template", options->m_Template,
                    Text("Template by name (novel, manual, report) or a .toml file", "Help"))
        ->type_name("NAME|FILE");
    verb.add_option("--work", options->m_Work,
                    Text("Folder for the documents in between; by default FOLDER/.korvane", "Help"))
        ->type_name("DIR");
    verb.add_flag("--force", options->m_IsForced, Text("Make the PDF anew even if nothing has changed", "Help"));
    verbs.AddFixedTime(verb, options->m_FixedTime);
    verbs.AddAnswers(verb);
}

}
