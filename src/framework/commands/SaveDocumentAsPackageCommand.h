#pragma once

#include "framework/commands/DocumentCommandBase.h"

/// Writes a copy of the document to a path and collects what it needs beside it, so that the folder can be moved to
/// another machine. The copy names collected pictures by their place in the package. The document itself stays as it
/// is, at its own path, and as dirty as it was; unsaved changes are in the copy.
class SaveDocumentAsPackageCommand : public PassingDocumentCommand
{
public:
    /// \param path of the copy; a file there is replaced
    /// \param pictures collect pictures and placed files
    /// \param fonts collect the fonts whose embedding flag allows it; see `PackageResourcesCommand`
    /// \param unusedFonts collect also fonts that only a style names and no text shows
    SaveDocumentAsPackageCommand(String const & path, bool pictures, bool fonts, bool unusedFonts)
        : m_Path(path),
          m_WantPictures(pictures),
          m_WantFonts(fonts),
          m_WantUnusedFonts(unusedFonts)
    {
    }

    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;
    void Do() override;
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> &) override {}
    [[nodiscard]] ProgressType GetProgressType() override { return ShowProgress; }

    /// How writing the copy went.
    [[nodiscard]] DocumentSaveResult const & GetResult() const { return m_Result; }
    /// A sentence for the user on each thing that could not be collected; the copy is whole all the same.
    [[nodiscard]] std::vector<String> const & GetProblems() const { return m_Problems; }

private:
    String const m_Path;
    bool const m_WantPictures;
    bool const m_WantFonts;
    bool const m_WantUnusedFonts;
    DocumentSaveResult m_Result;
    std::vector<String> m_Problems;
};
