#pragma once

#include "framework/document/DocumentController.h"
#include "framework/document/DocumentSettings.h"
#include "framework/story/StoryBuilder.h"

#include <memory>

/// Makes real documents for tests: A5 facing pages, EB Garamond 10.5 on 14 points, running heads and folios, with the
/// text that is appended here.
class DocumentBuilder
{
public:
    DocumentBuilder();

    /// What everything but the text comes from; change it before `Build`.
    DocumentSettings & Settings() { return m_Settings; }

    DocumentBuilder & Title(String const & title);
    /// A heading with an anchor that is a bookmark.
    DocumentBuilder & Heading(String const & text, int level, String const & uid);
    DocumentBuilder & Paragraph(String const & text);
    /// So many paragraphs of about a hundred words, each begun with its number.
    DocumentBuilder & Paragraphs(int count);
    /// A paragraph with an anchor at its begin.
    DocumentBuilder & Anchor(String const & name, String const & uid);
    /// A paragraph that holds a link with that text.
    DocumentBuilder & Link(String const & text, Kernel::Counted<Story::HyperlinkData const> link);
    /// A paragraph that ends in a note of the kind 2.
    DocumentBuilder & Note(String const & text, String const & note, int numberingMode);
    /// A paragraph with an index mark; the topic with its parents, separated by `IndexTopic::NameSeparator`.
    DocumentBuilder & IndexMark(String const & topic);
    /// A paragraph with a picture of the document.
    DocumentBuilder & Picture(String const & dataId, double naturalWidth, double naturalHeight);
    /// A level of `Text` that begins a page.
    DocumentBuilder & PageBreak();

    /// The text so far; the builder is empty again.
    [[nodiscard]] Kernel::Counted<Story::Story> Text();
    [[nodiscard]] Kernel::Counted<DocumentController> Build();
    /// Builds, saves, closes; fails the test if it can't.
    void BuildFile(String const & path);

private:
    DocumentSettings m_Settings;
    std::unique_ptr<Story::StoryBuilder> m_Story;
};

/// Loads a document in the background; null, with the failure's code in `result`, if it can't. `result` may be null.
[[nodiscard]] Kernel::Counted<DocumentController> LoadTestDocument(String const & path, int * result);
/// Saves; fails the test with the reason if it can't.
void SaveTestDocument(DocumentController & document, String const & path);
