#pragma once

#include "framework/document/DocumentSaveResult.h"
#include "framework/kernel/Archive.h"

#include <functional>

/// Fills the result of a save whose target could not be created.
void SetSaveFailure(DocumentSaveResult & result, Kernel::Archive::CreateResult const & created);

/// Runs what stores items in a new archive, up to the closing of its session, and fills `result` if it throws. `work`
/// gives false if it could not begin the session. True if all is stored; success itself is for the caller to tell.
///
/// | What failed | code |
/// |---|---|
/// | the archive's own file, or one that an item was read from | by its reason |
/// | another archive that an item was read from | 34, and its path |
/// | memory | 2 |
/// | an item that cannot be written as it is | 39 |
/// | the session, or anything else | 38 |
[[nodiscard]] bool StoreArchive(DocumentSaveResult & result, Kernel::Counted<Kernel::Archive> const & archive,
                                std::function<bool()> const & work);
