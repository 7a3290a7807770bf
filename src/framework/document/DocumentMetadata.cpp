#include "framework/document/DocumentMetadata.h"

#include <string_view>

namespace
{

std::vector<String> SplitTags(std::string_view tags)
{
    std::vector<String> list;
    while (!tags.empty()) {
        std::size_t const comma = std::min(tags.find_first_of(",;"), tags.size());
        std::string_view tag = tags.substr(0, comma);
        tags.remove_prefix(std::min(comma + 1, tags.size()));
        while (!tag.empty() && ' ' == tag.front()) {
            tag.remove_prefix(1);
        }
        while (!tag.empty() && ' ' == tag.back()) {
            tag.remove_suffix(1);
        }
        if (!tag.empty()) {
            list.emplace_back(tag);
        }
    }
    return list;
}

}

Kernel::Counted<XMPTree const> DocumentMetadata::GetCurrentXMPTreeForExport(Kernel::Counted<DocumentController const>,
                                                                            ExportableInterface::ExportResult const * result,
                                                                            Raster::ExportOptions const *) const
{
    Kernel::Counted<XMPTree> const tree = Kernel::MakeCounted<XMPTree>();
    auto const add = [&tree](char const * name, XMPTree::Form form, String const & value) {
        if (!value.Empty()) {
            tree->Add(name, form, {value});
        }
    };
    add("dc:title", XMPTree::Form::LanguageAlternative, m_Values.m_Title);
    add("dc:creator", XMPTree::Form::Sequence, m_Values.m_Author);
    add("dc:description", XMPTree::Form::LanguageAlternative, m_Values.m_Subject);
    if (std::vector<String> tags = SplitTags(m_Values.m_Tags); !tags.empty()) {
        tree->Add("dc:subject", XMPTree::Form::Bag, std::move(tags));
        add("pdf:Keywords", XMPTree::Form::Text, m_Values.m_Tags);
    }
    add("dc:language", XMPTree::Form::Bag, m_Values.m_Language);
    bool const isTimed = result && !result->m_Time.Empty();
    String const & prepared = m_Values.m_Output.Empty() ? m_Values.m_Modified : m_Values.m_Output;
    String const & changed = isTimed ? result->m_Time : prepared;
    add("xmp:CreateDate", XMPTree::Form::Text, isTimed ? changed : m_Values.m_Created);
    add("xmp:ModifyDate", XMPTree::Form::Text, changed);
    add("xmp:MetadataDate", XMPTree::Form::Text, changed);
    add("xmp:CreatorTool", XMPTree::Form::Text, "Korvane Book");
    return tree;
}
