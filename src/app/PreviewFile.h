#pragma once

#include "framework/document/DocumentController.h"
#include "import/Message.h"

#include <filesystem>

namespace App
{

/// Writes the preview picture that a book file carries to a PNG file; whatever is wrong becomes a message. `file` is the
/// book as the user named it.
void WriteBookPreview(std::string const & file, std::filesystem::path const & book, std::filesystem::path const & target,
                      Import::MessageList & messages);

/// The same for a document, drawn from its first spread.
void WriteDocumentPreview(std::string const & file, Kernel::Counted<DocumentController const> const & document,
                          std::filesystem::path const & target, Import::MessageList & messages);

}
