#pragma once

#include "framework/typeset/LineArena.h"
#include "framework/typeset/ParagraphInput.h"

#include <cstdint>
#include <memory>

namespace Typeset
{

/// Where a paragraph's lines lie in the arena.
struct ParagraphLines
{
    std::uint32_t m_FirstLine = 0;
    std::uint32_t m_LineCount = 0; ///< At least 1: an empty paragraph has one line without runs.
    bool m_RightToLeft = false;    ///< The paragraph's base direction.
};

/// Sets paragraphs: itemisation (UAX #9, #24), fonts with fallback, shaping, hyphenation, line breaking, justification.
///
/// One thread at a time uses a builder; any number of builders work beside each other. A builder borrows a cache of
/// shaped words from a pool of the process at construction and gives it back at destruction, so a short-lived builder
/// is cheap and starts warm. The result depends only on the input and the installed fonts, never on what was set
/// before.
///
/// Any input gives lines that cover the text; the time is nearly linear in its length.
class ParagraphBuilder
{
public:
    ParagraphBuilder();
    ~ParagraphBuilder();
    ParagraphBuilder(ParagraphBuilder const &) = delete;
    ParagraphBuilder & operator=(ParagraphBuilder const &) = delete;

    /// Appends the paragraph's lines to the arena.
    ParagraphLines Build(ParagraphInput const & input, LineArena & arena);

    /// Empties the process's caches of shaped words that no builder is using. For measurements.
    static void DropCaches();

private:
    struct Work;
    std::unique_ptr<Work> m_Work;
};

}
