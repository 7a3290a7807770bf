#include "framework/document/BookEndnoteVisitor.h"

#include "framework/document/DocumentController.h"
#include "framework/document/DocumentNode.h"
#include "framework/document/Selection.h"
#include "framework/story/GlyphCloneContext.h"
#include "framework/story/NoteGlyphs.h"
#include "framework/story/StoryBuilder.h"

namespace
{

bool IsCollated(Kernel::Counted<Story::ParagraphAtts const> const & atts)
{
    return atts && 1 == atts->Get(Story::ParagraphAtt::CollatedEndnotes, 0);
}

/// The number that the layout gave the note whose reference stands at the offset, or else what the attribute says.
int NumberOf(TextFlow const & flow, std::size_t offset, Story::NoteAtt const & att)
{
    if (Kernel::Counted<Story::Layout const> const layout = flow.GetLayout()) {
        for (Story::LayoutItem::Note const & note : layout->GetNotes()) {
            if (offset == note.m_StoryOffset) {
                return note.m_Number;
            }
        }
    }
    return att.GetStartNumberingAt();
}

Kernel::Counted<Story::Story> Paragraph(String const & text, char const * style)
{
    Story::StoryBuilder builder;
    builder.AppendText(text, nullptr);
    builder.EndParagraph(Story::ParagraphAtts::FromStyle(style));
    return builder.Finish();
}

}

Kernel::Counted<Selection const>
BookEndnoteVisitor::FindCollatedBookEndnotes(Kernel::Counted<DocumentController const> document)
{
    for (Kernel::Counted<TextFlow> const & flow : document->GetDocument()->GetTextFlows()) {
        Story::Story const & story = *flow->GetStory();
        auto const paragraphs = story.GetParagraphs();
        for (std::size_t i = 0; i < paragraphs.size(); ++i) {
            if (!IsCollated(paragraphs[i].m_Atts)) {
                continue;
            }
            std::size_t last = i;
            while (last + 1 < paragraphs.size() && IsCollated(paragraphs[last + 1].m_Atts)) {
                ++last;
            }
            return Kernel::MakeCounted<Selection>(flow, story.GetParagraphBegin(i), paragraphs[last].m_End);
        }
    }
    return nullptr;
}

Kernel::Counted<Story::Story>
BookEndnoteVisitor::CollateBookEndnotesForChapter(Kernel::Counted<DocumentController const> document, int, bool isFirst)
{
    Kernel::Counted<Story::Story> const collated = Kernel::MakeCounted<Story::Story>();
    Story::GlyphCloneContext context(false);
    for (Kernel::Counted<TextFlow> const & flow : document->GetDocument()->GetTextFlows()) {
        for (Story::Story::Object const & object : flow->GetStory()->GetObjects()) {
            auto const * const reference = dynamic_cast<Story::NoteReferenceGlyph const *>(object.m_Glyph.Get());
            if (!reference || Story::NoteAtt::Endnote != reference->GetNoteAtt()->GetKind() ||
                Story::NoteAtt::ThroughBook != reference->GetNoteAtt()->GetNumberingMode()) {
                continue;
            }
            if (collated->Empty()) {
                if (!isFirst) {
                    collated->AppendText(Paragraph(String(), Story::StyleSheet::NoteTextStyle)->GetAll(), context);
                }
                collated->AppendText(
                    Paragraph(document->GetMetadata()->GetTitle(), Story::StyleSheet::NotesHeadingStyle)->GetAll(),
                    context);
            }
            // The note's own paragraphs, with the number ahead of the first.
            Kernel::Counted<Story::Story> const note = reference->GetNote()->Clone();
            Story::StoryBuilder number;
            number.AppendText(std::to_string(NumberOf(*flow, object.m_Offset, *reference->GetNoteAtt())) + ". ",
                              Story::GlyphAtts::FromStyle(Story::StyleSheet::NoteNumberStyle));
            note->ReplaceText(0, 0, *number.Finish(), context);
            collated->AppendText(note->GetAll(), context);
        }
    }
    return collated;
}
