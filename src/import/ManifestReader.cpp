#include "import/BookPlan.h"
#include "import/Text.h"
#include "import/TomlReader.h"

#include <algorithm>

namespace Import
{

namespace
{

/// mdBook keeps the facts of the book in a table of its own; its other tables steer its own output.
void ReadMdBookTable(toml::table const & table, std::string const & file, BookPlan & plan, MessageList & messages)
{
    TomlReader reader(table, "book.", file, messages);
    reader.Text("title", plan.m_Title);
    reader.Text("language", plan.m_Language);
    reader.Texts("authors", plan.m_Authors);
    std::string source = "src";
    reader.Text("src", source);
    for (char const * ignored : {"description", "multilingual", "text-direction"}) {
        reader.Find(ignored);
    }
    reader.ReportUnknown();
    std::error_code error;
    if (std::filesystem::exists(plan.m_Folder / source / "SUMMARY.md", error)) {
        plan.m_Folder = (plan.m_Folder / source).lexically_normal();
    }
}

}

bool ReadManifestText(std::string const & text, std::string const & shownName, BookPlan & plan, MessageList & messages)
{
    auto const table = ParseToml(text, shownName, messages);
    if (!table) {
        return false;
    }
    std::size_t const before = messages.All().size();
    TomlReader reader(*table, "", shownName, messages);
    reader.Text("title", plan.m_Title);
    reader.Text("subtitle", plan.m_Subtitle);
    reader.Texts("author", plan.m_Authors);
    reader.Texts("authors", plan.m_Authors);
    reader.Text("lang", plan.m_Language);
    reader.Text("template", plan.m_Template);
    reader.Switch("smart", plan.m_Smart);
    reader.Switch("title-page", plan.m_HasTitlePage);

    if (auto const * node = reader.Find("output")) {
        if (auto const * output = node->as_table()) {
            TomlReader options(*output, "output.", shownName, messages);
            options.Text("file", plan.m_OutputFile);
            options.Switch("marks", plan.m_HasMarks);
            options.Switch("bleed", plan.m_IncludesBleed);
            options.Switch("metadata", plan.m_EmbedsMetadata);
            // An mdBook manifest has one table below this for each of its own kinds of output.
            for (auto const & [key, value] : *output) {
                if (value.is_table()) {
                    options.Find(key.str());
                }
            }
            options.ReportUnknown();
        } else {
            reader.Refuse(*node, "output", Text("a table, written [%1]", "Source", "output"));
        }
    }
    if (auto const * node = reader.Find("book")) {
        if (auto const * book = node->as_table()) {
            ReadMdBookTable(*book, shownName, plan, messages);
            for (char const * ignored : {"build", "preprocessor", "rust"}) {
                reader.Find(ignored);
            }
        } else {
            reader.Refuse(*node, "book", Text("a table, written [%1]", "Source", "book"));
        }
    }
    if (auto const * node = reader.Find("chapters")) {
        reader.ForEachText(*node, "chapters", [&](std::string const & name, Place const & place) {
            if (name.empty()) {
                messages.Error("toml-value", place, Text("A chapter's file name is empty.", "Source"));
            } else {
                AddChapter(plan, name, place, messages);
            }
        });
    }
    reader.ReportUnknown();

    auto const & all = messages.All();
    return std::none_of(all.begin() + static_cast<std::ptrdiff_t>(before), all.end(), [](Message const & message) {
        return "toml-value" == message.m_Kind && Severity::Error == message.m_Severity;
    });
}

}
