#pragma once

#include "framework/kernel/Counted.h"
#include "framework/typeset/FontFace.h"

#include <map>
#include <memory>
#include <mutex>
#include <span>
#include <string>
#include <tuple>
#include <unordered_map>
#include <vector>

namespace Typeset
{

class FontCatalogue;

/// What a search for a face found.
struct FontMatch
{
    Kernel::Counted<FontFace const> m_Face; ///< Null only when the machine has no usable font at all.
    bool m_FamilyFound = true;              ///< False: the family is missing and this is a substitute. Tell the user.
    bool m_StyleFound = true;               ///< False: the family lacks the weight or the slope that was asked for.
};

/// All faces in use in this process. Singleton; any thread. Making it costs nothing: the catalogue of installed fonts
/// is read from fontconfig (a few milliseconds) when a family is first looked for by name. A process that only loads
/// fonts by file and hash never reads it.
///
/// A face once loaded stays for the life of the process.
class FontLibrary
{
public:
    [[nodiscard]] static FontLibrary & GetInstance();

    /// The installed face of that family (compared without case) nearest in slope, then weight (CSS Fonts 4, 5.2),
    /// then optical size; of equal copies, the one with the least path. `size` in points chooses between optical
    /// sizes; 0 stands for 11. "serif", "sans-serif" and "monospace" are families that always exist.
    [[nodiscard]] FontMatch Find(String const & family, int weight, bool italic, double size = 0);

    /// The first family of the list that is installed. m_FamilyFound tells about the first one.
    [[nodiscard]] FontMatch Find(std::span<String const> families, int weight, bool italic, double size = 0);

    /// A face pinned by a saved document: the file at `path` if its content has that hash, else any installed file
    /// that has it (fonts move between machines and releases). Null if there is none.
    [[nodiscard]] Kernel::Counted<FontFace const> FromFileAndHash(String const & path, unsigned index,
                                                                  ContentHash const & hash);

    /// A face of the file, whether installed or not. Null if it is no usable font.
    [[nodiscard]] Kernel::Counted<FontFace const> FromFile(String const & path, unsigned index);

    /// Faces of this folder's files serve where the machine has none of the family, or not the file that a document was
    /// set with, and where no installed font has a character. A folder that is not there is passed over.
    void AddFolder(String const & folder);

    /// A face that has the character, for text whose own fonts lack it. The order is fixed: faces of the same kind as
    /// `beside` (serif or sans) for the character's script, then DejaVu, then whatever fontconfig knows, by path.
    /// `language` (BCP 47) decides between Chinese, Japanese and Korean forms. Null if no installed font has it.
    [[nodiscard]] Kernel::Counted<FontFace const> FindFallback(char32_t character, String const & language,
                                                               FontFace const & beside);

private:
    FontLibrary();
    ~FontLibrary();

    struct FileKey
    {
        std::uint64_t m_Device = 0;
        std::uint64_t m_Inode = 0;
        std::int64_t m_Modified = 0;
        std::int64_t m_Size = 0;
        unsigned m_Index = 0;
        friend auto operator<=>(FileKey const &, FileKey const &) noexcept = default;
    };

    FontCatalogue & GetCatalogue();
    /// What `look` finds first in the added folders; null if nothing.
    template <typename TLook>
    Kernel::Counted<FontFace const> LookInFolders(TLook const & look);
    Kernel::Counted<FontFace const> LoadLocked(String const & path, unsigned index);
    FontMatch FindLocked(String const & family, int weight, bool italic, double size);

    std::mutex m_Lock; ///< Guards all below.
    std::unique_ptr<FontCatalogue> m_Catalogue;
    std::map<String, std::unique_ptr<FontCatalogue>> m_Folders; ///< Null: not looked into yet.
    std::map<FileKey, Kernel::Counted<FontFace const>> m_ByFile;
    std::map<std::pair<ContentHash, unsigned>, Kernel::Counted<FontFace const>> m_ByHash;
    std::map<std::tuple<std::string, int, bool, double>, FontMatch> m_Matches;
    std::map<std::tuple<char32_t, std::string, bool, int, bool>, Kernel::Counted<FontFace const>> m_Fallbacks;
};

}
