#pragma once

#include "framework/commands/DocumentCommandBase.h"
#include "framework/commands/PackageFolder.h"
#include "framework/document/DocumentLinks.h"
#include "framework/document/PackageManagerInfo.h"
#include "framework/kernel/PathTraitsDos.h"

/// Collects copies of what a document needs beside its own file in a folder: pictures in "Pictures", fonts in "Fonts".
/// Both are made as needed; the folder itself must be there. The document stays as it is.
///
/// A file of another content that has the name already keeps it, and the new one takes a number. An SVG that shows
/// other files goes into a folder of its own in "Pictures", with these in their places beside it.
///
/// A font goes along only if its embedding flag (OS/2 fsType) lets others edit with it: those for viewing and printing
/// alone, and restricted ones, stay behind. A missing font is told of, and the one that stands in for it goes along, so
/// that the pages stay as they are.
class PackageResourcesCommand : public PassingDocumentCommand
{
public:
    static constexpr char const * PictureFolder = "Pictures";
    static constexpr char const * FontFolder = "Fonts";

    /// \param folder of the package, without a separator at its end; empty for the working directory
    /// \param pictures collect pictures and placed files
    /// \param fonts collect fonts
    /// \param unusedFonts collect also fonts that only a style names and no text shows
    PackageResourcesCommand(String folder, bool pictures, bool fonts, bool unusedFonts)
        : m_Folder(std::move(folder)),
          m_WantPictures(pictures),
          m_WantFonts(fonts),
          m_WantUnusedFonts(unusedFonts),
          m_Pictures(Kernel::PathTraitsDos::Append(m_Folder, PictureFolder)),
          m_Fonts(Kernel::PathTraitsDos::Append(m_Folder, FontFolder))
    {
    }

    /// Adds one document's resources to the info. Any thread; takes the document's reader lock.
    static void GetDocumentInfo(Kernel::Counted<DocumentController const> const & document, PackageManagerInfo & info);

    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;
    void Do() override;
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> &) override {}

    /// Where the copies are, as a document in the package's folder names them.
    [[nodiscard]] DocumentLinks const & GetLinks() const { return m_Links; }
    /// A sentence for the user on each thing that could not be collected.
    [[nodiscard]] std::vector<String> const & GetProblems() const { return m_Problems; }

private:
    void CollectPicture(PackageManagerInfo::Picture const & picture);
    void CollectFont(PackageManagerInfo::Font const & font);
    /// A picture with the files that it shows, all by their ways from its folder. `path` is where it was taken from.
    std::vector<PackageFolder::File> GatherDrawing(PackageFolder::File const & first, String const & path);
    void TellUnreadPicture(String const & path);

    String const m_Folder;
    bool const m_WantPictures;
    bool const m_WantFonts;
    bool const m_WantUnusedFonts;
    PackageFolder m_Pictures;
    PackageFolder m_Fonts;
    DocumentLinks m_Links;
    std::vector<String> m_Problems;
};
