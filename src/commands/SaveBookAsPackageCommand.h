#pragma once

#include "commands/BookCommand.h"
#include "framework/document/DocumentSaveResult.h"

#include <set>

class PackageManagerInfo;

namespace Book
{

/// Writes a copy of the whole publication into one folder, which can be moved to another machine and opened there: the
/// book file, a copy of each chapter beside it, and what the chapters need in "Pictures" and "Fonts". In the package
/// the book names its chapters, and the chapters their pictures, by their place in the package.
///
/// The folder must be there. A chapter's copy has the chapter's file name; where that is taken in the package, or is
/// the file of a chapter itself, the copy takes a number, so that no chapter's content is lost. A chapter that can't be
/// opened or written is passed by: it keeps its old path in the package, and `GetProblems` tells of it.
///
/// Afterwards the open book is the package's book file, clean, and its chapters are those that it had: their paths
/// never change for who reads them.
class SaveBookAsPackageCommand final : public BookCommand
{
    KORVANE_BOOK_COMMAND(SaveBookAsPackageCommand);

public:
    /// Something that is missing in the package.
    struct Problem
    {
        /// The chapter's own path.
        String m_Path;
        /// A sentence for the user.
        String m_Text;
    };

    /// \param path of the package's book file
    /// \param chapters those to copy; others keep their paths in the package
    /// \param collectPictures the chapters' pictures and placed files go along
    /// \param collectFonts their fonts go along, as far as the fonts' embedding flags allow; they are used where the
    ///     other machine lacks them
    /// \param extension of the chapters' copies, with or without its dot; empty for none
    SaveBookAsPackageCommand(String const & path, std::vector<Kernel::Counted<BookChapter const>> chapters,
                             bool collectPictures, bool collectFonts, String const & extension);

    /// Adds what these chapters need beside their files to the info; a chapter that can't be opened adds nothing. Waits
    /// for the chapters' documents, so not on a thread that holds a lock of theirs.
    static void GetBookInfo(Kernel::Counted<BookController const> book,
                            std::vector<Kernel::Counted<BookChapter const>> chapters, PackageManagerInfo & info);

    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;
    void Do() override;
    [[nodiscard]] ProgressType GetProgressType() override { return ShowProgress; }

    /// How writing the book file went. For its caller, once the command is done.
    [[nodiscard]] DocumentSaveResult const & GetResult() const { return m_Result; }
    [[nodiscard]] std::vector<Problem> const & GetProblems() const { return m_Problems; }

protected:
    SaveBookAsPackageCommand();

private:
    /// `used`: paths of the package that are given away, folded.
    [[nodiscard]] bool IsTaken(String const & path, std::set<String> const & used) const;
    [[nodiscard]] String ChooseTarget(String const & folder, String const & chapterPath,
                                      std::set<String> const & used) const;

    String m_Path;
    std::vector<Kernel::Counted<BookChapter const>> m_Chapters;
    bool m_FirstFlag = false;
    bool m_SecondFlag = false;
    String m_Extension;
    DocumentSaveResult m_Result;
    std::vector<Problem> m_Problems;
};

}
