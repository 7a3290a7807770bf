#pragma once

#include "framework/kernel/LocalisedString.h"
#include "framework/raster/Picture.h"
#include "framework/story/PictureGlyph.h"
#include "import/ChapterText.h"
#include "import/Message.h"
#include "import/WorkState.h"

#include <filesystem>
#include <functional>
#include <map>

class DocumentPictures;

namespace Import
{

/// Gives the password of a protected file, by its path; empty if none is known. `isWrong` says that the one given before
/// did not open the file. Called on any thread of the importer, one call at a time.
using PasswordSource = std::function<std::string(std::string const & path, bool isWrong)>;

/// Takes the pictures of one chapter into its document. A picture that can't be set becomes a marked box with the
/// reason in it, and a message. Used by one thread.
class PictureLoader
{
public:
    /// `chapter` is the chapter's file, `shownName` what messages call it. `passwords` may be empty. Borrows all but the
    /// first two.
    PictureLoader(std::filesystem::path const & chapter, std::string shownName, DocumentPictures & pictures,
                  std::map<std::string, KnownFile> & known, PasswordSource const & passwords, MessageList & messages);

    [[nodiscard]] Story::PictureGlyph::Fields Load(Picture const & picture);

private:
    /// What a file gave; kept so that a picture that stands in many places is read once.
    struct Loaded
    {
        /// A `PictureReference`.
        std::string m_DataId;
        double m_Width = 0;
        double m_Height = 0;
        /// Why the picture can't be shown, with %1 for its path and %2 for what the reader says; empty if it can.
        Kernel::LocalisedString m_Problem;
        std::string m_Kind;
        /// What the reader says, with %1 for its detail.
        Kernel::LocalisedString m_What;
        String m_Detail;
    };

    [[nodiscard]] Loaded Read(std::string const & path, Picture const & picture);
    [[nodiscard]] Loaded ReadPixels(Raster::Picture::Bytes const & bytes, std::string const & path,
                                    Picture const & picture);
    [[nodiscard]] Loaded ReadDrawing(Raster::Picture::Bytes const & bytes, std::string const & path,
                                     Picture const & picture);

    std::filesystem::path m_Folder;
    std::string m_ShownName;
    DocumentPictures & m_Pictures;
    std::map<std::string, KnownFile> & m_Known;
    PasswordSource const & m_Passwords;
    MessageList & m_Messages;
    /// By path and page.
    std::map<std::pair<std::string, int>, Loaded> m_Loaded;
};

}
