#include "app/BookSession.h"
#include "app/DescribeDocument.h"
#include "app/FileCheck.h"
#include "app/FileKind.h"
#include "app/PreviewFile.h"
#include "app/VerbList.h"
#include "core/BookChapter.h"
#include "framework/document/DocumentController.h"
#include "framework/document/OpenDocumentFailedNotification.h"
#include "framework/kernel/FileSystem.h"
#include "import/Text.h"

namespace App
{

namespace fs = std::filesystem;
using Import::Text;

namespace
{

Json DescribeBook(BookSession const & session, fs::path const & path)
{
    auto const & book = session.GetBook();
    auto const settings = book->GetSynchroniseSettings();
    Json chapters = Json::array();
    int index = 0;
    for (auto const & chapter : session.GetChapters()) {
        chapters.push_back({{"index", index++},
                            {"name", chapter->GetName().ToStd()},
                            {"path", chapter->GetPath().ToStd()},
                            {"key", chapter->IsKey()},
                            {"pages", chapter->DescribePages().ToStd()},
                            {"startFromPage", chapter->GetStartFromPage()}});
    }
    return {{"kind", "book"},
            {"path", path.string()},
            {"name", book->GetName(1, false).ToStd()},
            {"padStrays", book->IsPadStrays()},
            {"mergeStrays", book->IsMergeStrays()},
            {"synchronise",
             {{"swatches", settings.m_Swatches},
              {"textStyles", settings.m_TextStyles},
              {"tableStyles", settings.m_TableStyles},
              {"masterPages", settings.m_MasterPages}}},
            {"chapters", chapters}};
}

/// A few lines for people; the whole is in the JSON.
std::vector<std::string> Summarise(Json const & json)
{
    std::vector<std::string> lines;
    if ("book" == json.at("kind")) {
        lines.push_back(Import::CountText("Book %2, %1 chapter", "Book %2, %1 chapters", "Program",
                                          json.at("chapters").size(), json.at("name").get<std::string>()));
        for (Json const & chapter : json.at("chapters")) {
            lines.push_back("  " + std::to_string(chapter.at("index").get<int>() + 1) + "  " +
                            chapter.at("name").get<std::string>() +
                            (chapter.at("key").get<bool>() ? " " + Text("(style source)", "Program") : ""));
        }
        return lines;
    }
    Json const & metadata = json.at("metadata");
    lines.push_back(Text("Document \"%1\", language %2", "Program", metadata.at("title").get<std::string>(),
                         metadata.at("language").get<std::string>()));
    lines.push_back("  " + Text("pages: %1, spreads: %2, sections: %3, paragraph styles: %4", "Program",
                                json.at("pageCount").get<int>(), json.at("spreads").size(), json.at("sections").size(),
                                json.at("styles").at("paragraph").size()));
    for (Json const & section : json.at("sections")) {
        lines.push_back("  " +
                        Text("section at page index %1, number %2", "Program", section.at("startPageIndex").get<int>(),
                             section.at("startNumber").get<int>()) +
                        (section.at("restart").get<bool>() ? Text(", restarts", "Program") : "") +
                        (section.at("included").get<bool>() ? "" : Text(", left out of output", "Program")));
    }
    for (Json const & story : json.at("stories")) {
        lines.push_back("  " + Text("story: paragraphs: %1, frames: %2, notes: %3", "Program",
                                    story.at("paragraphs").size(), story.at("frameCount").get<int>(),
                                    story.at("notes").size()));
    }
    return lines;
}

struct ShowOptions
{
    std::string m_File;
    /// Where the preview goes; empty for nowhere.
    std::string m_Thumbnail;
};

int RunShow(VerbContext & context, ShowOptions const & options)
{
    std::string const & file = options.m_File;
    Import::MessageList messages;
    Console & console = context.m_Console;
    fs::path const path = FullPath(file);
    fs::path const thumbnail = options.m_Thumbnail.empty() ? fs::path() : FullPath(options.m_Thumbnail);
    bool const canWrite = thumbnail.empty() || CheckOutput(thumbnail, OutputKind::Png, messages);
    Json json;
    switch (KindOf(path)) {
    case FileKind::Missing:
        messages.Error("file-missing", {file}, Text("There is no such file.", "Program"));
        break;
    case FileKind::Shut:
        messages.Error("document-unreadable", {file}, Text("You have no permission to read this file.", "Program"));
        break;
    case FileKind::Folder:
    case FileKind::Other:
        messages.Error("file-foreign", {file},
                       Text("This is neither a book (.kvbook) nor a document (.kvdoc).", "Program"));
        break;
    case FileKind::Book: {
        StandingAnswers answers;
        answers.m_Locate = StandingAnswers::Choice::No;
        answers.m_Upgrade = StandingAnswers::Choice::No;
        Listener listener(console, nullptr, answers);
        BookSession session(console, listener);
        if (session.Open(path.string(), messages)) {
            json = DescribeBook(session, path);
            if (!thumbnail.empty() && canWrite) {
                WriteBookPreview(file, path, thumbnail, messages);
            }
        }
        messages.Append(listener.TakeMessages());
        break;
    }
    case FileKind::Document: {
        auto const document = Kernel::MakeCounted<DocumentController>();
        OpenDocumentFailedNotification failure(String(path.string()), false);
        if (document->LoadDocument(String(path.string()), false, true, LoadWhole, nullptr, failure, false)) {
            json = DescribeDocument(*document);
            json["path"] = path.string();
            if (!thumbnail.empty() && canWrite) {
                WriteDocumentPreview(file, document, thumbnail, messages);
            }
        } else {
            std::string const place =
                failure.GetPlace().Empty() ? std::string() : " (" + failure.GetPlace().ToStd() + ")";
            messages.Error("document-unreadable", {file}, failure.GetReason().ToStd() + place);
        }
        break;
    }
    }

    bool const isGood = !json.is_null() && !messages.HasErrors();
    console.EndProgress();
    if (console.Settings().m_IsJson) {
        Json result{{"ok", isGood}};
        if (!json.is_null()) {
            result.update(json);
        }
        result["messages"] = ToJson(messages);
        console.SayResult(Print(result));
    }
    console.Tell(messages);
    if (!json.is_null()) {
        for (std::string const & line : Summarise(json)) {
            console.Say(line);
        }
    }
    return isGood ? ExitFine : ExitFailed;
}

}

void AddShowVerb(VerbList & verbs)
{
    auto const options = std::make_shared<ShowOptions>();
    CLI::App & verb = verbs.Add("show", Text("Tell what is in a book or document file", "Help"),
                                "  korvane show my-book/.korvane/chapter1.kvdoc --json",
                                [options](VerbContext & context) { return RunShow(context, *options); });
    verb.add_option("FILE", options->m_File, Text("A .kvbook or .kvdoc file", "Help"))->required();
    verb.add_option("--thumbnail", options->m_Thumbnail, Text("Write the preview picture to this PNG file", "Help"));
}

}
