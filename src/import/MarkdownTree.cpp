#include "import/MarkdownTree.h"

#include <cstring>
#include <mutex>

namespace Import
{

namespace
{

bool HasTypeName(cmark_node * node, char const * name)
{
    return 0 == std::strcmp(cmark_node_get_type_string(node), name);
}

/// The numbers of the extensions' node types, learnt from their names once.
struct ExtensionTypes
{
    cmark_node_type m_Table = CMARK_NODE_NONE;
    cmark_node_type m_Row = CMARK_NODE_NONE;
    cmark_node_type m_Cell = CMARK_NODE_NONE;
    cmark_node_type m_Strikethrough = CMARK_NODE_NONE;
};

MarkdownTree Parse(std::string_view text)
{
    // A tilde alone is a tilde: prose uses it for "about".
    cmark_parser * parser = cmark_parser_new(CMARK_OPT_FOOTNOTES | CMARK_OPT_STRIKETHROUGH_DOUBLE_TILDE);
    for (char const * name : {"table", "strikethrough", "autolink", "tasklist"}) {
        cmark_parser_attach_syntax_extension(parser, cmark_find_syntax_extension(name));
    }
    cmark_parser_feed(parser, text.data(), text.size());
    MarkdownTree tree(cmark_parser_finish(parser));
    cmark_parser_free(parser);
    return tree;
}

ExtensionTypes const & Types()
{
    static ExtensionTypes const types = [] {
        cmark_gfm_core_extensions_ensure_registered();
        ExtensionTypes result;
        MarkdownTree const sample = Parse("| ~~a~~ |\n|---|\n| b |\n");
        cmark_iter * iterator = cmark_iter_new(sample.get());
        while (CMARK_EVENT_DONE != cmark_iter_next(iterator)) {
            cmark_node * node = cmark_iter_get_node(iterator);
            cmark_node_type const type = cmark_node_get_type(node);
            if (HasTypeName(node, "table")) {
                result.m_Table = type;
            } else if (HasTypeName(node, "table_header") || HasTypeName(node, "table_row")) {
                result.m_Row = type;
            } else if (HasTypeName(node, "table_cell")) {
                result.m_Cell = type;
            } else if (HasTypeName(node, "strikethrough")) {
                result.m_Strikethrough = type;
            }
        }
        cmark_iter_free(iterator);
        return result;
    }();
    return types;
}

int HexValue(char c)
{
    return '0' <= c && c <= '9'   ? c - '0'
           : 'a' <= c && c <= 'f' ? c - 'a' + 10
           : 'A' <= c && c <= 'F' ? c - 'A' + 10
                                  : -1;
}

}

MarkdownTree ParseMarkdown(std::string_view text)
{
    Types();
    return Parse(text);
}

std::string PlainText(cmark_node * node)
{
    std::string text;
    cmark_iter * iterator = cmark_iter_new(node);
    for (cmark_event_type event; CMARK_EVENT_DONE != (event = cmark_iter_next(iterator));) {
        if (CMARK_EVENT_ENTER != event) {
            continue;
        }
        cmark_node * current = cmark_iter_get_node(iterator);
        cmark_node_type const type = cmark_node_get_type(current);
        if (CMARK_NODE_TEXT == type || CMARK_NODE_CODE == type) {
            text += cmark_node_get_literal(current);
        } else if (CMARK_NODE_SOFTBREAK == type || CMARK_NODE_LINEBREAK == type) {
            text += ' ';
        }
    }
    cmark_iter_free(iterator);
    return text;
}

bool IsTable(cmark_node * node)
{
    return cmark_node_get_type(node) == Types().m_Table;
}
bool IsTableRow(cmark_node * node)
{
    return cmark_node_get_type(node) == Types().m_Row;
}
bool IsTableCell(cmark_node * node)
{
    return cmark_node_get_type(node) == Types().m_Cell;
}
bool IsStrikethrough(cmark_node * node)
{
    return cmark_node_get_type(node) == Types().m_Strikethrough;
}
bool IsTaskItem(cmark_node * node)
{
    return HasTypeName(node, "tasklist");
}

std::string DecodePercent(std::string_view text)
{
    std::string result;
    for (std::size_t at = 0; at < text.size(); ++at) {
        if ('%' == text[at] && at + 2 < text.size() && 0 <= HexValue(text[at + 1]) && 0 <= HexValue(text[at + 2])) {
            result += static_cast<char>(HexValue(text[at + 1]) * 16 + HexValue(text[at + 2]));
            at += 2;
        } else {
            result += text[at];
        }
    }
    return result;
}

}
