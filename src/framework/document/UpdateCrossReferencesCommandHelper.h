#pragma once

#include "framework/document/AnchorInfo.h"
#include "framework/document/Anchors.h"

/// What references to an anchor may show.
class UpdateCrossReferencesCommandHelper
{
public:
    /// Fills the six reference texts and nothing else. The caller holds the document's reader lock.
    static void FillAnchorInfo(AnchorInfo & info, Kernel::Counted<AnchorInstance const> anchor,
                               Kernel::Counted<DocumentController const> document);
};
