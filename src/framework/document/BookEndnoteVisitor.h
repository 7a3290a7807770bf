#pragma once

#include "framework/kernel/Counted.h"

namespace Story
{
class Story;
}
class DocumentController;
class Selection;

/// Finds and gathers the endnotes that run through the whole book.
class BookEndnoteVisitor
{
public:
    /// The story marked as the place of the book's collated endnotes; null if the document has none.
    [[nodiscard]] static Kernel::Counted<Selection const>
    FindCollatedBookEndnotes(Kernel::Counted<DocumentController const> document);

    /// The document's book endnotes as one story, in text order: an empty story if it has none. Where it has some, it
    /// begins with a paragraph of the document's title, with an empty one before that unless `isFirst`, which says that
    /// no earlier chapter has contributed. `chapterIndex` is the chapter's position in the book.
    [[nodiscard]] static Kernel::Counted<Story::Story>
    CollateBookEndnotesForChapter(Kernel::Counted<DocumentController const> document, int chapterIndex, bool isFirst);
};
