#include "app/BookEdit.h"
#include "app/BookFileLock.h"
#include "app/Interruption.h"
#include "app/VerbList.h"
#include "commands/SaveBookAsPackageCommand.h"
#include "core/BookChapter.h"
#include "import/SaveFailure.h"
#include "import/Text.h"

#include <algorithm>

namespace App
{

namespace fs = std::filesystem;
using Import::Text;

namespace
{

struct SaveAsOptions
{
    std::string m_Book;
    std::string m_Target;
    bool m_IsForced = false;
};

struct PackageOptions
{
    std::string m_Book;
    std::string m_Folder;
    bool m_LeavesPictures = false;
    bool m_LeavesFonts = false;
};

/// Two names of one file, however they are written.
bool IsSameFile(fs::path const & one, fs::path const & other)
{
    std::error_code error;
    return one == other || fs::equivalent(one, other, error);
}

void SaveAs(BookEdit & edit, SaveAsOptions const & options)
{
    fs::path const target = CheckTarget(
        options.m_Target, options.m_IsForced ? Existing::Replace : Existing::RefuseUnlessForced, edit.m_Messages);
    if (target.empty()) {
        return;
    }
    BookFileLock lock;
    std::string problem;
    auto const chapters = edit.m_Session.GetChapters();
    auto const isTarget = [&target](auto const & chapter) { return IsSameFile(target, chapter->GetPath().ToStd()); };
    if (IsSameFile(target, edit.m_File)) {
        edit.Error("target-same", Text("This is the book itself; choose another name.", "Program"));
    } else if (std::any_of(chapters.begin(), chapters.end(), isTarget)) {
        edit.m_Messages.Error("target-document", {target.string()},
                              Text("This is one of the book's documents; choose another name.", "Program"));
    } else if (!lock.Take(target, problem)) {
        edit.m_Messages.Error("book-locked", {target.string()}, problem);
    } else if (edit.m_Session.SaveAnyway(target.string(), edit.m_Messages)) {
        edit.m_Result["target"] = target.string();
        edit.Say(Text("Saved as %1. Both books list the same documents.", "Program", target.string()));
    }
}

/// A folder that is to be whole or not there: the work is done in one beside it, which takes its name at the end.
class NewFolder
{
public:
    explicit NewFolder(fs::path const & target) : m_Target(target), m_Work(target.string() + ".partial") {}
    ~NewFolder()
    {
        std::error_code error;
        if (m_IsMade) {
            fs::remove_all(m_Work, error);
        }
    }
    NewFolder(NewFolder const &) = delete;
    NewFolder & operator=(NewFolder const &) = delete;

    /// The folder to work in is made, or an error says why not.
    bool Make(Import::MessageList & messages)
    {
        std::error_code error;
        if (fs::exists(fs::symlink_status(m_Target, error)) &&
            !(fs::is_directory(m_Target, error) && fs::is_empty(m_Target, error))) {
            messages.Error("target-exists", {m_Target.string()},
                           Text("This is there already; name a new folder, or an empty one.", "Program"));
            return false;
        }
        if (fs::exists(fs::symlink_status(m_Work, error))) {
            messages.Error(
                "target-exists", {m_Work.string()},
                Text("This is in the way. If it is what an earlier run has left that was broken off, remove it.", "Program"));
            return false;
        }
        m_IsMade = fs::create_directory(m_Work, error);
        if (!m_IsMade) {
            messages.Error("folder-missing", {m_Target.string()},
                           Text("The folder cannot be made: %1.", "Program", error.message()));
            return false;
        }
        return true;
    }

    bool Finish(Import::MessageList & messages)
    {
        std::error_code error;
        fs::rename(m_Work, m_Target, error);
        if (error) {
            messages.Error("target-unwritten", {m_Target.string()},
                           Text("The folder cannot be put in its place: %1.", "Program", error.message()));
        }
        return !error;
    }

    [[nodiscard]] fs::path const & Work() const { return m_Work; }

private:
    fs::path m_Target;
    fs::path m_Work;
    bool m_IsMade = false;
};

void MakePackage(BookEdit & edit, PackageOptions const & options)
{
    std::error_code error;
    fs::path target = fs::absolute(options.m_Folder, error).lexically_normal();
    target = target.has_filename() ? target : target.parent_path();
    edit.m_Session.RefreshChapters();
    edit.m_Session.ReportUnusable(edit.m_Messages);
    NewFolder folder(target);
    if (edit.m_Messages.HasErrors() || !folder.Make(edit.m_Messages)) {
        return;
    }
    fs::path const book = folder.Work() / edit.m_File.filename();
    auto const command = Kernel::MakeCounted<Book::SaveBookAsPackageCommand>(
        String(book.string()), edit.m_Session.GetChapters(), !options.m_LeavesPictures, !options.m_LeavesFonts,
        String("kvdoc"));
    edit.m_Session.Run(command);
    edit.m_Session.WaitForRest();
    if (!command->GetResult().IsSuccess()) {
        // What kept the book from being written, a full disk as a rule, has met the files before it as well.
        edit.m_Messages.Error("book-unsaved", {target.string()},
                              Import::DescribeSaveFailure(command->GetResult(), (target / book.filename()).string()));
        return;
    }
    if (Interruption::IsRaised()) {
        edit.m_Messages.Error("interrupted", {target.string()}, Text("Interrupted; no package was made.", "Program"));
        return;
    }
    for (auto const & problem : command->GetProblems()) {
        edit.m_Messages.Warn("package", {problem.m_Path.ToStd()}, problem.m_Text.ToStd());
    }
    if (folder.Finish(edit.m_Messages)) {
        edit.m_Result["target"] = (target / book.filename()).string();
        edit.Say(Text("Packaged into %1.", "Program", target.string()));
    }
}

}

void AddPackageVerb(VerbList & verbs)
{
    auto const options = std::make_shared<PackageOptions>();
    CLI::App & verb =
        verbs.Add("package", Text("Copy a book with all that it needs into a folder that can be moved", "Help"),
                  "  korvane package lighthouse.kvbook lighthouse-for-the-printer", [options](VerbContext & context) {
                      return EditBook(context, options->m_Book, {Saving::Never, false},
                                      [&](BookEdit & edit) { MakePackage(edit, *options); });
                  });
    verb.add_option("BOOK", options->m_Book, Text("The book file", "Help"))->required();
    verb.add_option("FOLDER", options->m_Folder, Text("The folder to make", "Help"))->required();
    verb.add_flag("--no-pictures", options->m_LeavesPictures, Text("Leave pictures where they are", "Help"));
    verb.add_flag("--no-fonts", options->m_LeavesFonts, Text("Leave fonts out", "Help"));
    verbs.AddAnswers(verb);
}

void AddSaveAsVerb(VerbList & verbs)
{
    auto const options = std::make_shared<SaveAsOptions>();
    CLI::App & verb =
        verbs.Add("save-as", Text("Save a book under another name", "Help"),
                  "  korvane save-as lighthouse.kvbook drafts/second.kvbook", [options](VerbContext & context) {
                      return EditBook(context, options->m_Book, {Saving::Never, false},
                                      [&](BookEdit & edit) { SaveAs(edit, *options); });
                  });
    verb.add_option("BOOK", options->m_Book, Text("The book file", "Help"))->required();
    verb.add_option("TARGET", options->m_Target, Text("The new book file", "Help"))->required();
    verb.add_flag("--force", options->m_IsForced, Text("Replace a file that is there already", "Help"));
}

}
