#pragma once

#include "framework/kernel/HashAccumulator.h"
#include "framework/story/AnchorData.h"
#include "framework/story/Layout.h"
#include "framework/story/SpecialGlyphs.h"
#include "framework/story/Story.h"
#include "framework/story/StyleSheet.h"

#include <atomic>
#include <functional>
#include <memory>
#include <optional>
#include <string>

namespace Story
{

/// A frame that text may flow into, in points.
struct FrameGeometry
{
    double m_Width = 0;
    double m_Height = 0;
    /// Distance of the baseline grid's lines; 0 for no grid.
    double m_GridStep = 0;
    /// First line of the grid, from the frame's top.
    double m_GridOffset = 0;
};

/// Gives the frame of that number, counted from 0, or nothing: then the rest of the text is overset. Frames are asked
/// for in order, each once, when something is to be set in them; frame 0 is the first page of the chapter.
using FrameSource = std::function<std::optional<FrameGeometry>(std::uint32_t number)>;

struct ComposeOptions
{
    /// Number of the first note, over what the first reference says.
    std::optional<int> m_FirstNoteNumber;
    /// Heading over the notes at the end; no heading if it is empty.
    String m_NotesHeading = "Notes";
    /// Sets the notes behind the text. Without it only their references show.
    bool m_SetsNotes = true;
    /// Text of a field, in UTF-16; without it fields are empty.
    std::function<std::u16string(FieldGlyph const &)> m_FieldText;
    /// A flow has at most so many frames; what is left is overset.
    std::uint32_t m_MaximumFrames = 100000;
    /// Polled; when it is set, `Compose` gives up and returns null.
    std::atomic<bool> const * m_Abort = nullptr;
};

/// Sets a story in a chain of frames.
///
/// Each paragraph is broken into lines once for its measure; then the lines are placed with the rules of keeps, widows
/// and orphans, and the grid. Notes are numbered in the order of their references and set behind the text. The result
/// depends only on the arguments and the installed fonts. Time and memory are linear in the text. Every geometry
/// terminates: a frame takes at least one piece, and what is larger than an empty frame is cut off there and
/// reported. One thread uses a composer at a time; composers on several threads are independent. The story and the
/// sheet are read for the length of the call.
class FlowComposer
{
public:
    FlowComposer();
    ~FlowComposer();
    FlowComposer(FlowComposer const &) = delete;
    FlowComposer & operator=(FlowComposer const &) = delete;

    [[nodiscard]] Kernel::Counted<Layout> Compose(Story const & story, StyleSheet const & styles,
                                                  FrameSource const & frames, ComposeOptions const & options);

private:
    struct Work;
    std::unique_ptr<Work> m_Work;
};

/// An anchor of a story, in the order of `Layout::GetAnchors`.
struct CollectedAnchor
{
    Kernel::Counted<AnchorGlyph const> m_Glyph;
    Kernel::Counted<AnchorData> m_Data;
    /// Offset in the main story: of the anchor, or of the element that holds it.
    std::uint32_t m_StoryOffset = 0;
};

/// The anchors of a story and of the stories that hang on its elements, each element's before what follows it.
[[nodiscard]] std::vector<CollectedAnchor> CollectAnchors(Story const & story);

/// Version of the composer's rules: part of what says whether a saved layout still holds.
inline constexpr std::uint32_t ComposerVersion = 1;

}
