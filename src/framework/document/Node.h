#pragma once

#include "framework/kernel/Countable.h"
#include "framework/kernel/Counted.h"
#include "framework/kernel/Geometry.h"
#include "framework/kernel/StringT.h"
#include "framework/kernel/TreeBaseNDJailCounted.h"

class DocumentNode;
class SpreadNode;

/// The five lists in which a node keeps its children, in the order in which a walk visits them.
enum NodeChildListType
{
    /// Of the document node: its spreads, in page order.
    NodeChildListSpreads,
    /// Of a spread or master spread: items beneath everything else, such as backgrounds.
    NodeChildListUnder,
    /// Of a spread or master spread: text frames and pictures, back to front. Of the document node: protected files that
    /// the text shows.
    NodeChildListItems,
    /// Of a spread or master spread: items on top of everything else.
    NodeChildListOver,
    /// Of the document node: its master spreads.
    NodeChildListMasters
};

/// One element of a document's tree: the document itself, a spread, a frame, a picture.
///
/// What a node can do beyond having a place and a size it tells by the interfaces in NodeInterfaces.h, which are had by
/// `CountedCast`. The tree belongs to its `DocumentController`: it changes under that controller's writer lock only,
/// and is read under its reader lock, one stretch at a time. All measures are points, y down, from the top left of the
/// spread.
class Node : public virtual Kernel::Countable, public Kernel::TreeBaseNDJailCounted<Node, 5, NodeChildListType>
{
public:
    /// What to leave out when a node is drawn.
    struct NodeRenderOptions
    {
        /// Leaves the paper transparent.
        bool m_TransparentBackground = false;
        /// Draws the items of the page's master too.
        bool m_IncludeMasterItems = true;
    };

    /// What a node is, as it is written to a file.
    enum class Kind : std::uint8_t
    {
        Document = 1,
        Spread = 2,
        MasterSpread = 3,
        TextFrame = 4,
        Picture = 5,
        Shape = 6,
        EmbeddedDocument = 7,
        RunningText = 8
    };

    [[nodiscard]] virtual Kind GetKind() const = 0;

    /// The spread (or master spread) that this node is or lies on; null for the document node and for loose nodes.
    [[nodiscard]] Kernel::JailCounted<SpreadNode> GetSpreadNode() const;
    /// The root of the tree; null if the topmost node is not a document.
    [[nodiscard]] Kernel::JailCounted<DocumentNode> GetDocumentNode() const;

    /// What the node covers on its spread, with its strokes if `includeStroke`. Empty for a node without an extent.
    [[nodiscard]] virtual Kernel::RectT<double> GetSpreadBaseBox(bool includeStroke) const = 0;

protected:
    Node() = default;
};
