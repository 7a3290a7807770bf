#pragma once

#include "framework/document/Node.h"
#include "framework/kernel/Abortable.h"

#include <functional>
#include <set>
#include <vector>

class StoryInterface;

/// A walk over a node tree: depth first, each node before its children, over the five child lists in their order.
///
/// Translators are asked in the order of registration; the first that takes a node ends the asking for that node, not
/// the walk. The walk stops when the visitor is aborted. The caller holds the document's reader lock.
class DOMVisitor : public virtual Kernel::Abortable
{
public:
    virtual ~DOMVisitor();

    void Visit(Kernel::JailNonCounted<Node> node);

protected:
    /// Takes a node if it is one of its kind.
    using Translator = std::function<bool(Node &)>;

    void AddTranslator(Translator translator) { m_Translators.push_back(std::move(translator)); }

private:
    std::vector<Translator> m_Translators;
};

/// A visitor whose translators are member functions of `TVisitor`.
template <typename TVisitor>
class DOMVisitorT : public DOMVisitor
{
protected:
    /// Calls `visit` for each node of class `TNode` and asks no later translator about it.
    template <typename TNode>
    void AddTerminatingTranslator(void (TVisitor::*visit)(TNode &))
    {
        AddTranslator([this, visit](Node & node) {
            TNode * const typed = dynamic_cast<TNode *>(&node);
            if (typed) {
                (static_cast<TVisitor *>(this)->*visit)(*typed);
            }
            return typed != nullptr;
        });
    }
};

/// Remembers which stories a walk has met: a story shows up at each frame of its chain.
class VisitedStories
{
public:
    /// True if the story was asked about before; remembers it.
    [[nodiscard]] bool HasVisitedStory(Kernel::NonCounted<StoryInterface const> story);

private:
    std::set<void const *> m_Stories;
};
