#include "app/BookEdit.h"

#include "app/BookFileLock.h"
#include "app/ChapterNames.h"
#include "app/FileCheck.h"
#include "app/FileKind.h"
#include "app/Interruption.h"
#include "import/Text.h"

#include <algorithm>

namespace App
{

namespace fs = std::filesystem;
using Import::Text;

namespace
{

constexpr char const * g_BookExtension = ".kvbook";

Json ListChapters(BookSession const & session)
{
    Json list = Json::array();
    int index = 0;
    for (auto const & chapter : session.GetChapters()) {
        list.push_back({{"index", index++},
                        {"name", chapter->GetName().ToStd()},
                        {"path", chapter->GetPath().ToStd()},
                        {"key", chapter->IsKey()},
                        {"startFromPage", chapter->GetStartFromPage()},
                        {"pages", chapter->DescribePages().ToStd()}});
    }
    return list;
}

/// One verb's work on one book, from the lock to the last line.
class EditRun
{
public:
    EditRun(VerbContext & context, fs::path file, EditPlan plan)
        : m_Context(context),
          m_File(std::move(file)),
          m_Plan(plan)
    {
    }

    void Change(bool isNew, std::function<void(BookEdit &)> const & change)
    {
        BookFileLock lock;
        std::string problem;
        // Who only reads may do so beside another program, and in a folder that can't be written.
        if (Saving::Never != m_Plan.m_Saving && !lock.Take(m_File, problem)) {
            m_Messages.Error("book-locked", {m_File.string()}, problem);
            return;
        }
        Listener listener(m_Context.m_Console, m_Context.m_Ask, m_Context.m_Answers);
        {
            BookSession session(m_Context.m_Console, listener);
            BookEdit edit(session, listener, m_File);
            if (isNew) {
                session.Create();
            } else if (!session.Open(m_File.string(), m_Messages)) {
                return;
            }
            change(edit);
            session.WaitForRest();
            Collect(edit, listener);
            if (!m_Messages.HasErrors() && !StopIfInterrupted()) {
                Finish(edit);
            }
            m_Chapters = ListChapters(session);
            m_Lines = std::move(edit.m_Lines);
            m_Result = std::move(edit.m_Result);
        }
        m_Messages.Append(listener.TakeMessages());
    }

    int Report()
    {
        bool const isGood = !m_Messages.HasErrors();
        Console & console = m_Context.m_Console;
        console.EndProgress();
        if (console.Settings().m_IsJson) {
            Json json{{"ok", isGood}, {"book", m_File.string()}};
            json.update(m_Result);
            json["chapters"] = m_Chapters;
            json["messages"] = ToJson(m_Messages);
            console.SayResult(Print(json));
        }
        console.Tell(m_Messages);
        if (isGood) {
            for (std::string const & line : m_Lines) {
                console.Say(line);
            }
        }
        return isGood ? ExitFine : ExitFailed;
    }

    Import::MessageList m_Messages;

private:
    void Collect(BookEdit & edit, Listener & listener)
    {
        m_Messages.Append(std::exchange(edit.m_Messages, {}));
        m_Messages.Append(listener.TakeMessages());
    }

    bool StopIfInterrupted()
    {
        if (Interruption::IsRaised()) {
            m_Messages.Error("interrupted", {m_File.string()}, Text("Interrupted; the book is as it was.", "Program"));
            return true;
        }
        return false;
    }

    void Finish(BookEdit & edit)
    {
        if (m_Plan.m_Renumbers) {
            edit.m_Session.Renumber(m_Messages);
        }
        if (Saving::Always == m_Plan.m_Saving) {
            edit.m_Session.SaveAnyway(m_File.string(), m_Messages);
        } else if (Saving::IfDirty == m_Plan.m_Saving) {
            edit.m_Session.Save(m_File.string(), m_Messages);
        }
    }

    VerbContext & m_Context;
    fs::path m_File;
    EditPlan m_Plan;
    Json m_Chapters = Json::array();
    Json m_Result = Json::object();
    std::vector<std::string> m_Lines;
};

}

void BookEdit::Error(char const * kind, std::string const & text)
{
    m_Messages.Error(kind, {m_File.string()}, text);
}

BookEdit::ChapterPtr BookEdit::Find(std::string const & chapter)
{
    auto const chapters = m_Session.GetChapters();
    std::vector<ChapterLabel> labels;
    for (ChapterPtr const & each : chapters) {
        labels.push_back({each->GetName().ToStd(), each->GetPath().ToStd()});
    }
    std::error_code error;
    FoundChapter const found = FindChapter(labels, chapter, fs::current_path(error));
    if (found.m_Index < 0) {
        Error("chapter-unknown", found.m_Problem);
        return nullptr;
    }
    return chapters[static_cast<std::size_t>(found.m_Index)];
}

BookSession::ChapterList BookEdit::Find(std::vector<std::string> const & chapters)
{
    BookSession::ChapterList list;
    bool isComplete = true;
    for (std::string const & text : chapters) {
        ChapterPtr const chapter = Find(text);
        isComplete = isComplete && chapter;
        if (chapter && list.end() == std::find(list.begin(), list.end(), chapter)) {
            list.push_back(chapter);
        }
    }
    return isComplete ? list : BookSession::ChapterList();
}

std::string BookEdit::CheckDocument(std::string const & file)
{
    fs::path const path = FullPath(file);
    std::string const extension = path.extension().string();
    switch (KindOf(path)) {
    case FileKind::Document:
        break;
    case FileKind::Missing:
        m_Messages.Error("file-missing", {file}, Text("There is no such file.", "Program"));
        return {};
    case FileKind::Shut:
        m_Messages.Error("document-unreadable", {file}, Text("You have no permission to read this file.", "Program"));
        return {};
    case FileKind::Book:
        m_Messages.Error(
            "file-foreign", {file},
            Text("This is a book; only documents (.kvdoc) can be chapters. Add the documents that it lists.",
                 "Program"));
        return {};
    case FileKind::Folder:
        m_Messages.Error("file-foreign", {file},
                         Text("This is a folder; name the documents (.kvdoc) in it.", "Program"));
        return {};
    case FileKind::Other:
        m_Messages.Error(
            "file-foreign", {file},
            ".md" == extension || ".markdown" == extension
                ? Text("This is Markdown. Make a document of it first: korvane import %1 -o FOLDER", "Program", file)
                : Text("This is no document (.kvdoc), so it cannot be a chapter.", "Program"));
        return {};
    }
    if (auto const chapter = m_Session.GetBook()->GetChapterFromPath(String(path.string()))) {
        m_Messages.Error("chapter-twice", {file},
                         Text("The book has this document already, as chapter %1.", "Program", Describe(chapter)));
        return {};
    }
    return path.string();
}

std::string BookEdit::Describe(ChapterPtr const & chapter) const
{
    int const index = m_Session.GetBook()->IndexFromChapter(chapter);
    return std::to_string(index + 1) + " (" + chapter->GetName().ToStd() + ")";
}

int EditBook(VerbContext & context, std::string const & file, EditPlan plan,
             std::function<void(BookEdit &)> const & change)
{
    EditRun run(context, FullPath(file), plan);
    if (FindBook(file, run.m_Messages)) {
        run.Change(false, change);
    }
    return run.Report();
}

int MakeBook(VerbContext & context, std::string const & file, EditPlan plan,
             std::function<void(BookEdit &)> const & change)
{
    Import::MessageList messages;
    fs::path const path = CheckTarget(file, Existing::Refuse, messages);
    EditRun run(context, path.empty() ? FullPath(file) : path, plan);
    run.m_Messages.Append(messages);
    if (!path.empty()) {
        run.Change(true, change);
    }
    return run.Report();
}

fs::path CheckTarget(std::string const & file, Existing existing, Import::MessageList & messages)
{
    fs::path path = FullPath(file);
    std::error_code error;
    if (!path.has_filename() || fs::is_directory(path, error)) {
        messages.Error("target-folder", {file}, Text("This is a folder; name a file in it.", "Program"));
        return {};
    }
    if (!path.has_extension()) {
        path += g_BookExtension;
    }
    if (!fs::is_directory(path.parent_path(), error)) {
        messages.Error("folder-missing", {file},
                       Text("The folder %1 does not exist; make it first.", "Program", path.parent_path().string()));
        return {};
    }
    if (fs::exists(fs::symlink_status(path, error)) && Existing::Replace != existing) {
        messages.Error(
            "target-exists", {path.string()},
            Existing::Refuse == existing
                ? Text("There is a file of this name already; choose another name, or remove it first.", "Program")
                : Text("There is a file of this name already; choose another name, or give --force to "
                       "replace it.",
                       "Program"));
        return {};
    }
    return path;
}

}
