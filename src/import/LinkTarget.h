#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace Import
{

/// Where a link of a chapter leads.
struct LinkTarget
{
    enum class Kind
    {
        Web,
        Mail,
        /// A place in a chapter of the book: `m_Chapter` and `m_Id`, which is empty for the chapter's beginning.
        Chapter,
        /// A file that is no chapter of the book.
        Unknown
    };

    Kind m_Kind = Kind::Unknown;
    /// Web or mail address.
    std::string m_Address;
    /// The chapter's name in the plan.
    std::string m_Chapter;
    std::string m_Id;
};

/// Reads a link as it is written in the chapter `from`. `chapters` are the names of all chapters of the book, sorted.
/// A link to NAME.html means the chapter NAME.md, as mdBook has it; a link without a scheme whose file is no chapter is
/// unknown.
LinkTarget ReadLinkTarget(std::string_view target, std::string_view from, std::vector<std::string> const & chapters);

/// Identity of an anchor across chapters, in UUID form: the same for the same chapter and id in every run, so that
/// links between chapters can be made without looking into the other chapter.
std::string MakeAnchorUid(std::string_view chapter, std::string_view id);

/// Identity of an index topic, from its full name: chapters that name the same topic agree without having met.
std::string MakeTopicGuid(std::string_view nameWithParents);

}
