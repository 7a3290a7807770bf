#include "framework/commands/CommandException.h"
#include "framework/commands/ComposeTextCommand.h"
#include "framework/commands/CompoundCommand.h"
#include "framework/commands/ConvertFormatOrProfileCommand.h"
#include "framework/commands/IndexTopicCommands.h"
#include "framework/commands/ModifySectionCommand.h"
#include "framework/commands/PreflightCheckDocumentCommand.h"
#include "framework/commands/SaveDocumentCommand.h"
#include "framework/commands/SetMetadataTimestampCommand.h"
#include "framework/commands/StoryCommands.h"
#include "framework/commands/UndoCommand.h"
#include "framework/commands/UpdateRunningHeadersCommand.h"
#include "framework/document/VantraController.h"
#include "framework/kernel/BroadcastNotification.h"
#include "framework/story/FlowComposer.h"
#include "framework/story/NoteGlyphs.h"
#include "framework/story/SpecialGlyphs.h"
#include "support/DocumentBuilder.h"
#include "support/TemporaryFolder.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <mutex>

using testing::ElementsAre;
using testing::IsEmpty;

namespace
{

/// The short names of the notifications about one document, those that only tell of layout in brackets.
class Recorder : public BroadcastNotificationSink
{
public:
    explicit Recorder(DocumentController const & document) : m_Document(&document)
    {
        BroadcastNotification::RegisterBroadcastSink(this);
    }
    ~Recorder() override { BroadcastNotification::UnregisterBroadcastSink(this); }

    void Notify(Kernel::Counted<Kernel::Notification> notification) override
    {
        auto const * const about = dynamic_cast<DocumentNotification const *>(notification.Get());
        if (!about || about->GetDocumentController().Get() != m_Document) {
            return;
        }
        std::string const name = NameOf(*notification);
        auto const * const content = dynamic_cast<DocumentContentNotification const *>(notification.Get());
        std::lock_guard const lock(m_Lock);
        m_Names.push_back(content && content->IsLayoutOnly() ? "(" + name + ")" : name);
    }

    /// What came since the last call.
    std::vector<std::string> Take()
    {
        VantraController::GetInstance().WaitUntilIdle();
        std::lock_guard const lock(m_Lock);
        return std::exchange(m_Names, {});
    }

private:
    static std::string NameOf(Kernel::Notification const & notification)
    {
        if (dynamic_cast<PageStructureChangedNotification const *>(&notification)) {
            return "pages";
        }
        if (dynamic_cast<DocumentStructureChangedNotification const *>(&notification)) {
            return "structure";
        }
        if (dynamic_cast<StoryChangedNotification const *>(&notification)) {
            return "story";
        }
        if (dynamic_cast<AnchorsChangedNotification const *>(&notification)) {
            return "anchors";
        }
        if (dynamic_cast<IndexTopicsChangedNotification const *>(&notification)) {
            return "topics";
        }
        if (dynamic_cast<DocumentSectionAddedNotification const *>(&notification)) {
            return "section added";
        }
        if (dynamic_cast<DocumentSectionChangedNotification const *>(&notification)) {
            return "section";
        }
        if (dynamic_cast<PreflightResultsUpdatedNotification const *>(&notification)) {
            return "preflight";
        }
        if (dynamic_cast<DocumentSaveNotification const *>(&notification)) {
            return "save";
        }
        return typeid(notification).name();
    }

    DocumentController const * const m_Document;
    std::mutex m_Lock;
    std::vector<std::string> m_Names;
};

class DocumentCommandTest : public testing::Test
{
protected:
    /// A clean document in the background.
    void Open(DocumentBuilder & builder)
    {
        m_Path = m_Folder / "chapter.kvdoc";
        builder.BuildFile(m_Path);
        m_Document = LoadTestDocument(m_Path, nullptr);
        ASSERT_TRUE(m_Document);
    }
    void Run(Kernel::Counted<DocumentCommand> command)
    {
        VantraController::GetInstance().EnqueueCommandAndWait(std::move(command), m_Document, false);
    }
    [[nodiscard]] DocumentNode & Node() const { return *m_Document->GetDocument(); }
    [[nodiscard]] std::string Text() const
    {
        Story::Story const & story = *Node().GetMainFlow()->GetStory();
        return story.GetString(0, story.GetLength()).ToStd();
    }
    [[nodiscard]] Kernel::Counted<Selection const> Select(std::size_t begin, std::size_t end) const
    {
        return Kernel::MakeCounted<Selection>(Node().GetMainFlow(), begin, end);
    }

    TemporaryFolder m_Folder;
    String m_Path;
    Kernel::Counted<DocumentController> m_Document;
};

}

TEST_F(DocumentCommandTest, ASectionsNumberIsSetUndoneAndSetAgain)
{
    Open(DocumentBuilder().Paragraphs(20));
    int const pages = Node().GetPageCount();
    ASSERT_EQ(Node().GetSpreadAtIndex(0)->GetPageCount(), 1);

    Kernel::Counted<ModifySectionCommand> const command = Kernel::MakeCounted<ModifySectionCommand>(0);
    command->SetStartNumberingAt(24);
    Run(command);
    EXPECT_EQ(Node().GetFormattedPageNumber(0), "24");
    EXPECT_TRUE(m_Document->IsDirty());
    // An even number lies left: the pages take another shape, before the command counts as done, and keep their text.
    EXPECT_EQ(Node().GetSpreadAtIndex(0)->GetPageCount(), 2);
    EXPECT_EQ(Node().GetPageCount(), pages);

    Run(Kernel::MakeCounted<UndoCommand>());
    EXPECT_EQ(Node().GetFormattedPageNumber(0), "1");
    EXPECT_EQ(Node().GetSpreadAtIndex(0)->GetPageCount(), 1);
    Run(Kernel::MakeCounted<RedoCommand>());
    EXPECT_EQ(Node().GetFormattedPageNumber(0), "24");
    Run(Kernel::MakeCounted<RedoCommand>());
    EXPECT_EQ(Node().GetFormattedPageNumber(0), "24");
}

TEST_F(DocumentCommandTest, SectionsAreInsertedAndDeleted)
{
    Open(DocumentBuilder().Paragraphs(20));
    DocumentSection::Values values{2, 1, true, false, PageNumberFormat::RomanLower, ""};
    Run(Kernel::MakeCounted<InsertSectionCommand>(values));
    EXPECT_EQ(Node().GetFormattedPageNumber(3), "ii");
    EXPECT_FALSE(Node().GetSectionFromPageNumber(2)->GetIncludeOnExport());
    Run(Kernel::MakeCounted<DeleteSectionCommand>(2));
    EXPECT_EQ(Node().GetFormattedPageNumber(3), "4");
    Run(Kernel::MakeCounted<UndoCommand>());
    EXPECT_EQ(Node().GetFormattedPageNumber(3), "ii");
}

TEST_F(DocumentCommandTest, ACompoundIsOneStepAndUndoesItselfWhenAPartFails)
{
    Open(DocumentBuilder().Paragraph("Words."));
    auto const makeNumber = [](unsigned int page, unsigned int number) {
        Kernel::Counted<ModifySectionCommand> const command = Kernel::MakeCounted<ModifySectionCommand>(page);
        command->SetStartNumberingAt(number);
        return command;
    };
    Kernel::Counted<CompoundCommand> const both = Kernel::MakeCounted<CompoundCommand>(true, false, true);
    both->Add(makeNumber(0, 7), nullptr);
    both->Add(Kernel::MakeCounted<InsertTextCommand>("More ", Select(0, 0)), nullptr);
    Run(both);
    EXPECT_EQ(Text(), "More Words.\n");
    EXPECT_EQ(m_Document->GetHistory().GetUndoCount(), 1U);
    Run(Kernel::MakeCounted<UndoCommand>());
    EXPECT_EQ(Text(), "Words.\n");
    EXPECT_EQ(Node().GetFormattedPageNumber(0), "1");

    Kernel::Counted<CompoundCommand> const failing = Kernel::MakeCounted<CompoundCommand>(true, false, true);
    failing->Add(makeNumber(0, 9), nullptr);
    failing->Add(makeNumber(99, 9), nullptr);
    Run(failing);
    EXPECT_EQ(Node().GetFormattedPageNumber(0), "1");
    EXPECT_EQ(m_Document->GetHistory().GetUndoCount(), 0U);
}

TEST_F(DocumentCommandTest, WhatOnlyServesOutputLeavesTheDocumentClean)
{
    Open(DocumentBuilder().Title("Title").Paragraphs(3));
    Run(Kernel::MakeCounted<SetMetadataTimestampCommand>(SetMetadataTimestampCommand::Output, String()));
    Run(Kernel::MakeCounted<ComposeTextCommand>(true, nullptr));
    Run(Kernel::MakeCounted<UpdateRunningHeadersCommand>());
    Run(Kernel::MakeCounted<ConvertFormatOrProfileCommand>(Raster::Format::Cmyka8,
                                                           Raster::ICCManager::ICCProfileSet()));
    EXPECT_FALSE(m_Document->IsDirty());
    EXPECT_FALSE(m_Document->GetMetadata()->GetValues().m_Output.Empty());
    EXPECT_EQ(m_Document->GetFormat(), Raster::Format::Cmyka8);
}

TEST_F(DocumentCommandTest, UndoTakesAConversionOffAndNothingElse)
{
    Open(DocumentBuilder().Paragraph("Words."));
    Run(Kernel::MakeCounted<ConvertFormatOrProfileCommand>(Raster::Format::Cmyka8,
                                                           Raster::ICCManager::ICCProfileSet()));
    Run(Kernel::MakeCounted<InsertTextCommand>("Late ", Select(0, 0)));
    Run(Kernel::MakeCounted<UndoCommand>());
    EXPECT_EQ(m_Document->GetFormat(), Raster::Format::Rgba8);
    EXPECT_EQ(Text(), "Late Words.\n");
    Run(Kernel::MakeCounted<UndoCommand>());
    EXPECT_EQ(Text(), "Words.\n");
}

TEST_F(DocumentCommandTest, TextCommandsChangeTheTextAndItsPages)
{
    Open(DocumentBuilder().Paragraphs(20));
    int const pages = Node().GetPageCount();
    std::size_t const length = Node().GetMainFlow()->GetStory()->GetLength();
    Run(Kernel::MakeCounted<PasteStoryCommand>(
        Kernel::NonCounted<Story::Story const>(DocumentBuilder().Paragraphs(40).Text().Get()), nullptr, nullptr, false,
        Select(length, length)));
    EXPECT_LT(pages, Node().GetPageCount());
    EXPECT_EQ(static_cast<std::size_t>(Node().GetPageCount()), Node().GetMainFlow()->GetFrames().size());
    Run(Kernel::MakeCounted<UndoCommand>());
    EXPECT_EQ(pages, Node().GetPageCount());
    EXPECT_EQ(static_cast<std::size_t>(pages), Node().GetMainFlow()->GetFrames().size());
}

TEST_F(DocumentCommandTest, ANotesStartNumberIsChangedInPlace)
{
    Open(DocumentBuilder().Note("Claim", "Proof.", Story::NoteAtt::ThroughBook));
    Kernel::Counted<Story::NoteAtt> const att = Kernel::MakeCounted<Story::NoteAtt>();
    att->SetStartNumberingAt(12);
    att->SetNumberingMode(Story::NoteAtt::InDocument);
    Run(Kernel::MakeCounted<ChangeNoteCommand>(att, 8ULL, Select(5, 5)));
    Kernel::Counted<Story::NoteAtt const> const changed =
        Story::GetNoteAtt(Node().GetMainFlow()->GetStory()->GetGlyph(5));
    ASSERT_TRUE(changed);
    EXPECT_EQ(changed->GetStartNumberingAt(), 12);
    // Only the named field.
    EXPECT_EQ(changed->GetNumberingMode(), Story::NoteAtt::ThroughBook);
    EXPECT_EQ(Node().GetMainFlow()->GetLayout()->GetNotes()[0].m_Number, 12);
}

TEST_F(DocumentCommandTest, IndexTopicsAreChangedAndPutBack)
{
    Open(DocumentBuilder().IndexMark("Animals").IndexMark("Plants"));
    Kernel::Counted<Story::Index> const index = Node().GetIndex();
    auto const find = [&index](char const * name) { return index->FindTopicByName(name, false); };
    ASSERT_TRUE(find("Animals"));
    Run(Kernel::MakeCounted<Commands::SetIndexTopicGUIDCommand>(find("Animals"), "guid-a"));
    Run(Kernel::MakeCounted<Commands::ReparentIndexTopicCommand>(find("Plants"), find("Animals")));
    EXPECT_EQ(index->FindTopicByGUID("guid-a"), find("Animals"));
    EXPECT_FALSE(find("Plants"));
    Run(Kernel::MakeCounted<UndoCommand>());
    EXPECT_TRUE(find("Plants"));
    Run(Kernel::MakeCounted<Commands::DeleteIndexTopicCommand>(
        std::vector<Kernel::Counted<Story::IndexTopic const>>{find("Animals")}));
    EXPECT_EQ(index->GetTopicCount(), 1U);
    Run(Kernel::MakeCounted<UndoCommand>());
    EXPECT_EQ(index->FindTopicByGUID("guid-a"), find("Animals"));
    EXPECT_TRUE(find("Animals"));
    // One object for the document's life.
    EXPECT_EQ(index, Node().GetIndex());
}

TEST_F(DocumentCommandTest, IdentifyingAnAnchorMovesNothing)
{
    Open(DocumentBuilder().Anchor("lair", ""));
    Kernel::Counted<Story::AnchorData> const data = Story::CollectAnchors(*Node().GetMainFlow()->GetStory())[0].m_Data;
    Run(Kernel::MakeCounted<Commands::SetAnchorDataGUIDCommand>(data, "u-1"));
    EXPECT_EQ(data->GetUid(), "u-1");
    SaveTestDocument(*m_Document, String());
    m_Document->ShutDownArchive();
    Kernel::Counted<DocumentController> const again = LoadTestDocument(m_Path, nullptr);
    // The layout in the file still holds.
    EXPECT_FALSE(again->GetDocument()->GetMainFlow()->GetLayout()->HasGlyphData());
    EXPECT_EQ(Story::CollectAnchors(*again->GetDocument()->GetMainFlow()->GetStory())[0].m_Data->GetUid(), "u-1");
}

TEST_F(DocumentCommandTest, EachChangeTellsWhatItChanged)
{
    Open(DocumentBuilder().Paragraphs(6).IndexMark("Animals"));
    Recorder recorder(*m_Document);
    m_Document->SetWantNotifications(true);

    Kernel::Counted<ModifySectionCommand> const number = Kernel::MakeCounted<ModifySectionCommand>(0);
    number->SetStartNumberingAt(3);
    Run(number);
    EXPECT_THAT(recorder.Take(), ElementsAre("section"));

    Kernel::Counted<ModifySectionCommand> const parity = Kernel::MakeCounted<ModifySectionCommand>(0);
    parity->SetStartNumberingAt(4);
    Run(parity);
    EXPECT_THAT(recorder.Take(), ElementsAre("section", "pages", "(structure)", "(story)", "(anchors)"));

    Run(Kernel::MakeCounted<InsertTextCommand>("X", Select(0, 0)));
    EXPECT_THAT(recorder.Take(), ElementsAre("story", "anchors", "(story)", "(anchors)"));

    Run(Kernel::MakeCounted<Commands::RenameIndexTopicCommand>(Node().GetIndex()->FindTopicByName("Animals", false),
                                                               "Beasts"));
    EXPECT_THAT(recorder.Take(), testing::Contains("topics"));

    Run(Kernel::MakeCounted<PreflightCheckDocumentCommand>(PreflightForOperation::Check));
    EXPECT_THAT(recorder.Take(), ElementsAre("preflight"));

    Run(Kernel::MakeCounted<SaveDocumentCommand>(false, true));
    EXPECT_THAT(recorder.Take(), ElementsAre("save"));
    EXPECT_FALSE(m_Document->IsDirty());

    Run(Kernel::MakeCounted<ComposeTextCommand>(false, nullptr));
    EXPECT_THAT(recorder.Take(), IsEmpty());

    m_Document->SetWantNotifications(false);
    Run(Kernel::MakeCounted<InsertTextCommand>("Y", Select(0, 0)));
    EXPECT_THAT(recorder.Take(), IsEmpty());
}

TEST_F(DocumentCommandTest, MarksFollowTheirRenamedTopic)
{
    Open(DocumentBuilder().IndexMark("Animals"));
    Run(Kernel::MakeCounted<Commands::RenameIndexTopicCommand>(Node().GetIndex()->FindTopicByName("Animals", false),
                                                               "Beasts"));
    auto const markedTopic = [this] {
        Kernel::Counted<Story::Glyph const> const glyph = Node().GetMainFlow()->GetStory()->GetGlyph(0);
        return dynamic_cast<Story::IndexMarkGlyph const &>(*glyph).GetTopicNameWithParents();
    };
    EXPECT_EQ(markedTopic(), "Beasts");
    Run(Kernel::MakeCounted<UndoCommand>());
    EXPECT_EQ(markedTopic(), "Animals");
}

TEST_F(DocumentCommandTest, PreflightFindsWhatWouldSpoilTheOutput)
{
    DocumentBuilder builder;
    String const source = m_Folder.WriteFile("fox.png", "not what it was");
    auto const bytes = std::make_shared<std::vector<unsigned char> const>(std::vector<unsigned char>{1, 2, 3});
    builder.Settings().m_Pictures.push_back({bytes, {source, Kernel::TimeStamp(7), 0}});
    Story::AttSet family;
    family.SetString(Story::GlyphAtt::Families, "No Such Family");
    Kernel::Counted<Story::StyleSheet> const styles = builder.Settings().m_Styles->Clone();
    styles->SetDefaults(family, {});
    builder.Settings().m_Styles = styles;
    builder.Picture(DocumentPictures::IdOf(*bytes), 10, 10).Paragraph("Words in another font.");
    Open(builder);
    EXPECT_FALSE(m_Document->GetPreflightResults());
    Run(Kernel::MakeCounted<PreflightCheckDocumentCommand>(PreflightForOperation::Check));
    ASSERT_TRUE(m_Document->GetPreflightResults());
    std::vector<PreflightResult::Problem> problems;
    for (PreflightResult const & result : m_Document->GetPreflightResults()->GetResults()) {
        problems.push_back(result.m_Problem);
    }
    EXPECT_THAT(problems, testing::Contains(PreflightResult::Problem::ChangedPicture));
    EXPECT_THAT(problems, testing::Contains(PreflightResult::Problem::MissingFont));
    EXPECT_EQ(m_Document->GetPreflightResults()->GetSummary().m_Status, PreflightResult::Status::Error);
}

TEST_F(DocumentCommandTest, AChangedDocumentThatCannotBeSavedIsKeptBesideItsFile)
{
    Open(DocumentBuilder().Paragraph("Words."));
    Run(Kernel::MakeCounted<InsertTextCommand>("Precious ", Select(0, 0)));
    // Another holder of the file, as another program would be.
    Kernel::Counted<DocumentController> const other = LoadTestDocument(m_Path, nullptr);
    Kernel::Counted<SaveDocumentCommand> const save = Kernel::MakeCounted<SaveDocumentCommand>(false, false);
    save->m_KeepOnFailure = true;
    Run(save);
    EXPECT_FALSE(save->GetResult().IsSuccess());
    EXPECT_TRUE(m_Document->IsDirty());
    Kernel::Counted<DocumentController> const kept = LoadTestDocument(m_Path + ".unsaved-1", nullptr);
    ASSERT_TRUE(kept);
    Story::Story const & story = *kept->GetDocument()->GetMainFlow()->GetStory();
    EXPECT_EQ(story.GetString(0, story.GetLength()), "Precious Words.\n");
}
