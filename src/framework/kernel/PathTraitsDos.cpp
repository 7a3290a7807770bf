#include "framework/kernel/PathTraitsDos.h"

#include "framework/kernel/Path.h"

#include <cstring>
#include <string>

namespace Kernel
{

unsigned long long PathTraitsDos::Append(char * buffer, char const * part, unsigned long long pathLength,
                                         unsigned long long partLength, unsigned long long capacity)
{
    std::string_view const path(buffer, pathLength);
    bool const both = pathLength != 0 && partLength != 0;
    bool const before = both && Path::IsSeparator(path.back());
    bool const after = both && Path::IsSeparator(part[0]);
    unsigned long long const skipped = before && after ? 1 : 0;
    unsigned long long const added = both && !before && !after ? 1 : 0;
    unsigned long long const length = pathLength + added + partLength - skipped;
    if (capacity <= length) {
        return length;
    }
    if (added != 0) {
        // A path written with `\` alone goes on with it; all others go on with the system's own separator.
        bool const backslash = path.find('/') == std::string_view::npos && path.find('\\') != std::string_view::npos;
        buffer[pathLength] = backslash ? '\\' : '/';
    }
    std::memmove(buffer + pathLength + added, part + skipped, partLength - skipped);
    buffer[length] = 0;
    return length;
}

String PathTraitsDos::Append(String const & path, String const & part)
{
    std::string joined = path.ToStd();
    joined.resize(path.Length() + part.Length() + 2);
    joined.resize(Append(joined.data(), part.Data(), path.Length(), part.Length(), joined.size()));
    return String(joined);
}

}
