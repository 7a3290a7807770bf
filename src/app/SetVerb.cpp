#include "app/BookEdit.h"
#include "app/BookSettings.h"
#include "app/TextTable.h"
#include "app/VerbList.h"
#include "commands/SetExportFormatFileExportOptionsCommand.h"
#include "commands/SetStrayHandlingCommand.h"
#include "commands/SetSynchroniseSettingsCommand.h"
#include "import/Text.h"

#include <map>

namespace App
{

using Import::Text;

namespace
{

struct SetOptions
{
    std::string m_Book;
    /// The new value of each setting that the user named.
    std::map<std::string, std::string> m_Values;
};

void RunCommands(BookSession & session, BookSettings const & settings, std::set<SettingGroup> const & groups)
{
    if (groups.contains(SettingGroup::Strays)) {
        session.Run(Kernel::MakeCounted<Book::SetStrayHandlingCommand>(settings.m_PadStrays, settings.m_MergeStrays));
    }
    if (groups.contains(SettingGroup::Synchronise)) {
        session.Run(Kernel::MakeCounted<Book::SetSynchroniseSettingsCommand>(settings.m_Synchronise));
    }
    if (groups.contains(SettingGroup::Export)) {
        session.Run(Kernel::MakeCounted<Book::SetExportFormatFileExportOptionsCommand>(settings.MakeExportOptions()));
    }
}

/// Changes what the user named, and shows it; without a name, shows all.
void ChangeSettings(BookEdit & edit, SetOptions const & options, TerminalFacts const & terminal)
{
    BookSettings settings = BookSettings::Of(*edit.m_Session.GetBook());
    std::set<SettingGroup> groups;
    Json result = Json::object();
    TextTable table({{Text("Setting", "Table")}, {Text("Value", "Table")}, {Text("Meaning", "Table"), true}});
    for (BookSetting const & row : ListBookSettings()) {
        auto const named = options.m_Values.find(row.m_Name);
        bool const isNamed = options.m_Values.end() != named && row.m_Set(settings, named->second);
        if (isNamed) {
            groups.insert(row.m_Group);
        }
        Json const value = row.m_Get(settings);
        result[row.m_Name] = value;
        if (isNamed || options.m_Values.empty()) {
            table.AddRow({{row.m_Name}, {DescribeValue(value)}, {row.m_Meaning}});
        }
    }
    RunCommands(edit.m_Session, settings, groups);
    edit.m_Result["settings"] = result;
    for (std::string const & line : table.Layout(terminal.m_Columns, false)) {
        edit.Say(line);
    }
}

}

void AddSetVerb(VerbList & verbs)
{
    auto const options = std::make_shared<SetOptions>();
    CLI::App & verb =
        verbs.Add("set", Text("Show or change the settings that a book keeps", "Help"),
                  "  korvane set lighthouse.kvbook\n  korvane set lighthouse.kvbook --pad-strays yes --picture-dpi 300",
                  [options](VerbContext & context) {
                      Saving const saving = options->m_Values.empty() ? Saving::Never : Saving::Always;
                      return EditBook(context, options->m_Book, {saving, false}, [&](BookEdit & edit) {
                          ChangeSettings(edit, *options, context.m_Console.Terminal());
                      });
                  });
    verb.add_option("BOOK", options->m_Book, Text("The book file", "Help"))->required();
    for (BookSetting const & row : ListBookSettings()) {
        verb.add_option_function<std::string>(
                "--" + std::string(row.m_Name),
                [options, name = row.m_Name](std::string const & text) { options->m_Values[name] = text; },
                row.m_Meaning)
            ->type_name(row.m_Values)
            ->check([&row](std::string const & text) {
                BookSettings probe;
                return row.m_Set(probe, text)
                           ? std::string()
                           : Text("\"%1\" is no value for this; it takes %2.", "Program", text, row.m_Values);
            });
    }
}

}
