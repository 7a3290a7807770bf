#include "framework/commands/PreflightChecker.h"

#include "framework/document/AnchorVisitor.h"
#include "framework/document/BookSinkCollection.h"
#include "framework/document/DOMVisitor.h"
#include "framework/document/DocumentControllerSession.h"
#include "framework/document/EmbeddedDocumentNode.h"
#include "framework/document/SpreadNode.h"
#include "framework/kernel/FileSystem.h"
#include "framework/kernel/Format.h"
#include "framework/story/PictureGlyph.h"

#include <algorithm>
#include <cmath>

namespace
{

using Kernel::LocalisedString;
using Renderer::RenderTree::PlacedDrawing;

/// The pictures that stand on pages by themselves.
class PictureFinder : public DOMVisitorT<PictureFinder>
{
public:
    PictureFinder() { AddTerminatingTranslator<PictureNode>(&PictureFinder::OnPicture); }
    std::vector<PictureNode *> m_Found;

private:
    void OnPicture(PictureNode & node) { m_Found.push_back(&node); }
};

int PageAt(TextFlow const & flow, std::size_t offset)
{
    Kernel::JailCounted<TextFrameNode> const frame = flow.FindFrame(offset);
    return frame ? frame->GetPageIndex() : -1;
}

/// The words at a place of a text, as a person would name the place.
String WordsAt(Story::Story const & story, std::size_t offset)
{
    constexpr std::size_t Most = 40;
    std::u16string_view const text = story.GetText();
    if (text.size() <= offset) {
        return {};
    }
    std::size_t end = offset;
    while (end < text.size() && Story::ParagraphEnd != text[end] && end - offset < Most) {
        ++end;
    }
    // Not in the middle of a surrogate pair.
    end += end < text.size() && 0xDC00 == (text[end] & 0xFC00) ? 1U : 0U;
    return story.GetString(offset, end);
}

/// The file has another content by now; another time alone is none.
bool HasChanged(String const & id, DocumentPictures::Entry const & entry)
{
    Kernel::TimeStamp time;
    if (entry.m_SourcePath.Empty() || !Kernel::FileSystem::GetModifiedTime(entry.m_SourcePath, time) ||
        time == entry.m_SourceTime) {
        return false;
    }
    Raster::PictureProblem problem;
    Raster::Picture::Bytes const bytes = Raster::ReadPictureFile(entry.m_SourcePath, problem);
    return bytes && DocumentPictures::IdOf(*bytes) != id;
}

/// Pixels to the inch of a picture that is set in this size; 0 if either is unknown.
double DpiOf(Raster::Picture const & picture, double width, double height)
{
    Raster::PictureInfo const & info = picture.GetInfo();
    return width <= 0 || height <= 0
               ? 0
               : std::min(info.UprightWidth() * 72 / width, info.UprightHeight() * 72 / height);
}

}

void PreflightChecker::Add(Status status, Problem problem, String subject, int page, String const & message)
{
    PreflightResult result;
    result.m_Status = status;
    result.m_Problem = problem;
    result.m_Subject = std::move(subject);
    result.m_PageIndex = page;
    if (0 <= page) {
        result.m_Folio = m_Document.GetDocument()->GetFormattedPageNumber(static_cast<unsigned int>(page));
    }
    result.m_Message = LocalisedString::CreateFakeFromString(message);
    m_Results.push_back(std::move(result));
}

void PreflightChecker::CheckDocument(std::optional<enum Raster::Format> expected)
{
    if (expected && Raster::SpaceOfFormat(*expected) != Raster::SpaceOfFormat(m_Document.GetFormat())) {
        Add(Status::Warning, Problem::ColourFormat, String(), -1,
            LocalisedString("The document's colours are of another kind than the key chapter's; they are converted for "
                            "output.",
                            "Preflight"));
    }
    CheckAnchors();
    for (Kernel::Counted<TextFlow> const & flow : m_Document.GetDocument()->GetTextFlows()) {
        CheckText(*flow);
        CheckReferences(*flow);
        CheckLayoutPictures(*flow);
        CheckStoryPictures(*flow, *flow->GetStory(), std::nullopt);
    }
    CheckSourceFiles();
    CheckPlacedPictures();
}

void PreflightChecker::CheckAnchors()
{
    AnchorVisitor visitor(false);
    visitor.Visit(m_Document.GetDocument());
    for (Kernel::Counted<AnchorInstance const> const & anchor : *visitor.GetAnchors()) {
        m_OwnAnchors.insert(anchor->GetUid());
        if (!anchor->GetName().Empty() || anchor->IsBlind()) {
            continue;
        }
        TextFlow const & flow = *anchor->GetTextFlow();
        String const words = WordsAt(*flow.GetStory(), anchor->GetOffset());
        Add(Status::Warning, Problem::EmptyAnchorName, words, PageAt(flow, anchor->GetOffset()),
            Kernel::Format(LocalisedString("An anchor before \"%1\" has no name, so no reference and no bookmark can "
                                           "show it.",
                                           "Preflight"),
                           words));
    }
}

void PreflightChecker::CheckText(TextFlow const & flow)
{
    Kernel::Counted<Story::Layout const> const layout = flow.GetLayout();
    if (!layout) {
        return;
    }
    using Kind = Story::LayoutItem::Problem::Kind;
    for (Story::LayoutItem::Problem const & problem : layout->GetProblems()) {
        int const page = PageAt(flow, problem.m_StoryOffset);
        String const text = Story::LayoutItem::None == problem.m_Text ? String() : layout->GetString(problem.m_Text);
        String const words = WordsAt(*flow.GetStory(), problem.m_StoryOffset);
        switch (problem.m_Kind) {
        case Kind::MissingFamily:
            Add(Status::Error, Problem::MissingFont, text, page,
                Kernel::Format(LocalisedString("The font \"%1\" is not installed; another one stands in for it.",
                                               "Preflight"),
                               text));
            break;
        case Kind::MissingCharacter:
            Add(Status::Warning, Problem::MissingFont, text, page,
                Kernel::Format(LocalisedString("No installed font has the character \"%1\"; a box shows in its place.",
                                               "Preflight"),
                               text));
            break;
        case Kind::PictureMissing:
            // The text's pictures tell it themselves, with their names.
            break;
        case Kind::Overset:
            Add(Status::Error, Problem::OversetText, words, page,
                Kernel::Format(LocalisedString("The text from \"%1\" on has no place on any page.", "Preflight"),
                               words));
            break;
        case Kind::Clipped:
            Add(Status::Error, Problem::OversetText, words, page,
                Kernel::Format(LocalisedString("What begins at \"%1\" is larger than its page and is cut off.",
                                               "Preflight"),
                               words));
            break;
        case Kind::OverfullLine:
            Add(Status::Warning, Problem::OversetText, words, page,
                Kernel::Format(LocalisedString("A line of the text at \"%1\" is wider than its column.", "Preflight"),
                               words));
            break;
        }
    }
}

void PreflightChecker::CheckReferences(TextFlow const & flow)
{
    Kernel::Counted<Story::Layout const> const layout = flow.GetLayout();
    if (!layout) {
        return;
    }
    std::set<std::pair<Story::HyperlinkData const *, int>> seen;
    for (std::uint32_t number = 0; number < layout->GetFrames().size(); ++number) {
        Kernel::JailCounted<TextFrameNode> const frame = flow.GetFrame(number);
        int const page = frame ? frame->GetPageIndex() : -1;
        for (Story::LayoutItem::Link const & link : layout->GetLinks(layout->GetFrames()[number])) {
            if (Story::LayoutItem::None == link.m_Hyperlink) {
                continue;
            }
            Story::HyperlinkData const & data = *layout->GetHyperlink(link.m_Hyperlink);
            bool const isReference = Story::HyperlinkData::Type::Anchor == data.GetType() && !data.IsEndnotes();
            // A link that breaks over lines has several rectangles.
            if (!isReference || !data.IsActive() || !seen.emplace(&data, page).second) {
                continue;
            }
            String const & target = data.GetTargetText().Empty() ? data.GetAnchorUid() : data.GetTargetText();
            if (data.GetAnchorUid().Empty()) {
                AddUnresolved(target, page);
            } else if (!m_OwnAnchors.contains(data.GetAnchorUid())) {
                m_OuterReferences.push_back({data.GetAnchorUid(), target, page});
            }
        }
    }
}

void PreflightChecker::AddUnresolved(String const & target, int page)
{
    Add(Status::Error, Problem::UnresolvedReference, target, page,
        Kernel::Format(LocalisedString("The reference to \"%1\" leads nowhere.", "Preflight"), target));
}

void PreflightChecker::CheckLayoutPictures(TextFlow const & flow)
{
    Kernel::Counted<Story::Layout const> const layout = flow.GetLayout();
    if (!layout || !flow.EnsureGlyphData()) {
        return;
    }
    DocumentPictures const & pictures = m_Document.GetPictures();
    for (std::uint32_t number = 0; number < layout->GetFrames().size(); ++number) {
        Kernel::JailCounted<TextFrameNode> const frame = flow.GetFrame(number);
        int const page = frame ? frame->GetPageIndex() : -1;
        for (Story::LayoutItem::Picture const & set : layout->GetPictures(layout->GetFrames()[number])) {
            PictureReference const reference = PictureReference::Parse(layout->GetString(set.m_DataId));
            m_PicturePages.try_emplace(reference.m_Id, page);
            auto const entry = pictures.FindEntry(reference.m_Id);
            Raster::PictureProblem problem;
            if (entry && entry->m_DrawingKind) {
                auto const drawing = pictures.GetDrawing(
                    reference, m_Document.GetDocument()->GetPicturePassword(reference.m_Id), problem);
                m_HasPdf = m_HasPdf || PlacedDrawing::Kind::Pdf == *entry->m_DrawingKind;
                CheckDrawing(entry->m_SourcePath, drawing ? Raster::PictureProblem() : problem, page);
            } else {
                auto const picture = pictures.Get(reference.m_Id, problem);
                CheckPixels(picture, problem, static_cast<double>(set.m_Right - set.m_Left),
                            static_cast<double>(set.m_Bottom - set.m_Top), page);
            }
        }
    }
}

void PreflightChecker::CheckPixels(Kernel::Counted<Raster::Picture const> const & picture,
                                   Raster::PictureProblem const & problem, double width, double height, int page)
{
    double const dpi = picture ? DpiOf(*picture, width, height) : 0;
    if (!picture) {
        Add(Status::Error, Problem::MissingPicture, problem.m_Path, page, problem.m_Text);
    } else if (0 < dpi && dpi < PreflightResult::LeastPictureDpi) {
        Add(Status::Warning, Problem::PictureResolution, picture->GetPath(), page,
            Kernel::Format(LocalisedString("The picture \"%1\" has only %2 pixels to the inch at its size here; from %3 "
                                           "on it looks sharp on paper.",
                                           "Preflight"),
                           picture->GetPath(), std::lround(dpi), std::lround(PreflightResult::LeastPictureDpi)));
    }
}

void PreflightChecker::CheckDrawing(String const & path, Raster::PictureProblem const & problem, int page)
{
    if (Raster::PictureProblem::Code::Locked == problem.m_Code) {
        AddLocked(path, page);
    } else if (Raster::PictureProblem::Code::None != problem.m_Code) {
        Add(Status::Error, Problem::MissingPicture, path, page, problem.m_Text);
    }
}

void PreflightChecker::AddLocked(String const & path, int page)
{
    Add(Status::Error, Problem::LockedPicture, path, page,
        Kernel::Format(LocalisedString("The placed PDF \"%1\" needs its password; a marked box stands in its place.",
                                       "Preflight"),
                       path));
}

void PreflightChecker::CheckStoryPictures(TextFlow const & flow, Story::Story const & story,
                                          std::optional<std::size_t> outerOffset)
{
    for (Story::Story::Object const & object : story.GetObjects()) {
        std::size_t const offset = outerOffset.value_or(object.m_Offset);
        if (auto const * const picture = dynamic_cast<Story::PictureGlyph const *>(object.m_Glyph.Get())) {
            Story::PictureGlyph::Fields const & fields = picture->GetFields();
            auto const entry = m_Document.GetPictures().FindEntry(PictureReference::Parse(fields.m_DataId).m_Id);
            if (fields.m_IsMissing && entry && entry->m_IsProtected) {
                // It was locked when it was taken in: its size is not known until it is taken in anew.
                AddLocked(entry->m_SourcePath, PageAt(flow, offset));
            } else if (fields.m_IsMissing) {
                Add(Status::Error, Problem::MissingPicture, fields.m_Path, PageAt(flow, offset),
                    fields.m_MissingReason.Empty()
                        ? Kernel::Format(LocalisedString("The picture \"%1\" is missing.", "Preflight"), fields.m_Path)
                        : fields.m_MissingReason);
            }
        }
        for (std::size_t i = 0; i < object.m_Glyph->GetStoryCount(); ++i) {
            if (Kernel::Counted<Story::Story const> const inner = object.m_Glyph->GetStory(i)) {
                CheckStoryPictures(flow, *inner, offset);
            }
        }
    }
}

void PreflightChecker::CheckSourceFiles()
{
    for (auto const & [id, entry] : m_Document.GetPictures().GetEntries()) {
        // The document holds the picture: its source may be gone, but when it is there it should be the same still.
        if (HasChanged(id, entry)) {
            auto const page = m_PicturePages.find(id);
            Add(Status::Warning, Problem::ChangedPicture, entry.m_SourcePath,
                page == m_PicturePages.end() ? -1 : page->second,
                Kernel::Format(LocalisedString("The picture \"%1\" has changed since it was taken in; the document "
                                               "shows it as it was.",
                                               "Preflight"),
                               entry.m_SourcePath));
        }
    }
}

void PreflightChecker::CheckPlacedPictures()
{
    PictureFinder finder;
    finder.Visit(m_Document.GetDocument());
    for (PictureNode const * const node : finder.m_Found) {
        Kernel::JailCounted<SpreadNode> const spread = node->GetSpreadNode();
        if (!spread) {
            continue;
        }
        Kernel::Rect const box = node->GetSpreadBaseBox(false);
        int const onSpread = spread->FindPage({(box.left + box.right) / 2, (box.top + box.bottom) / 2});
        int const first = spread->GetFirstPageIndex();
        int const page = first < 0 ? -1 : first + std::max(0, onSpread);
        Raster::PictureProblem problem;
        if (auto const * const embedded = dynamic_cast<EmbeddedDocumentNode const *>(node)) {
            auto const drawing = PlacedDrawing::OpenFile(node->GetPath(), embedded->GetPassword(), problem);
            m_HasPdf = m_HasPdf || (drawing && PlacedDrawing::Kind::Pdf == drawing->GetKind());
            CheckDrawing(node->GetPath(), drawing ? Raster::PictureProblem() : problem, page);
        } else {
            CheckPixels(Raster::Picture::FromFile(node->GetPath(), problem), problem, std::abs(box.Width()),
                        std::abs(box.Height()), page);
        }
    }
    if (m_HasPdf && !PlacedDrawing::CanDrawPdfPages()) {
        Add(Status::Warning, Problem::PicturePreview, String(), -1,
            LocalisedString("Placed PDFs show as marked boxes in previews, as the program pdftocairo (package "
                            "poppler-utils) is not installed; the PDF output has them.",
                            "Preflight"));
    }
}

void PreflightChecker::AskPublication()
{
    Kernel::Counted<DocumentController const> const document(&m_Document);
    for (OuterReference const & reference : m_OuterReferences) {
        if (!BookSinkCollection::Ask(
                [&](BookSink & sink) { return nullptr != sink.GetAnchorInfo(reference.m_Uid, document); })) {
            DocumentControllerSession const session(document);
            AddUnresolved(reference.m_Target, reference.m_PageIndex);
        }
    }
    if (BookSinkCollection::Ask([&](BookSink & sink) { return sink.IsAnyTocOutOfDate(document); })) {
        Add(Status::Warning, Problem::StaleTableOfContents, String(), -1,
            LocalisedString("A table of contents is not up to date; update the book.", "Preflight"));
    }
    if (BookSinkCollection::Ask([&](BookSink & sink) { return sink.IsIndexOutOfDate(document); })) {
        Add(Status::Warning, Problem::StaleIndex, String(), -1,
            LocalisedString("The index is not up to date; update the book.", "Preflight"));
    }
}

std::vector<PreflightResult> PreflightChecker::TakeResults(PreflightResult::Status least)
{
    std::erase_if(m_Results, [least](PreflightResult const & result) { return result.m_Status < least; });
    std::stable_sort(m_Results.begin(), m_Results.end(), [](PreflightResult const & a, PreflightResult const & b) {
        return a.m_PageIndex < b.m_PageIndex;
    });
    return std::exchange(m_Results, {});
}
