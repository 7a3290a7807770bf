#pragma once

#include <filesystem>

namespace App
{

/// The folder of the message catalogues that belong to the program at `program`: "share/locale" beside the folder of an
/// installed program, or two levels up in a build tree. Empty if there is none.
std::filesystem::path FindTranslations(std::filesystem::path const & program);

/// Makes the program speak the language that the environment asks for (LANGUAGE, LC_ALL, LC_MESSAGES, LANG, as gettext
/// reads them). The language needs no locale of that name on the system: a container without any still speaks it. For
/// the start of the program, before there are threads.
void ChooseLanguage();

}
