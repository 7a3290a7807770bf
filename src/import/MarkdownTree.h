#pragma once

#include <cmark-gfm-core-extensions.h>
#include <cmark-gfm.h>
#include <memory>
#include <string>
#include <string_view>

namespace Import
{

/// Frees a parsed tree with the nodes of its extensions.
struct FreeMarkdownTree
{
    void operator()(cmark_node * root) const { cmark_node_free(root); }
};

/// A parsed document; its nodes are borrowed from it.
using MarkdownTree = std::unique_ptr<cmark_node, FreeMarkdownTree>;

/// Parses CommonMark with tables, footnotes, strikethrough, task lists and bare links. Any thread; never null.
MarkdownTree ParseMarkdown(std::string_view text);

/// The text of all text and code nodes below `node`, without markup.
std::string PlainText(cmark_node * node);

/// The kinds of node that extensions add: their numbers are given out at run time.
bool IsTable(cmark_node * node);
bool IsTableRow(cmark_node * node);
bool IsTableCell(cmark_node * node);
bool IsStrikethrough(cmark_node * node);
bool IsTaskItem(cmark_node * node);

/// Decodes "%20" and the like in a link; a broken escape stays as it is.
std::string DecodePercent(std::string_view text);

}
