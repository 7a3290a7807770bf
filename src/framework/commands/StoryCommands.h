#pragma once

#include "framework/commands/DocumentCommandBase.h"
#include "framework/document/Selection.h"
#include "framework/story/Delta.h"
#include "framework/story/NoteAtt.h"
#include "framework/story/TableGlyph.h"

/// Base of the commands that change the text of one flow: undo puts the whole text back. The text is dirty afterwards.
class StoryCommand : public UndoableDocumentCommand
{
public:
    ~StoryCommand() override;

    void Do() override;
    void Undo() override;
    void Redo() override;
    void Teardown() override;
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications) override;

protected:
    explicit StoryCommand(Kernel::Counted<Selection const> selection) : m_Selection(std::move(selection)) {}

    /// Makes the change; what it throws is thrown on, with the text as it was.
    virtual void Change(Story::Story & story) = 0;
    /// Anchors may have come or gone.
    [[nodiscard]] virtual bool TouchesAnchors() const { return false; }

    /// The selected stretch, kept within the story.
    [[nodiscard]] std::size_t GetBegin(Story::Story const & story) const;
    [[nodiscard]] std::size_t GetEnd(Story::Story const & story) const;

private:
    void Exchange();

    Kernel::Counted<Selection const> const m_Selection;
    /// The other of the two texts that undo and redo exchange.
    Kernel::Counted<Story::Story> m_Other;
};

/// Which part of a text's attributes a formatting command works on.
class TextDefault
{
public:
    enum Type : int
    {
        Glyph = 0,
        Paragraph = 1
    };
};

/// Lays a delta over the selected text; a selection without extent formats the paragraph that it stands in.
class FormatTextCommand : public StoryCommand
{
public:
    /// \param type what the delta is about
    /// \param asDefault also what new text is given; there is no such thing as a default here, so it changes nothing
    /// \param wholeParagraphs the stretch grows to whole paragraphs
    /// \param onlyUnset paragraphs that set an attribute themselves keep it; that is for the delta to say
    FormatTextCommand(Kernel::Counted<Story::Delta const> const & delta, enum TextDefault::Type type, bool asDefault,
                      bool wholeParagraphs, bool onlyUnset, Kernel::Counted<Selection const> selection);

    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;

protected:
    void Change(Story::Story & story) override;

private:
    Kernel::Counted<Story::Delta const> const m_Delta;
    bool const m_WholeParagraphs;
};

/// Changes fields of the note references in the selected text, or of the one right behind a selection without extent.
class ChangeNoteCommand : public StoryCommand
{
public:
    /// \param fields bits of `Story::NoteAtt::Fields`
    ChangeNoteCommand(Kernel::Counted<Story::NoteAtt const> att, unsigned long long fields,
                      Kernel::Counted<Selection const> selection)
        : StoryCommand(std::move(selection)),
          m_Att(std::move(att)),
          m_Fields(fields)
    {
    }

    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;

protected:
    void Change(Story::Story & story) override;

private:
    Kernel::Counted<Story::NoteAtt const> const m_Att;
    unsigned long long const m_Fields;
};

/// Puts a story, or a table, in place of the selected text.
class PasteStoryCommand : public StoryCommand
{
public:
    /// \param story copied; may be null if there is a table
    /// \param table a paragraph of its own, ahead of the story; may be null
    /// \param styles styles that the story uses; those that the document lacks are added; may be null
    /// \param asPlainText the text comes without its attributes
    PasteStoryCommand(Kernel::NonCounted<Story::Story const> story, Kernel::Counted<Story::TableGlyph const> table,
                      Kernel::Counted<Story::StyleSheet const> styles, bool asPlainText,
                      Kernel::Counted<Selection const> selection);

    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;
    void Do() override;
    void Undo() override;
    void Redo() override;

protected:
    void Change(Story::Story & story) override;
    [[nodiscard]] bool TouchesAnchors() const override { return true; }

private:
    void AddStyles();

    Kernel::Counted<Story::Story> m_Story;
    Kernel::Counted<Story::StyleSheet const> const m_Styles;
    Kernel::Counted<Story::StyleSheet const> m_StylesBefore;
};

/// Puts plain text in place of the selected text, in the attributes of the character before it.
class InsertTextCommand : public StoryCommand
{
public:
    InsertTextCommand(String text, Kernel::Counted<Selection const> selection)
        : StoryCommand(std::move(selection)),
          m_Text(std::move(text))
    {
    }

    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;

protected:
    void Change(Story::Story & story) override;
    [[nodiscard]] bool TouchesAnchors() const override { return true; }

private:
    String const m_Text;
};

/// Puts another set of text styles in place of the document's.
class SetStyleSheetCommand : public UndoableDocumentCommand
{
public:
    explicit SetStyleSheetCommand(Kernel::Counted<Story::StyleSheet const> styles) : m_Styles(std::move(styles)) {}

    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;
    void Do() override;
    void Undo() override;
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications) override;

private:
    Kernel::Counted<Story::StyleSheet const> const m_Styles;
    Kernel::Counted<Story::StyleSheet const> m_Before;
};

namespace Commands
{

/// Gives an anchor of the document its identity. Nothing moves on a page for it.
class SetAnchorDataGUIDCommand : public UndoableDocumentCommand
{
public:
    SetAnchorDataGUIDCommand(Kernel::Counted<Story::AnchorData const> anchor, String uid)
        : m_Anchor(std::move(anchor)),
          m_Uid(std::move(uid))
    {
    }

    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;
    void Do() override;
    void Undo() override;
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications) override;

private:
    Kernel::Counted<Story::AnchorData const> const m_Anchor;
    String const m_Uid;
    /// The same object, found in the document's text.
    Kernel::Counted<Story::AnchorData> m_Found;
    String m_Before;
};

}
