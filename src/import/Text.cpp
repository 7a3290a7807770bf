#include "import/Text.h"

#include <libintl.h>

namespace Import
{

String ChooseForm(char const * one, char const * many, char const * context, unsigned long count)
{
    // A catalogue's key is context, end-of-transmission byte, text.
    std::string const key = std::string(context) + '\004' + one;
    char const * const found = dngettext(Kernel::TranslationDomain, key.c_str(), many, count);
    return found == key.c_str() ? String(one) : String(found);
}

}
