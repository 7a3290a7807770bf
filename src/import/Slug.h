#pragma once

#include <map>
#include <string>
#include <string_view>

namespace Import
{

/// Anchor that a heading's text makes, by the rule that GitHub and mdBook share: lower case, letters, digits, "_" and
/// "-" kept, each space a "-", all else left out.
std::string MakeSlug(std::string_view text);

/// Numbers repeated slugs: the second "use" is "use-1". A plain value for one chapter.
class SlugCounter
{
public:
    std::string MakeUnique(std::string slug);
    /// Marks an id as taken; false if it was.
    bool Take(std::string const & id);

private:
    std::map<std::string, int, std::less<>> m_Taken;
};

}
