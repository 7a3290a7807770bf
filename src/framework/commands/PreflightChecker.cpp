#include "framework/commands/PreflightChecker.h"

#include "framework/document/AnchorVisitor.h"
#include "framework/document/BookSinkCollection.h"
#include "framework/document/DOMVisitor.h"
#include "framework/document/DocumentControllerSession.h"
#include "framework/document/PictureNode.h"
#include "framework/document/SpreadNode.h"
#include "framework/kernel/FileSystem.h"
#include "framework/kernel/Format.h"
#include "framework/story/PictureGlyph.h"

#include <algorithm>
#include <cmath>

namespace
{

using Kernel::LocalisedString;

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
    for (std::uint32_t number = 0; number < layout->GetFrames().size(); ++number) {
        Kernel::JailCounted<TextFrameNode> const frame = flow.GetFrame(number);
        int const page = frame ? frame->GetPageIndex() : -1;
        for (Story::LayoutItem::Picture const & set : layout->GetPictures(layout->GetFrames()[number])) {
            String const & id = layout->GetString(set.m_DataId);
            m_PicturePages.try_emplace(id, page);
            Raster::PictureProblem problem;
            Kernel::Counted<Raster::Picture const> const picture = m_Document.GetPictures().Get(id, problem);
            double const dpi = picture ? DpiOf(*picture, static_cast<double>(set.m_Right - set.m_Left),
                                               static_cast<double>(set.m_Bottom - set.m_Top))
                                       : 0;
            if (!picture) {
                Add(Status::Error, Problem::MissingPicture, problem.m_Path, page, problem.m_Text);
            } else if (0 < dpi && dpi < PreflightResult::LeastPictureDpi) {
                Add(Status::Warning, Problem::PictureResolution, picture->GetPath(), page,
                    Kernel::Format(LocalisedString("The picture \"%1\" has only %2 pixels to the inch at its size here; "
                                                   "%3 look sharp on paper.",
                                                   "Preflight"),
                                   picture->GetPath(), std::lround(dpi), std::lround(PreflightResult::LeastPictureDpi)));
            }
        }
    }
}

void PreflightChecker::CheckStoryPictures(TextFlow const & flow, Story::Story const & story,
                                          std::optional<std::size_t> outerOffset)
{
    for (Story::Story::Object const & object : story.GetObjects()) {
        std::size_t const offset = outerOffset.value_or(object.m_Offset);
        if (auto const * const picture = dynamic_cast<Story::PictureGlyph const *>(object.m_Glyph.Get())) {
            Story::PictureGlyph::Fields const & fields = picture->GetFields();
            if (fields.m_IsMissing) {
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
        Kernel::TimeStamp time;
        if (!entry.m_SourcePath.Empty() && Kernel::FileSystem::GetModifiedTime(entry.m_SourcePath, time) &&
            time != entry.m_SourceTime) {
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
        if (!Kernel::FileSystem::Exists(node->GetPath())) {
            Add(Status::Error, Problem::MissingPicture, node->GetPath(), spread ? spread->GetFirstPageIndex() : -1,
                Kernel::Format(LocalisedString("The picture \"%1\" is missing.", "Preflight"), node->GetPath()));
        }
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
