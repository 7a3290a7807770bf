#pragma once

#include "framework/kernel/Counted.h"

class DocumentController;

/// Questions about generated indexes.
class IndexVisitor
{
public:
    /// The document holds a place where an index is generated.
    [[nodiscard]] static bool ContainsIndex(Kernel::Counted<DocumentController const> document);
};
