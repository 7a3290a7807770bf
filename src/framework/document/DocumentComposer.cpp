#include "framework/document/DocumentComposer.h"

#include "framework/document/MasterSpreadNode.h"
#include "framework/document/PageShaper.h"
#include "framework/kernel/Abortable.h"
#include "framework/kernel/HashAccumulator.h"
#include "framework/kernel/Utf.h"
#include "framework/story/FlowComposer.h"

namespace
{

bool HasFields(Story::Story const & story)
{
    auto const objects = story.GetObjects();
    return std::any_of(objects.begin(), objects.end(), [](auto const & object) {
        return Story::FieldGlyph::c_classUid == object.m_Glyph->GetClassUID();
    });
}

/// Text of a field within the text, whose page is not known while it is set.
String FieldText(DocumentController const & document, Story::FieldGlyph const & field)
{
    switch (field.GetKind()) {
    case Story::FieldGlyph::Kind::BookTitle: {
        String const & title = document.GetDocument()->GetPublicationTitle();
        return title.Empty() ? document.GetMetadata()->GetTitle() : title;
    }
    case Story::FieldGlyph::Kind::ChapterTitle:
        return document.GetMetadata()->GetTitle();
    case Story::FieldGlyph::Kind::PageNumber:
    case Story::FieldGlyph::Kind::RunningText:
        break;
    }
    return String();
}

void AddGeometry(Kernel::HashAccumulator & hash, Kernel::Rect const & rect)
{
    hash.Add(rect.Width());
    hash.Add(rect.Height());
}

}

ComposeOutcome DocumentComposer::Compose(bool force, bool * abort)
{
    ComposeOutcome outcome;
    for (Kernel::Counted<TextFlow> const & flow : m_Document.GetTextFlows()) {
        if (Kernel::Abortable::IsFlagSet(abort)) {
            outcome.m_Aborted = true;
            return outcome;
        }
        outcome.m_LayoutChanged |= ComposeFlow(*flow, force);
        if (flow->IsGrowing()) {
            outcome.m_PagesChanged |= ShapePages(*flow);
        }
    }
    return outcome;
}

std::uint64_t DocumentComposer::HashOf(TextFlow const & flow) const
{
    Kernel::HashAccumulator hash;
    hash.Add(Story::ComposerVersion);
    flow.GetStory()->AccumulateHash(hash);
    m_Document.GetStyleSheet()->AccumulateHash(hash);
    PageSetup const & setup = m_Document.GetPageSetup();
    hash.Add(setup.m_GridIncrement);
    hash.Add(setup.m_GridStart);
    hash.Add(setup.m_NotesHeading);
    if (HasFields(*flow.GetStory())) {
        hash.Add(m_Document.GetPublicationTitle());
        hash.Add(m_Controller.GetMetadata()->GetTitle());
    }
    if (flow.IsGrowing()) {
        // The first page, the second and the third: from there on left and right take turns.
        for (std::size_t page = 0; page < 3; ++page) {
            AddGeometry(hash, TextRectOf(page));
        }
    } else {
        for (Kernel::JailCounted<TextFrameNode> const & frame : flow.GetFrames()) {
            AddGeometry(hash, frame->GetRect());
        }
    }
    return hash.Get64();
}

Kernel::RectT<double> DocumentComposer::TextRectOf(std::size_t pageOfFlow) const
{
    PageSetup const & setup = m_Document.GetPageSetup();
    Kernel::JailCounted<MasterSpreadNode> const master = m_Document.FindMaster(PageShaper::MasterOf(setup, pageOfFlow));
    unsigned int const number = m_Document.GetPageNumber(static_cast<unsigned int>(pageOfFlow));
    Kernel::Rect const rect = master ? master->GetTextRect(PageShaper::SideOf(setup, number)) : Kernel::Rect::Empty();
    return rect.IsEmpty() ? Kernel::Rect{0, 0, setup.m_PageSize.width, setup.m_PageSize.height} : rect;
}

bool DocumentComposer::ComposeFlow(TextFlow & flow, bool force)
{
    std::uint64_t const hash = HashOf(flow);
    if (!force && flow.GetLayout() && hash == flow.GetLayoutHash()) {
        return false;
    }
    PageSetup const & setup = m_Document.GetPageSetup();
    Story::FrameSource const frames = [&](std::uint32_t number) -> std::optional<Story::FrameGeometry> {
        Kernel::Rect rect;
        if (flow.IsGrowing()) {
            rect = TextRectOf(number);
        } else if (Kernel::JailCounted<TextFrameNode> const frame = flow.GetFrame(number)) {
            rect = frame->GetRect();
        } else {
            return std::nullopt;
        }
        return Story::FrameGeometry{rect.Width(), rect.Height(), setup.m_GridIncrement, setup.m_GridStart};
    };
    Story::ComposeOptions options;
    options.m_NotesHeading = setup.m_NotesHeading;
    options.m_FieldText = [this](Story::FieldGlyph const & field) {
        return Kernel::Utf8ToUtf16(FieldText(m_Controller, field));
    };
    Story::FlowComposer composer;
    Kernel::Counted<Story::Layout> layout =
        composer.Compose(*flow.GetStory(), *m_Document.GetStyleSheet(), frames, options);
    KORVANE_ASSERT(layout);
    flow.SetLayout(std::move(layout), hash, nullptr);
    return true;
}

bool DocumentComposer::ShapePages(TextFlow & flow)
{
    std::size_t const pageCount = std::max<std::size_t>(flow.GetLayout()->GetFrames().size(), 1);
    std::vector<unsigned int> numbers;
    for (std::size_t i = 0; i < pageCount; ++i) {
        numbers.push_back(m_Document.GetPageNumber(static_cast<unsigned int>(i)));
    }
    std::vector<std::vector<SpreadPage>> shape = PageShaper::Shape(m_Document.GetPageSetup(), numbers);

    bool changed = shape.size() != static_cast<std::size_t>(m_Document.GetSpreadCount());
    for (std::size_t i = 0; !changed && i < shape.size(); ++i) {
        changed = shape[i] != m_Document.GetSpreadAtIndex(static_cast<int>(i))->GetPages();
    }
    if (changed) {
        while (static_cast<int>(shape.size()) < m_Document.GetSpreadCount()) {
            m_Document.RemoveChild(NodeChildListSpreads, m_Document.GetSpreadCount() - 1);
        }
        for (std::size_t i = 0; i < shape.size(); ++i) {
            if (static_cast<int>(i) == m_Document.GetSpreadCount()) {
                m_Document.AppendChild(NodeChildListSpreads, Kernel::MakeCounted<SpreadNode>());
            }
            m_Document.GetSpreadAtIndex(static_cast<int>(i))->SetPages(std::move(shape[i]));
        }
    }
    if (changed || flow.GetFrames().size() != pageCount) {
        PlaceFrames(flow);
    }
    return changed;
}

void DocumentComposer::PlaceFrames(TextFlow & flow)
{
    std::vector<Kernel::JailCounted<TextFrameNode>> spare = flow.GetFrames();
    std::reverse(spare.begin(), spare.end());
    for (Kernel::JailCounted<TextFrameNode> const & frame : spare) {
        if (Node * const parent = frame->GetParent()) {
            parent->RemoveChild(frame->GetParentList(), frame->GetNodeIndex());
        }
    }
    std::vector<Kernel::JailCounted<TextFrameNode>> frames;
    for (int i = 0; i < m_Document.GetSpreadCount(); ++i) {
        Kernel::JailCounted<SpreadNode> const spread = m_Document.GetSpreadAtIndex(i);
        int place = 0;
        for (SpreadPage const & page : spread->GetPages()) {
            if (page.m_Blank) {
                continue;
            }
            Kernel::Rect const rect = TextRectOf(frames.size()).Moved(page.m_Rect.left, page.m_Rect.top);
            Kernel::JailCounted<TextFrameNode> frame;
            if (spare.empty()) {
                frame = Kernel::MakeCounted<TextFrameNode>(rect);
            } else {
                frame = spare.back();
                spare.pop_back();
                frame->SetRect(rect);
            }
            // Beneath whatever else lies on the spread.
            spread->InsertChild(NodeChildListItems, place++, frame);
            frames.push_back(std::move(frame));
        }
    }
    flow.SetFrames(std::move(frames));
}
