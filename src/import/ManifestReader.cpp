#include "import/BookPlan.h"

#include <algorithm>
#include <toml++/toml.h>

namespace Import
{

namespace
{

/// Reads typed values out of one table and reports what does not fit, with its place.
class TableReader
{
public:
    TableReader(toml::table const & table, std::string prefix, std::string const & file, MessageList & messages) :
        m_Table(table), m_Prefix(std::move(prefix)), m_File(file), m_Messages(messages)
    {
    }

    void Text(std::string_view key, std::string & value)
    {
        if (auto const * node = Find(key)) {
            if (auto const * text = node->as_string()) {
                value = text->get();
            } else {
                Refuse(*node, key, "a text in quotes");
            }
        }
    }

    void Switch(std::string_view key, bool & value)
    {
        if (auto const * node = Find(key)) {
            if (auto const * flag = node->as_boolean()) {
                value = flag->get();
            } else {
                Refuse(*node, key, "true or false");
            }
        }
    }

    /// A text, or a list of texts.
    void Texts(std::string_view key, std::vector<std::string> & values)
    {
        auto const * node = Find(key);
        if (!node) {
            return;
        }
        values.clear();
        if (auto const * text = node->as_string()) {
            values.push_back(text->get());
            return;
        }
        ForEachText(*node, key, [&](std::string const & text, Place const &) { values.push_back(text); });
    }

    template <typename Use>
    void ForEachText(toml::node const & node, std::string_view key, Use && use)
    {
        auto const * list = node.as_array();
        if (!list) {
            Refuse(node, key, "a list of texts");
            return;
        }
        for (toml::node const & element : *list) {
            if (auto const * text = element.as_string()) {
                use(text->get(), PlaceOf(element));
            } else {
                Refuse(element, key, "a list of texts");
            }
        }
    }

    toml::node const * Find(std::string_view key)
    {
        m_Known.push_back(std::string(key));
        return m_Table.get(key);
    }

    /// Warns of each key that nobody has asked for.
    void ReportUnknown()
    {
        for (auto const & [key, node] : m_Table) {
            if (std::find(m_Known.begin(), m_Known.end(), std::string(key.str())) == m_Known.end()) {
                m_Messages.Warn("manifest-key", PlaceOf(node),
                                "The key \"" + m_Prefix + std::string(key.str()) + "\" is not known and has no effect.");
            }
        }
    }

    Place PlaceOf(toml::node const & node) const
    {
        return {m_File, static_cast<int>(node.source().begin.line), static_cast<int>(node.source().begin.column)};
    }

    void Refuse(toml::node const & node, std::string_view key, std::string_view wanted)
    {
        m_Messages.Error("manifest-value", PlaceOf(node),
                         "\"" + m_Prefix + std::string(key) + "\" has to be " + std::string(wanted) + ".");
    }

private:
    toml::table const & m_Table;
    std::string m_Prefix;
    std::string const & m_File;
    MessageList & m_Messages;
    std::vector<std::string> m_Known;
};

/// mdBook keeps the facts of the book in a table of its own; its other tables steer its own output.
void ReadMdBookTable(toml::table const & table, std::string const & file, BookPlan & plan, MessageList & messages)
{
    TableReader reader(table, "book.", file, messages);
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
    toml::table table;
    try {
        table = toml::parse(std::string_view(text), std::string_view(shownName));
    } catch (toml::parse_error const & error) {
        auto const place = error.source().begin;
        messages.Error("manifest-syntax", {shownName, static_cast<int>(place.line), static_cast<int>(place.column)},
                       std::string(error.description()) + ".");
        return false;
    }

    std::size_t const before = messages.All().size();
    TableReader reader(table, "", shownName, messages);
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
            TableReader options(*output, "output.", shownName, messages);
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
            reader.Refuse(*node, "output", "a table, written [output]");
        }
    }
    if (auto const * node = reader.Find("book")) {
        if (auto const * book = node->as_table()) {
            ReadMdBookTable(*book, shownName, plan, messages);
            for (char const * ignored : {"build", "preprocessor", "rust"}) {
                reader.Find(ignored);
            }
        } else {
            reader.Refuse(*node, "book", "a table, written [book]");
        }
    }
    if (auto const * node = reader.Find("chapters")) {
        reader.ForEachText(*node, "chapters", [&](std::string const & name, Place const & place) {
            if (name.empty()) {
                messages.Error("manifest-value", place, "A chapter's file name is empty.");
            } else {
                AddChapter(plan, name, place, messages);
            }
        });
    }
    reader.ReportUnknown();

    auto const & all = messages.All();
    return std::none_of(all.begin() + static_cast<std::ptrdiff_t>(before), all.end(), [](Message const & message) {
        return "manifest-value" == message.m_Kind && Severity::Error == message.m_Severity;
    });
}

}
