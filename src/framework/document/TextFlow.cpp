#include "framework/document/TextFlow.h"

#include "framework/document/Selection.h"
#include "framework/kernel/Assert.h"
#include "framework/kernel/FileSystem.h"

#include <algorithm>

TextFlow::TextFlow(Kernel::Counted<Story::Story> story) : m_Story(std::move(story))
{
    KORVANE_ASSERT(m_Story);
}

TextFlow::~TextFlow()
{
    SetFrames({});
}

void TextFlow::SetStory(Kernel::Counted<Story::Story> story)
{
    KORVANE_ASSERT(story);
    m_Story = std::move(story);
}

void TextFlow::SetFrames(std::vector<Kernel::JailCounted<TextFrameNode>> frames)
{
    for (Kernel::JailCounted<TextFrameNode> const & frame : m_Frames) {
        frame->m_Flow = nullptr;
        frame->m_FrameIndex = -1;
    }
    m_Frames = std::move(frames);
    for (std::size_t i = 0; i < m_Frames.size(); ++i) {
        m_Frames[i]->m_Flow = this;
        m_Frames[i]->m_FrameIndex = static_cast<int>(i);
    }
}

void TextFlow::SetLayout(Kernel::Counted<Story::Layout> layout, std::uint64_t hash, GlyphLoader loader)
{
    std::lock_guard const lock(m_GlyphLock);
    m_Layout = std::move(layout);
    m_LayoutHash = hash;
    m_GlyphsUsable = m_Layout && m_Layout->HasGlyphData();
    m_GlyphLoader = std::move(loader);
}

bool TextFlow::EnsureGlyphData() const
{
    std::lock_guard const lock(m_GlyphLock);
    if (!m_GlyphsUsable && m_GlyphLoader && m_Layout) {
        m_GlyphsUsable = m_GlyphLoader(*m_Layout) && m_Layout->LoadFonts();
        m_GlyphLoader = nullptr;
    }
    return m_GlyphsUsable;
}

Kernel::Counted<Selection> TextFlow::MakeSelection(Story::Selection const & selection)
{
    return Kernel::MakeCounted<Selection>(Kernel::Counted<TextFlow>(this), selection.GetAnchor().GetOffset(),
                                          selection.GetCaret().GetOffset());
}

Kernel::JailCounted<TextFrameNode> TextFlow::FindFrame(std::size_t position) const
{
    if (!m_Layout) {
        return nullptr;
    }
    auto const frames = m_Layout->GetFrames();
    // The first frame whose text goes beyond the position; the end of the text belongs to the last frame that has any.
    auto frame = std::find_if(frames.begin(), frames.end(),
                              [position](auto const & candidate) { return position < candidate.m_TextEnd; });
    if (frame == frames.end() && !m_Layout->IsOverset()) {
        while (frame != frames.begin() && std::prev(frame)->m_TextBegin == std::prev(frame)->m_TextEnd) {
            --frame;
        }
        if (frame != frames.begin()) {
            --frame;
        }
    }
    return frame == frames.end() ? nullptr : GetFrame(static_cast<std::uint32_t>(frame - frames.begin()));
}

Kernel::JailCounted<TextFrameNode> TextFlow::GetFrame(std::uint32_t number) const
{
    return number < m_Frames.size() ? m_Frames[number] : nullptr;
}

std::vector<TextFlow::FontStamp> TextFlow::GetFonts() const
{
    std::lock_guard const lock(m_GlyphLock);
    if (!m_GlyphsUsable || !m_Layout) {
        return m_SavedFonts;
    }
    std::vector<FontStamp> fonts;
    for (Story::LayoutFont const & font : m_Layout->GetFonts()) {
        FontStamp stamp{font.m_Path, {}};
        Kernel::FileSystem::GetModifiedTime(font.m_Path, stamp.m_Time);
        fonts.push_back(std::move(stamp));
    }
    return fonts;
}
