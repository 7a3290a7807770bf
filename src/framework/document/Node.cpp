#include "framework/document/Node.h"

#include "framework/document/DocumentNode.h"
#include "framework/document/SpreadNode.h"

Kernel::JailCounted<SpreadNode> Node::GetSpreadNode() const
{
    for (Node const * node = this; node; node = node->GetParent()) {
        if (Kind::Spread == node->GetKind() || Kind::MasterSpread == node->GetKind()) {
            return Kernel::JailCounted<SpreadNode>(dynamic_cast<SpreadNode *>(const_cast<Node *>(node)));
        }
    }
    return nullptr;
}

Kernel::JailCounted<DocumentNode> Node::GetDocumentNode() const
{
    Node const * node = this;
    while (node->GetParent()) {
        node = node->GetParent();
    }
    return Kernel::JailCounted<DocumentNode>(dynamic_cast<DocumentNode *>(const_cast<Node *>(node)));
}
