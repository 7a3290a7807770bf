#include "app/Language.h"

#include "framework/kernel/LocalisedString.h"

#include <clocale>
#include <cstdlib>
#include <string_view>

namespace App
{

namespace fs = std::filesystem;

namespace
{

/// The language that the environment asks for; empty for none.
std::string_view WantedLanguage()
{
    for (char const * const name : {"LC_ALL", "LC_MESSAGES", "LANG"}) {
        if (char const * const value = std::getenv(name); value && *value) {
            return value;
        }
    }
    return {};
}

}

fs::path FindTranslations(fs::path const & program)
{
    fs::path const folder = program.parent_path();
    for (fs::path const & base : {folder.parent_path(), folder.parent_path().parent_path()}) {
        std::error_code error;
        if (fs::is_directory(base / "share" / "locale", error)) {
            return base / "share" / "locale";
        }
    }
    return {};
}

void ChooseLanguage()
{
    // The system's own sentences come in these characters, or with question marks in their place.
    std::setlocale(LC_CTYPE, "C.UTF-8");
    if (!std::setlocale(LC_MESSAGES, "")) {
        // The system lacks this locale. Its texts are ours, so only the name is needed; but gettext translates nothing
        // in the plain C locale, and everything in any other one, by the languages that LANGUAGE lists.
        std::string_view const wanted = WantedLanguage();
        if (!wanted.empty() && "C" != wanted && "POSIX" != wanted && std::setlocale(LC_MESSAGES, "C.UTF-8")) {
            setenv("LANGUAGE", std::string(wanted).c_str(), 0);
        }
    }
    std::error_code error;
    fs::path const translations = FindTranslations(fs::read_symlink("/proc/self/exe", error));
    if (!translations.empty()) {
        Kernel::SetTranslationFolder(String(translations.string()));
    }
}

}
