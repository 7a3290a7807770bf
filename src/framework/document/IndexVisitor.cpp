#include "framework/document/IndexVisitor.h"

#include "framework/document/DocumentController.h"
#include "framework/document/DocumentNode.h"

#include <algorithm>

bool IndexVisitor::ContainsIndex(Kernel::Counted<DocumentController const> document)
{
    auto const & flows = document->GetDocument()->GetTextFlows();
    return std::any_of(flows.begin(), flows.end(),
                       [](auto const & flow) { return TextFlowPurpose::Index == flow->GetPurpose(); });
}
