#include "framework/commands/StoryCommands.h"

#include "framework/commands/CommandException.h"
#include "framework/kernel/Utf.h"
#include "framework/story/FlowComposer.h"
#include "framework/story/GlyphCloneContext.h"
#include "framework/story/NoteGlyphs.h"
#include "framework/story/StoryBuilder.h"

namespace
{

CommandRegistration const s_Format(typeid(FormatTextCommand), "FormatTextCommand");
CommandRegistration const s_Note(typeid(ChangeNoteCommand), "ChangeNoteCommand");
CommandRegistration const s_Paste(typeid(PasteStoryCommand), "PasteStoryCommand");
CommandRegistration const s_Insert(typeid(InsertTextCommand), "InsertTextCommand");
CommandRegistration const s_Styles(typeid(SetStyleSheetCommand), "SetStyleSheetCommand");
CommandRegistration const s_Anchor(typeid(Commands::SetAnchorDataGUIDCommand), "Commands::SetAnchorDataGUIDCommand");

}

StoryCommand::~StoryCommand() = default;

void StoryCommand::Do()
{
    if (!m_Selection || !m_Selection->IsText()) {
        throw CommandException(Kernel::LocalisedString("There is no text selected.", "Text commands").ToString());
    }
    Story::Story & story = *m_Selection->GetTextFlow()->GetStory();
    m_Other = story.Clone();
    try {
        Change(story);
    } catch (CommandException const &) {
        story.SwapContent(*m_Other);
        throw;
    }
    GetDocument()->SetTextDirty();
    GetDocument()->SetAnchorsOutOfDate();
}

void StoryCommand::Exchange()
{
    m_Selection->GetTextFlow()->GetStory()->SwapContent(*m_Other);
    GetDocument()->SetTextDirty();
    GetDocument()->SetAnchorsOutOfDate();
}

void StoryCommand::Undo()
{
    Exchange();
}

void StoryCommand::Redo()
{
    Exchange();
}

void StoryCommand::Teardown()
{
    m_Other = nullptr;
}

void StoryCommand::Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications)
{
    notifications.push_back(Kernel::MakeCounted<StoryChangedNotification>(Self(), false));
    if (TouchesAnchors()) {
        notifications.push_back(Kernel::MakeCounted<AnchorsChangedNotification>(Self(), false));
    }
}

std::size_t StoryCommand::GetBegin(Story::Story const & story) const
{
    return std::min({m_Selection->GetTextAnchor(), m_Selection->GetTextCaret(), story.GetLength()});
}

std::size_t StoryCommand::GetEnd(Story::Story const & story) const
{
    return std::min(std::max(m_Selection->GetTextAnchor(), m_Selection->GetTextCaret()), story.GetLength());
}

FormatTextCommand::FormatTextCommand(Kernel::Counted<Story::Delta const> const & delta, enum TextDefault::Type, bool,
                                     bool wholeParagraphs, bool, Kernel::Counted<Selection const> selection)
    : StoryCommand(std::move(selection)),
      m_Delta(delta),
      m_WholeParagraphs(wholeParagraphs)
{
    KORVANE_ASSERT(m_Delta);
}

Kernel::LocalisedString FormatTextCommand::GetDescription() const
{
    return Kernel::LocalisedString("Format text", "Document Command");
}

void FormatTextCommand::Change(Story::Story & story)
{
    std::size_t begin = GetBegin(story);
    std::size_t end = GetEnd(story);
    if (m_WholeParagraphs && !story.Empty()) {
        begin = story.GetParagraphBegin(story.GetParagraphIndex(begin));
        end = story.GetParagraphs()[story.GetParagraphIndex(begin < end ? end - 1 : end)].m_End;
    }
    story.FormatText(m_Delta, begin, end);
}

Kernel::LocalisedString ChangeNoteCommand::GetDescription() const
{
    return Kernel::LocalisedString("Change note", "Document Command");
}

void ChangeNoteCommand::Change(Story::Story & story)
{
    std::size_t const begin = GetBegin(story);
    std::size_t const end = std::max(GetEnd(story), begin + 1);
    bool found = false;
    for (std::size_t i = story.GetObjectIndex(begin); i < story.GetObjects().size(); ++i) {
        Story::Story::Object const object = story.GetObjects()[i];
        if (end <= object.m_Offset) {
            break;
        }
        auto const * const reference = dynamic_cast<Story::NoteReferenceGlyph const *>(object.m_Glyph.Get());
        if (reference) {
            Kernel::Counted<Story::NoteAtt> const att = reference->GetNoteAtt()->Clone();
            att->CopyFields(*m_Att, m_Fields);
            story.ReplaceGlyph(object.m_Offset, reference->WithNoteAtt(att));
            found = true;
        }
    }
    if (!found) {
        throw CommandException(
            Kernel::LocalisedString("There is no note in the selected text.", "Text commands").ToString());
    }
}

PasteStoryCommand::PasteStoryCommand(Kernel::NonCounted<Story::Story const> story,
                                     Kernel::Counted<Story::TableGlyph const> table,
                                     Kernel::Counted<Story::StyleSheet const> styles, bool asPlainText,
                                     Kernel::Counted<Selection const> selection)
    : StoryCommand(std::move(selection)),
      m_Styles(std::move(styles))
{
    Story::StoryBuilder builder;
    if (table) {
        builder.AppendObject(table, nullptr);
        builder.EndParagraph(nullptr);
    }
    if (story && asPlainText) {
        for (std::size_t i = 0; i < story->GetParagraphs().size(); ++i) {
            builder.AppendText(story->GetString(story->GetParagraphBegin(i), story->GetParagraphs()[i].m_End), nullptr);
            builder.EndParagraph(nullptr);
        }
    }
    m_Story = builder.Finish();
    if (story && !asPlainText) {
        Story::GlyphCloneContext context(false);
        m_Story->AppendText(story->GetAll(), context);
    }
}

Kernel::LocalisedString PasteStoryCommand::GetDescription() const
{
    return Kernel::LocalisedString("Paste text", "Document Command");
}

void PasteStoryCommand::AddStyles()
{
    m_StylesBefore = Tree().GetStyleSheet();
    if (!m_Styles) {
        return;
    }
    Kernel::Counted<Story::StyleSheet> const sheet = m_StylesBefore->Clone();
    for (Story::TextStyle const & style : m_Styles->GetParagraphStyles()) {
        if (!sheet->FindParagraphStyle(style.m_Name)) {
            sheet->SetParagraphStyle(style);
        }
    }
    for (Story::TextStyle const & style : m_Styles->GetCharacterStyles()) {
        if (!sheet->FindCharacterStyle(style.m_Name)) {
            sheet->SetCharacterStyle(style);
        }
    }
    Tree().SetStyleSheet(sheet);
}

void PasteStoryCommand::Do()
{
    StoryCommand::Do();
    AddStyles();
}

void PasteStoryCommand::Undo()
{
    StoryCommand::Undo();
    Tree().SetStyleSheet(m_StylesBefore);
}

void PasteStoryCommand::Redo()
{
    StoryCommand::Redo();
    AddStyles();
}

void PasteStoryCommand::Change(Story::Story & story)
{
    Story::GlyphCloneContext context(false);
    story.ReplaceText(GetBegin(story), GetEnd(story), *m_Story, context);
}

Kernel::LocalisedString InsertTextCommand::GetDescription() const
{
    return Kernel::LocalisedString("Type text", "Document Command");
}

void InsertTextCommand::Change(Story::Story & story)
{
    std::size_t const begin = GetBegin(story);
    Story::StoryPos const before(story, 0 < begin ? begin - 1 : 0);
    Story::StoryBuilder builder;
    std::string_view rest = m_Text.View();
    while (!rest.empty()) {
        std::size_t const end = std::min(rest.find('\n'), rest.size());
        builder.AppendText(rest.substr(0, end), story.Empty() ? nullptr : before.GetGlyphAtts());
        if (end < rest.size()) {
            builder.EndParagraph(story.Empty() ? nullptr : Story::StoryPos(story, begin).GetParagraphAtts());
        }
        rest.remove_prefix(std::min(end + 1, rest.size()));
    }
    Story::GlyphCloneContext context(false);
    story.ReplaceText(begin, GetEnd(story), *builder.Finish(), context);
}

Kernel::LocalisedString SetStyleSheetCommand::GetDescription() const
{
    return Kernel::LocalisedString("Change styles", "Document Command");
}

void SetStyleSheetCommand::Do()
{
    m_Before = Tree().GetStyleSheet();
    Tree().SetStyleSheet(m_Styles);
    GetDocument()->SetTextDirty();
}

void SetStyleSheetCommand::Undo()
{
    Tree().SetStyleSheet(m_Before);
    GetDocument()->SetTextDirty();
}

void SetStyleSheetCommand::Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications)
{
    notifications.push_back(Kernel::MakeCounted<StoryChangedNotification>(Self(), false));
}

namespace Commands
{

Kernel::LocalisedString SetAnchorDataGUIDCommand::GetDescription() const
{
    return Kernel::LocalisedString("Identify anchor", "Document Command");
}

void SetAnchorDataGUIDCommand::Do()
{
    m_Found = nullptr;
    for (Kernel::Counted<TextFlow> const & flow : Tree().GetTextFlows()) {
        for (Story::CollectedAnchor const & anchor : Story::CollectAnchors(*flow->GetStory())) {
            if (anchor.m_Data == m_Anchor) {
                m_Found = anchor.m_Data;
            }
        }
    }
    if (!m_Found) {
        throw CommandException(
            Kernel::LocalisedString("The anchor is not in the document any more.", "Anchors").ToString());
    }
    m_Before = m_Found->GetUid();
    m_Found->SetUid(m_Uid);
    GetDocument()->SetAnchorsOutOfDate();
}

void SetAnchorDataGUIDCommand::Undo()
{
    m_Found->SetUid(m_Before);
    GetDocument()->SetAnchorsOutOfDate();
}

void SetAnchorDataGUIDCommand::Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications)
{
    notifications.push_back(Kernel::MakeCounted<AnchorsChangedNotification>(Self(), false));
}

}
