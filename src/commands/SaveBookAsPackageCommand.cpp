#include "commands/SaveBookAsPackageCommand.h"

#include "core/BookCollection.h"
#include "framework/commands/PackageResourcesCommand.h"
#include "framework/commands/SaveDocumentAsPackageCommand.h"
#include "framework/document/DocumentController.h"
#include "framework/document/PackageManagerInfo.h"
#include "framework/kernel/FileSystem.h"
#include "framework/kernel/Format.h"
#include "framework/kernel/Path.h"
#include "framework/kernel/PathTraitsDos.h"

#include <algorithm>

namespace Book
{

KORVANE_DEFINE_BOOK_COMMAND(SaveBookAsPackageCommand, "SBaP");

namespace
{

/// The text before the last separator; empty if there is none, or if that is the first character.
String FolderOf(String const & path)
{
    std::size_t const separator = path.View().find_last_of("/\\");
    return separator == std::string_view::npos ? String() : String(path.View().substr(0, separator));
}

/// Holds a document's lock, for work that may throw.
class WriterLock
{
public:
    explicit WriterLock(DocumentController & document) : m_Document(document) { m_Document.AcquireWriterLock(); }
    ~WriterLock() { m_Document.ReleaseWriterLock(); }
    WriterLock(WriterLock const &) = delete;
    WriterLock & operator=(WriterLock const &) = delete;

private:
    DocumentController & m_Document;
};

}

SaveBookAsPackageCommand::SaveBookAsPackageCommand() = default;

SaveBookAsPackageCommand::SaveBookAsPackageCommand(String const & path,
                                                   std::vector<Kernel::Counted<BookChapter const>> chapters,
                                                   bool collectPictures, bool collectFonts, String const & extension)
    : m_Path(path),
      m_Chapters(std::move(chapters)),
      m_FirstFlag(collectPictures),
      m_SecondFlag(collectFonts),
      m_Extension(extension)
{
}

Kernel::LocalisedString SaveBookAsPackageCommand::GetDescription() const
{
    return Kernel::LocalisedString("Save Book As Package", "Book Command");
}

bool SaveBookAsPackageCommand::IsTaken(String const & path, std::set<String> const & used) const
{
    if (used.contains(PackageFolder::Fold(path)) || Kernel::FileSystem::IsFolder(path)) {
        return true;
    }
    // Never over a chapter of the book itself, whichever way its path is written.
    Kernel::FileSystem::Identity mine;
    if (!Kernel::FileSystem::GetIdentity(path, mine)) {
        return false;
    }
    BookController::ConstChapterList chapters;
    GetBookController()->GetChapters(chapters);
    return std::any_of(chapters.begin(), chapters.end(), [&mine](auto const & chapter) {
        Kernel::FileSystem::Identity other;
        return chapter && Kernel::FileSystem::GetIdentity(chapter->GetPath(), other) && other == mine;
    });
}

String SaveBookAsPackageCommand::ChooseTarget(String const & folder, String const & chapterPath,
                                              std::set<String> const & used) const
{
    String name = Kernel::Path::GetFileNameWithoutExtension(chapterPath);
    if (name.Empty()) {
        // Nothing but an extension: in the package the copy would have the folder's own name.
        name = "chapter";
    }
    for (int number = 1;; ++number) {
        String target = Kernel::PathTraitsDos::Append(folder, number == 1 ? name : Kernel::Format("%1-%2", name, number));
        if (!m_Extension.Empty() && Kernel::Path::GetExtension(target).Empty()) {
            target = target + (m_Extension.View().starts_with('.') ? m_Extension : "." + m_Extension);
        }
        if (!IsTaken(target, used)) {
            return target;
        }
    }
}

void SaveBookAsPackageCommand::Do()
{
    SetDirection(Forward);
    Kernel::Counted<BookController> const book = GetBookController();
    String const folder = FolderOf(m_Path);
    std::set<String> used;
    for (String const & path :
         {m_Path, Kernel::PathTraitsDos::Append(folder, PackageResourcesCommand::PictureFolder),
          Kernel::PathTraitsDos::Append(folder, PackageResourcesCommand::FontFolder)}) {
        used.insert(PackageFolder::Fold(path));
    }
    BookController::ChapterPaths packaged;
    for (Kernel::Counted<BookChapter const> const & chapter : m_Chapters) {
        if (!book->GetMutableChapter(chapter) || packaged.contains(chapter)) {
            continue;
        }
        String const path = chapter->GetPath();
        Kernel::Counted<DocumentController> const document = book->LoadChapterDocument(chapter, true, false);
        if (!document) {
            m_Problems.push_back(
                {path, Kernel::Format(Kernel::LocalisedString("The chapter \"%1\" can't be opened, so the package is "
                                                              "without it.",
                                                              "Package"),
                                      path)});
            continue;
        }
        String const target = ChooseTarget(folder, path, used);
        Kernel::Counted<SaveDocumentAsPackageCommand> const save =
            Kernel::MakeCounted<SaveDocumentAsPackageCommand>(target, m_FirstFlag, m_SecondFlag, false);
        String failure;
        try {
            // Here and not on the document's queue: the lock keeps others out for as long as it is read.
            WriterLock const lock(*document);
            save->PostDequeueWithMutableController(document);
            save->Do();
            failure = save->GetResult().GetText();
        } catch (std::exception const & exception) {
            failure = exception.what();
        }
        book->ReleaseChapterDocument(chapter, true);
        for (String const & problem : save->GetProblems()) {
            m_Problems.push_back({path, problem});
        }
        if (save->GetResult().IsSuccess()) {
            used.insert(PackageFolder::Fold(target));
            packaged[chapter] = target;
        } else {
            m_Problems.push_back({path, failure});
        }
    }
    // Nothing changes the book meanwhile: its queue is busy with this command.
    book->ReleaseWriterLock();
    book->SaveBookAsPackage(m_Result, m_Path, std::move(packaged));
    book->AcquireWriterLock();
}

void SaveBookAsPackageCommand::GetBookInfo(Kernel::Counted<BookController const> book,
                                           std::vector<Kernel::Counted<BookChapter const>> chapters,
                                           PackageManagerInfo & info)
{
    Kernel::Counted<BookController> const open = BookCollection::GetInstance().GetMutableBookController(book);
    for (Kernel::Counted<BookChapter const> const & chapter : chapters) {
        if (Kernel::Counted<DocumentController const> const document =
                open && chapter ? open->LoadChapterDocument(chapter, true, false) : nullptr) {
            PackageResourcesCommand::GetDocumentInfo(document, info);
            open->ReleaseChapterDocument(chapter, true);
        }
    }
}

}
