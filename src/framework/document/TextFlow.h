#pragma once

#include "framework/document/TextFrameNode.h"
#include "framework/kernel/TimeStamp.h"
#include "framework/story/Layout.h"
#include "framework/story/Story.h"

#include <functional>
#include <mutex>
#include <vector>

class Selection;

/// What a flow is there for. The numbers are written in files.
enum class TextFlowPurpose : std::uint8_t
{
    Text = 0,
    /// Holds the generated index of the document or book.
    Index = 1
};

/// A story in its chain of frames, with its composed layout.
///
/// Frame `i` of the chain shows frame `i` of the layout. The layout is a snapshot: composing puts another in its place.
/// A layout that comes from a file has its small facts at once, and its glyphs from the first `EnsureGlyphData` on. All
/// needs the document's reader lock, changing its writer lock.
class TextFlow : public virtual Kernel::Countable
{
public:
    /// A font file that a layout was made with, and its modification time then.
    struct FontStamp
    {
        String m_Path;
        Kernel::TimeStamp m_Time;
    };
    /// Reads the saved glyph data into the layout; false if it can't be had.
    using GlyphLoader = std::function<bool(Story::Layout &)>;

    explicit TextFlow(Kernel::Counted<Story::Story> story);
    ~TextFlow() override;

    /// Never null.
    [[nodiscard]] Kernel::Counted<Story::Story> const & GetStory() const { return m_Story; }
    /// Another text; whoever changes it tells the document that its text is dirty.
    void SetStory(Kernel::Counted<Story::Story> story);

    [[nodiscard]] std::vector<Kernel::JailCounted<TextFrameNode>> const & GetFrames() const { return m_Frames; }
    void SetFrames(std::vector<Kernel::JailCounted<TextFrameNode>> frames);

    /// Null before the first composition.
    [[nodiscard]] Kernel::Counted<Story::Layout const> GetLayout() const { return m_Layout; }
    /// A layout with what it was made from: `hash` covers text, styles and geometry. `loader` is empty for a layout
    /// that has its glyphs.
    void SetLayout(Kernel::Counted<Story::Layout> layout, std::uint64_t hash, GlyphLoader loader);
    /// The fonts of a layout whose glyphs are still in the file.
    void SetSavedFonts(std::vector<FontStamp> fonts) { m_SavedFonts = std::move(fonts); }
    /// The fonts of the layout as they are now, or as the file has them if the glyphs are still there.
    [[nodiscard]] std::vector<FontStamp> GetFonts() const;
    [[nodiscard]] std::uint64_t GetLayoutHash() const { return m_LayoutHash; }
    /// Makes the glyph data available. False if there is no layout, or if its glyphs or fonts can't be had any more:
    /// the flow has to be composed again. Any number of threads may call it at once.
    [[nodiscard]] bool EnsureGlyphData() const;

    /// The chain grows and shrinks with the text, by whole pages made from the document's masters.
    [[nodiscard]] bool IsGrowing() const { return m_Growing; }
    void SetGrowing(bool growing) { m_Growing = growing; }

    [[nodiscard]] TextFlowPurpose GetPurpose() const { return m_Purpose; }
    void SetPurpose(TextFlowPurpose purpose) { m_Purpose = purpose; }

    [[nodiscard]] Kernel::Counted<Selection> MakeSelection(Story::Selection const & selection);

    /// The frame that shows the position; null if the text there found no place. Needs no glyphs.
    [[nodiscard]] Kernel::JailCounted<TextFrameNode> FindFrame(std::size_t position) const;
    /// Frame of that number in the layout; null if the chain is shorter.
    [[nodiscard]] Kernel::JailCounted<TextFrameNode> GetFrame(std::uint32_t number) const;

private:
    Kernel::Counted<Story::Story> m_Story;
    std::vector<Kernel::JailCounted<TextFrameNode>> m_Frames;
    Kernel::Counted<Story::Layout> m_Layout;
    std::vector<FontStamp> m_SavedFonts;
    std::uint64_t m_LayoutHash = 0;
    bool m_Growing = false;
    TextFlowPurpose m_Purpose = TextFlowPurpose::Text;

    mutable std::mutex m_GlyphLock;
    /// Used up by the first attempt. Guarded by the lock.
    mutable GlyphLoader m_GlyphLoader;
    /// Guarded by the lock.
    mutable bool m_GlyphsUsable = false;
};
