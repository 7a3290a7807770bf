#include "import/LinkTarget.h"

#include "import/MarkdownTree.h"
#include "import/SourceText.h"

#include <algorithm>
#include <cstdio>
#include <filesystem>

namespace Import
{

namespace
{

bool HasScheme(std::string_view target)
{
    std::size_t const colon = target.find(':');
    if (std::string_view::npos == colon || colon < 2) {
        return false;
    }
    return std::all_of(target.begin(), target.begin() + static_cast<std::ptrdiff_t>(colon), [](char c) {
        return ('a' <= c && c <= 'z') || ('A' <= c && c <= 'Z') || ('0' <= c && c <= '9') || '+' == c || '-' == c ||
               '.' == c;
    });
}

bool IsChapter(std::vector<std::string> const & chapters, std::string const & name)
{
    return std::binary_search(chapters.begin(), chapters.end(), name);
}

/// Two 64-bit hashes as a UUID of version 8 (RFC 9562: bits by the maker's own rule).
std::string MakeUuid(std::string_view space, std::string_view first, std::string_view second)
{
    std::string text(space);
    text.append(1, '\0').append(first).append(1, '\0').append(second);
    std::uint64_t const a = HashBytes(text, 1);
    std::uint64_t const b = HashBytes(text, 2);
    char uuid[37];
    std::snprintf(uuid, sizeof uuid, "%08x-%04x-8%03x-%04x-%012llx", static_cast<unsigned>(a >> 32),
                  static_cast<unsigned>(a >> 16 & 0xFFFF), static_cast<unsigned>(a & 0xFFF),
                  static_cast<unsigned>(0x8000 | (b >> 48 & 0x3FFF)),
                  static_cast<unsigned long long>(b & 0xFFFFFFFFFFFFu));
    return uuid;
}

}

LinkTarget ReadLinkTarget(std::string_view target, std::string_view from, std::vector<std::string> const & chapters)
{
    LinkTarget result;
    if (HasScheme(target) || target.starts_with("//")) {
        bool const isMail = target.starts_with("mailto:");
        result.m_Kind = isMail ? LinkTarget::Kind::Mail : LinkTarget::Kind::Web;
        result.m_Address = target.substr(isMail ? 7 : 0);
        return result;
    }
    std::size_t const hash = target.find('#');
    std::string const path = DecodePercent(target.substr(0, hash));
    result.m_Id = std::string_view::npos == hash ? std::string() : DecodePercent(target.substr(hash + 1));
    if (path.empty()) {
        result.m_Kind = LinkTarget::Kind::Chapter;
        result.m_Chapter = from;
        return result;
    }
    std::filesystem::path const whole = (std::filesystem::path(from).parent_path() / path).lexically_normal();
    std::string name = whole.generic_string();
    if (!IsChapter(chapters, name) && ".html" == whole.extension()) {
        for (char const * extension : {".md", ".markdown"}) {
            std::string const candidate = std::filesystem::path(whole).replace_extension(extension).generic_string();
            name = IsChapter(chapters, candidate) ? candidate : name;
        }
    }
    if (IsChapter(chapters, name)) {
        result.m_Kind = LinkTarget::Kind::Chapter;
        result.m_Chapter = name;
    } else {
        result.m_Address = name;
    }
    return result;
}

std::string MakeAnchorUid(std::string_view chapter, std::string_view id)
{
    return MakeUuid("anchor", chapter, id);
}

std::string MakeTopicGuid(std::string_view nameWithParents)
{
    return MakeUuid("topic", nameWithParents, {});
}

}
