#include "app/BookFileLock.h"
#include "app/Interruption.h"
#include "app/Json.h"
#include "app/VerbList.h"
#include "import/Importer.h"
#include "import/Text.h"

namespace App
{

namespace fs = std::filesystem;
using Import::Text;

namespace
{

struct ImportOptions
{
    std::vector<std::string> m_Sources;
    std::string m_Output;
    std::string m_Template;
};

/// A plan of single files, in the order in which they were named.
std::optional<Import::BookPlan> PlanFiles(std::vector<std::string> const & sources, Import::MessageList & messages)
{
    Import::BookPlan plan;
    plan.m_HasTitlePage = false;
    std::error_code error;
    plan.m_Folder = fs::absolute(sources.front(), error).lexically_normal().parent_path();
    for (std::string const & source : sources) {
        fs::path const path = fs::absolute(source, error).lexically_normal();
        if (fs::is_directory(path, error)) {
            messages.Error("source", {source},
                           Text("A folder has to be the only source; name files otherwise.", "Program"));
        } else {
            Import::AddChapter(plan, path.string(), {source}, messages);
        }
    }
    if (plan.m_Chapters.empty()) {
        return std::nullopt;
    }
    return plan;
}

int RunImport(VerbContext & context, ImportOptions const & options)
{
    Import::MessageList messages;
    std::error_code error;
    bool const isFolder = 1 == options.m_Sources.size() && fs::is_directory(options.m_Sources.front(), error);
    auto const plan =
        isFolder ? Import::ReadBookPlan(options.m_Sources.front(), messages) : PlanFiles(options.m_Sources, messages);
    std::optional<Import::Template> look;
    if (plan) {
        std::string const name = !options.m_Template.empty() ? options.m_Template
                                 : plan->m_Template.empty()  ? "novel"
                                                             : plan->m_Template;
        auto const path =
            Import::FindTemplate(name, options.m_Template.empty() ? plan->m_Folder : fs::current_path(error), messages);
        look = path ? Import::ReadTemplate(*path, messages) : std::nullopt;
    }

    std::vector<Import::ImportedChapter> chapters;
    bool isGood = plan && look;
    if (isGood) {
        fs::path const work = options.m_Output.empty() ? plan->m_Folder / ".korvane"
                                                       : fs::absolute(options.m_Output, error).lexically_normal();
        fs::create_directories(work, error);
        BookFileLock lock;
        std::string problem;
        if (lock.Take(work / "book.kvbook", problem)) {
            Import::Importer importer(*plan, *look, work, Interruption::Flag());
            importer.SetPasswords([&context](std::string const & source, bool isWrong) {
                return context.m_Answers.m_Passwords->Find(source, isWrong);
            });
            isGood = importer.Run(chapters, messages, [&](int done, int all) {
                context.m_Console.Progress(Text("Importing chapters", "Program"), static_cast<double>(done) / all);
            });
        } else {
            messages.Error("work-folder", {work.string()}, problem);
        }
    }
    if (Interruption::IsRaised()) {
        messages.Error("interrupted", {}, Text("Interrupted; documents that were finished stay.", "Program"));
    }
    isGood = isGood && !messages.HasErrors();

    Console & console = context.m_Console;
    console.EndProgress();
    if (console.Settings().m_IsJson) {
        Json list = Json::array();
        for (Import::ImportedChapter const & chapter : chapters) {
            list.push_back({{"source", chapter.m_Name},
                            {"title", chapter.m_Title},
                            {"document", chapter.m_Document.string()},
                            {"imported", chapter.m_IsFresh}});
        }
        console.SayResult(Print({{"ok", isGood}, {"chapters", list}, {"messages", ToJson(messages)}}));
    }
    console.Tell(messages);
    for (Import::ImportedChapter const & chapter : chapters) {
        console.Say(chapter.m_IsFresh ? chapter.m_Document.string()
                                      : Text("%1 (unchanged)", "Program", chapter.m_Document.string()));
    }
    return isGood ? ExitFine : ExitFailed;
}

}

void AddImportVerb(VerbList & verbs)
{
    auto const options = std::make_shared<ImportOptions>();
    CLI::App & verb = verbs.Add("import", Text("Make chapter documents (.kvdoc) of Markdown", "Help"),
                                "  korvane import chapter1.md chapter2.md -o documents",
                                [options](VerbContext & context) { return RunImport(context, *options); });
    verb.add_option("SOURCE", options->m_Sources, Text("Markdown files, or one folder", "Help"))->required();
    verb.add_option("-o,--output", options->m_Output,
                    Text("Folder for the documents; by default .korvane beside the first source", "Help"))
        ->type_name("DIR");
    verb.add_option("--template", options->m_Template, Text("Template by name or a .toml file", "Help"))
        ->type_name("NAME|FILE");
    verbs.AddPasswords(verb);
}

}
