#pragma once

#include "framework/document/DocumentController.h"
#include "framework/document/DocumentSettings.h"
#include "framework/story/SpecialGlyphs.h"
#include "framework/story/StoryBuilder.h"

#include <cstdlib>

enum class BenchLinks
{
    None,
    InEachParagraph
};

/// Writes a chapter of thirty A5 pages: sixty headings, each with three paragraphs below it.
inline void WriteBenchChapter(String const & path, BenchLinks links)
{
    DocumentSettings settings;
    settings.m_PageSetup.m_FirstMaster = "Body";
    settings.m_PageSetup.m_BodyMaster = "Body";
    MasterPageSettings page;
    page.m_TextRect = {50, 60, 370, 530};
    settings.m_Masters.push_back({"Body", page, page});
    settings.m_Metadata.m_Title = "Chapter";
    Story::StoryBuilder builder;
    auto const link = Story::HyperlinkData::ToWeb("https://example.org");
    std::string text = "The quick brown fox jumps over the lazy dog";
    for (int word = 0; word < 14; ++word) {
        text += " and the quick brown fox jumps over";
    }
    for (int section = 0; section < 60; ++section) {
        builder.AppendObject(Kernel::MakeCounted<Story::AnchorGlyph>(Kernel::MakeCounted<Story::AnchorData>(
                                 "Section", true, true, "uid-" + std::to_string(section), 1)),
                             nullptr);
        builder.AppendText("Section", nullptr);
        builder.EndParagraph(nullptr);
        for (int paragraph = 0; paragraph < 3; ++paragraph) {
            if (BenchLinks::InEachParagraph == links) {
                builder.AppendText("See there: ", Kernel::MakeCounted<Story::GlyphAtts>(Story::AttSet(), link));
            }
            builder.AppendText(text + ".", nullptr);
            builder.EndParagraph(nullptr);
        }
    }
    Kernel::Counted<DocumentController> const document = DocumentController::CreateDocument(settings, builder.Finish());
    DocumentSaveResult result;
    document->SaveDocument(result, path);
    if (!result.IsSuccess()) {
        std::abort();
    }
    document->ShutDownArchive();
}
