#include "support/DocumentBuilder.h"

#include "framework/kernel/Format.h"
#include "framework/story/NoteGlyphs.h"
#include "framework/story/PictureGlyph.h"
#include "framework/story/SpecialGlyphs.h"

#include <gtest/gtest.h>

namespace
{

constexpr double Width = 419.528;
constexpr double Height = 595.276;

MasterPageSettings MakePage(bool isLeft, bool hasHead)
{
    MasterPageSettings page;
    page.m_TextRect = {isLeft ? 54.0 : 48.0, 56, isLeft ? Width - 48 : Width - 54, Height - 64};
    RunningTextSettings folio;
    folio.m_Rect = {page.m_TextRect.left, Height - 44, page.m_TextRect.right, Height - 32};
    folio.m_Parts = {{RunningTextField::PageNumber, String()}};
    folio.m_Alignment = isLeft ? RunningTextAlignment::Left : RunningTextAlignment::Right;
    folio.m_Style = "Folio";
    page.m_RunningTexts.push_back(folio);
    if (hasHead) {
        RunningTextSettings head = folio;
        head.m_Rect = {page.m_TextRect.left, 24, page.m_TextRect.right, 38};
        head.m_Parts = {{isLeft ? RunningTextField::PublicationTitle : RunningTextField::DocumentTitle, String()}};
        page.m_RunningTexts.push_back(head);
    }
    return page;
}

Story::TextStyle MakeStyle(char const * name, double size, int outlineLevel)
{
    Story::TextStyle style;
    style.m_Name = name;
    style.m_GlyphAtts.SetDouble(Story::GlyphAtt::Size, size);
    style.m_ParagraphAtts.SetDouble(Story::ParagraphAtt::Leading, 14);
    if (0 < outlineLevel) {
        style.m_ParagraphAtts.SetInt(Story::ParagraphAtt::OutlineLevel, outlineLevel);
        style.m_ParagraphAtts.SetInt(Story::ParagraphAtt::KeepWithNext, 1);
    }
    return style;
}

Kernel::Counted<Story::ParagraphAtts const> TextStyle()
{
    return Story::ParagraphAtts::FromStyle("Text");
}

}

DocumentBuilder::DocumentBuilder() : m_Story(std::make_unique<Story::StoryBuilder>())
{
    m_Settings.m_PageSetup.m_PageSize = {Width, Height};
    m_Settings.m_PageSetup.m_FacingPages = true;
    m_Settings.m_PageSetup.m_FirstMaster = "First";
    m_Settings.m_PageSetup.m_BodyMaster = "Body";
    m_Settings.m_Masters.push_back({"First", MakePage(true, false), MakePage(false, false)});
    m_Settings.m_Masters.push_back({"Body", MakePage(true, true), MakePage(false, true)});
    Kernel::Counted<Story::StyleSheet> const styles = Kernel::MakeCounted<Story::StyleSheet>();
    styles->SetParagraphStyle(MakeStyle("Text", 10.5, 0));
    styles->SetParagraphStyle(MakeStyle("Heading 1", 18, 1));
    styles->SetParagraphStyle(MakeStyle("Heading 2", 13, 2));
    styles->SetParagraphStyle(MakeStyle("Folio", 9, 0));
    m_Settings.m_Styles = styles;
    m_Settings.m_Metadata.m_Language = "en";
    m_Settings.m_PublicationTitle = "The Whole Book";
}

DocumentBuilder & DocumentBuilder::Title(String const & title)
{
    m_Settings.m_Metadata.m_Title = title;
    return *this;
}

DocumentBuilder & DocumentBuilder::Heading(String const & text, int level, String const & uid)
{
    m_Story->AppendObject(
        Kernel::MakeCounted<Story::AnchorGlyph>(Kernel::MakeCounted<Story::AnchorData>(text, true, true, uid, level)),
        nullptr);
    m_Story->AppendText(text, nullptr);
    m_Story->EndParagraph(Story::ParagraphAtts::FromStyle(Kernel::Format("Heading %1", level)));
    return *this;
}

DocumentBuilder & DocumentBuilder::Paragraph(String const & text)
{
    m_Story->AppendText(text, nullptr);
    m_Story->EndParagraph(TextStyle());
    return *this;
}

DocumentBuilder & DocumentBuilder::Paragraphs(int count)
{
    for (int i = 1; i <= count; ++i) {
        std::string text = "Number " + std::to_string(i) + ":";
        for (int word = 0; word < 16; ++word) {
            text += " the quick brown fox jumps over lazy";
        }
        Paragraph(text + " dogs.");
    }
    return *this;
}

DocumentBuilder & DocumentBuilder::Anchor(String const & name, String const & uid)
{
    m_Story->AppendObject(
        Kernel::MakeCounted<Story::AnchorGlyph>(Kernel::MakeCounted<Story::AnchorData>(name, false, false, uid)),
        nullptr);
    return Paragraph(String("Here is ") + name.View() + ".");
}

DocumentBuilder & DocumentBuilder::Link(String const & text, Kernel::Counted<Story::HyperlinkData const> link)
{
    m_Story->AppendText("See ", nullptr);
    m_Story->AppendText(text, Kernel::MakeCounted<Story::GlyphAtts>(Story::AttSet(), std::move(link)));
    return Paragraph(" there.");
}

DocumentBuilder & DocumentBuilder::Note(String const & text, String const & note, int numberingMode)
{
    Story::StoryBuilder content;
    content.AppendText(note, nullptr);
    content.EndParagraph(nullptr);
    Kernel::Counted<Story::NoteAtt> const att = Kernel::MakeCounted<Story::NoteAtt>();
    att->SetNumberingMode(numberingMode);
    m_Story->AppendText(text, nullptr);
    m_Story->AppendObject(Kernel::MakeCounted<Story::PinnoteGlyph>(att, content.Finish()), nullptr);
    return Paragraph(String());
}

DocumentBuilder & DocumentBuilder::IndexMark(String const & topic)
{
    m_Story->AppendObject(Kernel::MakeCounted<Story::IndexMarkGlyph>(topic), nullptr);
    return Paragraph("Marked.");
}

DocumentBuilder & DocumentBuilder::Picture(String const & dataId, double naturalWidth, double naturalHeight)
{
    Story::PictureGlyph::Fields fields;
    fields.m_DataId = dataId;
    fields.m_NaturalWidth = naturalWidth;
    fields.m_NaturalHeight = naturalHeight;
    fields.m_AltText = "A picture";
    m_Story->AppendObject(Kernel::MakeCounted<Story::PictureGlyph>(fields), nullptr);
    return Paragraph(String());
}

DocumentBuilder & DocumentBuilder::PageBreak()
{
    m_Story->AppendObject(Kernel::MakeCounted<Story::BreakGlyph>(), nullptr);
    return Paragraph(String());
}

Kernel::Counted<Story::Story> DocumentBuilder::Text()
{
    return m_Story->Finish();
}

Kernel::Counted<DocumentController> DocumentBuilder::Build()
{
    return DocumentController::CreateDocument(m_Settings, Text());
}

void DocumentBuilder::BuildFile(String const & path)
{
    SaveTestDocument(*Build(), path);
}

Kernel::Counted<DocumentController> LoadTestDocument(String const & path, int * result)
{
    Kernel::Counted<DocumentController> document = Kernel::MakeCounted<DocumentController>();
    Kernel::Counted<OpenDocumentFailedNotification> const failure =
        Kernel::MakeCounted<OpenDocumentFailedNotification>(path, false);
    bool const loaded = document->LoadDocument(path, false, false, LoadWhole, nullptr, *failure, false);
    if (result) {
        *result = failure->GetResult();
    } else {
        EXPECT_TRUE(loaded) << failure->GetReason();
    }
    return loaded ? document : nullptr;
}

void SaveTestDocument(DocumentController & document, String const & path)
{
    DocumentSaveResult result;
    document.SaveDocument(result, path);
    ASSERT_TRUE(result.IsSuccess()) << result.GetText();
}
