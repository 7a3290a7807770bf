#include "app/BookEdit.h"
#include "app/BookFileLock.h"
#include "app/VerbList.h"
#include "import/Text.h"

namespace App
{

using Import::Text;

namespace
{

struct SaveAsOptions
{
    std::string m_Book;
    std::string m_Target;
    bool m_IsForced = false;
};

void SaveAs(BookEdit & edit, SaveAsOptions const & options)
{
    std::filesystem::path const target = CheckTarget(
        options.m_Target, options.m_IsForced ? Existing::Replace : Existing::RefuseUnlessForced, edit.m_Messages);
    if (target.empty()) {
        return;
    }
    BookFileLock lock;
    std::string problem;
    if (target == edit.m_File) {
        edit.Error("target-same", Text("This is the book itself; choose another name.", "Program"));
    } else if (!lock.Take(target, problem)) {
        edit.m_Messages.Error("book-locked", {target.string()}, problem);
    } else if (edit.m_Session.SaveAnyway(target.string(), edit.m_Messages)) {
        edit.m_Result["target"] = target.string();
        edit.Say(Text("Saved as %1. Both books list the same documents.", "Program", target.string()));
    }
}

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
