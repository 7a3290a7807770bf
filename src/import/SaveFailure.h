#pragma once

#include <string>

class DocumentSaveResult;

namespace Import
{

/// One sentence on why `file` could not be written, for the user.
std::string DescribeSaveFailure(DocumentSaveResult const & result, std::string const & file);

}
