#pragma once

#include "app/BookSession.h"
#include "framework/render/Warning.h"

#include <filesystem>
#include <optional>
#include <string>

namespace App
{

/// What the user wants of the PDF. What is not said here is as the options say that the book keeps.
struct PdfWishes
{
    std::optional<bool> m_HasMarks;
    std::optional<bool> m_IncludesBleed;
    std::optional<bool> m_EmbedsMetadata;
    /// Where the book names no language.
    std::string m_Language;
    /// Seconds since 1970 that stand for now in the file; negative for the clock.
    long long m_FixedTime = -1;
};

/// Writes all chapters of a book into one PDF, page by page. False, with the reason in `messages`, if it failed or was
/// interrupted; the target is then as it was before.
bool ExportBook(BookSession & session, Listener & listener, std::filesystem::path const & target,
                PdfWishes const & wishes, Import::MessageList & messages);

/// The cause of a failure, with what to do about it where it lies in the folder for temporary files.
[[nodiscard]] std::string WithRemedy(std::string const & cause);

/// Tells each thing that came out other than asked once, with the first page that it is on and the number of pages.
void TellWarnings(std::vector<Renderer::RenderTree::Warning> const & warnings, Import::MessageList & messages);

}
