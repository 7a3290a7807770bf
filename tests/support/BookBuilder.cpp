#include "support/BookBuilder.h"

#include "commands/AddChapterCommand.h"
#include "commands/CloseBookCommand.h"
#include "commands/LoadBookCommand.h"
#include "commands/NewBookCommand.h"
#include "core/BookCollection.h"
#include "framework/document/DocumentSaveResult.h"
#include "framework/document/DocumentSettings.h"
#include "framework/document/VantraController.h"
#include "framework/kernel/FileSystem.h"
#include "framework/kernel/Format.h"
#include "framework/story/AnchorData.h"
#include "framework/story/NoteAtt.h"
#include "framework/story/NoteGlyphs.h"
#include "framework/story/ParagraphAtts.h"
#include "framework/story/SpecialGlyphs.h"
#include "framework/story/StoryBuilder.h"

#include <gtest/gtest.h>

using Kernel::Counted;
using Kernel::MakeCounted;

namespace
{

DocumentSettings SettingsOf(ChapterSketch const & sketch)
{
    DocumentSettings settings;
    settings.m_PageSetup.m_FacingPages = sketch.m_FacingPages;
    settings.m_PageSetup.m_FirstMaster = "First";
    settings.m_PageSetup.m_BodyMaster = "Body";
    for (char const * const name : {"First", "Body"}) {
        MasterSettings master;
        master.m_Name = name;
        master.m_Left.m_TextRect = {50, 50, 370, 540};
        master.m_Right.m_TextRect = {50, 50, 370, 540};
        settings.m_Masters.push_back(master);
    }
    settings.m_Styles = MakeCounted<Story::StyleSheet>();
    settings.m_Metadata.m_Title = String(sketch.m_Title);
    settings.m_Metadata.m_Language = "en-GB";
    settings.m_Format = sketch.m_Format;
    settings.m_Sections = {sketch.m_Section};
    return settings;
}

Counted<Story::Story> NoteText()
{
    Story::StoryBuilder builder;
    builder.AppendText("A note.", nullptr);
    builder.EndParagraph(nullptr);
    return builder.Finish();
}

Counted<Story::Story> TextOf(ChapterSketch const & sketch)
{
    Story::AttSet newPage;
    newPage.SetInt(Story::ParagraphAtt::PageBreakBefore, 1);
    auto const onNewPage = MakeCounted<Story::ParagraphAtts const>(newPage, Story::AttSet(), nullptr);
    auto const bookNote = MakeCounted<Story::NoteAtt>();
    bookNote->SetNumberingMode(Story::NoteAtt::ThroughBook);

    Story::StoryBuilder builder;
    for (std::string const & anchor : sketch.m_Anchors) {
        builder.AppendObject(
            MakeCounted<Story::AnchorGlyph>(MakeCounted<Story::AnchorData>(String(anchor), false, false, String())),
            nullptr);
    }
    for (std::string const & topic : sketch.m_Topics) {
        builder.AppendObject(MakeCounted<Story::IndexMarkGlyph>(String(topic)), nullptr);
    }
    for (int note = 0; note < sketch.m_BookEndnotes; ++note) {
        builder.AppendText("Noted", nullptr);
        builder.AppendObject(MakeCounted<Story::PinnoteGlyph>(bookNote, NoteText()), nullptr);
    }
    for (int page = 0; page < sketch.m_Pages; ++page) {
        builder.AppendText("Page " + std::to_string(page + 1), nullptr);
        builder.EndParagraph(page == 0 ? nullptr : onNewPage);
    }
    return builder.Finish();
}

}

BookBuilder::~BookBuilder()
{
    while (!m_Books.empty()) {
        CloseBook(m_Books.back());
    }
    Rest();
}

String BookBuilder::WriteChapter(std::string const & name, ChapterSketch const & sketch)
{
    String const path = m_Folder / name;
    if (Kernel::FileSystem::Exists(path)) {
        Rest(); // A pass over the book may hold the file.
    }
    Counted<DocumentController> const document = DocumentController::CreateDocument(SettingsOf(sketch), TextOf(sketch));
    document->SetRestricted(sketch.m_Restricted);
    DocumentSaveResult result;
    document->SaveDocument(result, path);
    EXPECT_TRUE(result.IsSuccess()) << path << ": " << result.GetText();
    document->ShutDownArchive();
    return path;
}

Counted<Book::BookController> BookBuilder::NewBook()
{
    auto const command = MakeCounted<Book::NewBookCommand>();
    VantraController::GetInstance().EnqueueCommand(command);
    m_Books.push_back(command->GetBookController());
    return m_Books.back();
}

Counted<Book::BookController> BookBuilder::NewBook(std::vector<String> const & paths)
{
    auto const book = NewBook();
    Run(book, MakeCounted<Book::AddChapterCommand>(paths, nullptr));
    return book;
}

Counted<Book::BookController> BookBuilder::LoadBook(String const & path)
{
    auto const command = MakeCounted<Book::LoadBookCommand>(path);
    VantraController::GetInstance().EnqueueCommand(command);
    if (command->GetBookController()) {
        m_Books.push_back(command->GetBookController());
    }
    return command->GetBookController();
}

void BookBuilder::CloseBook(Counted<Book::BookController> const & book)
{
    Counted<Book::BookController> const closing = book;
    VantraController::GetInstance().EnqueueCommandAndWait(MakeCounted<Book::CloseBookCommand>(closing));
    closing->WaitUntilCommandQueueEmpty();
    Book::BookCollection::GetInstance().RemoveBookController(closing);
    std::erase(m_Books, closing);
}

void BookBuilder::Run(Counted<Book::BookController> const & book, Counted<Book::BookCommand> command)
{
    Book::BookCollection::GetInstance().EnqueueCommandAndWait(std::move(command), book);
}

void BookBuilder::Rest()
{
    VantraController::GetInstance().WaitUntilIdle();
}

std::string BookBuilder::Names(Book::BookController const & book)
{
    Book::BookController::ConstChapterList chapters;
    book.GetChapters(chapters);
    std::string names;
    for (auto const & chapter : chapters) {
        names += (names.empty() ? "" : " ") + (chapter ? chapter->GetName().ToStd() : "(null)");
    }
    return names;
}

std::string BookBuilder::Starts(Book::BookController const & book)
{
    Book::BookController::ConstChapterList chapters;
    book.GetChapters(chapters);
    std::string starts;
    for (auto const & chapter : chapters) {
        starts += (starts.empty() ? "" : " ") + std::to_string(chapter->GetStartFromPage());
    }
    return starts;
}
