#pragma once

#include "framework/kernel/Countable.h"
#include "framework/kernel/Counted.h"
#include "framework/kernel/DataSource.h"
#include "framework/kernel/StringT.h"
#include "framework/story/Story.h"

class TextFlow;

/// A node that shows text of a story. Had from a `Node` by `CountedCast`.
class StoryInterface : public virtual Kernel::Countable
{
public:
    /// The story that the node shows a part of; never null.
    [[nodiscard]] virtual Kernel::Counted<Story::Story> GetStory() const = 0;
    /// What of the story this node holds, by its layout; a null selection where it holds nothing. With `wholeStory` all
    /// of the story.
    [[nodiscard]] virtual Story::Selection GetStorySelection(bool wholeStory) const = 0;
};

/// A node that is one link of a chain of text frames.
class TextFrameInterface : public virtual Kernel::Countable
{
public:
    [[nodiscard]] virtual Kernel::Counted<TextFlow> GetTextFlow() const = 0;
    /// Position in the chain, from 0.
    [[nodiscard]] virtual int GetFrameIndex() const = 0;
};

/// A node with an identity of its own that outlives saving, in UUID form.
class GUIDInterface : public virtual Kernel::Countable
{
public:
    [[nodiscard]] virtual String const & GetGUID() const = 0;
};

/// A node that shows a file.
class ImageResourceInterface : public virtual Kernel::Countable
{
public:
    /// Where the file's bytes come from; never null, also if the file is missing.
    [[nodiscard]] virtual Kernel::Counted<Kernel::DataSource const> GetDataSource() const = 0;
};

/// A node that output may leave out.
class VisibilityInterface : public virtual Kernel::Countable
{
public:
    /// Which kinds of nodes take part; six switches in the order in which they are given.
    struct VisibilityTestOptions
    {
        bool m_Visible = true;
        bool m_Printing = true;
        bool m_MasterItems = true;
        bool m_Hidden = false;
        bool m_NonPrinting = false;
        bool m_Guides = false;
    };

    [[nodiscard]] virtual bool IsVisible(VisibilityTestOptions const & options) const = 0;
};
