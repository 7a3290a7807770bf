#include "import/MarkdownReader.h"
#include "import/SourceText.h"

#include <cstdint>
#include <cstdlib>

/// Any bytes that decode as text are read as a chapter, whose spans must cover each text without gaps.
extern "C" int LLVMFuzzerTestOneInput(std::uint8_t const * data, std::size_t size)
{
    using namespace Import;
    MessageList messages;
    auto const text = DecodeSourceText(std::string(reinterpret_cast<char const *>(data), size), "fuzz.md", messages);
    if (!text) {
        return 0;
    }
    ChapterText const chapter = ReadMarkdown(*text, {"fuzz.md", "en", true}, messages);
    for (Block const & block : chapter.m_Blocks) {
        std::uint32_t at = 0;
        for (Span const & span : block.m_Text.m_Spans) {
            if (span.m_Start != at || 0 == span.m_Length ||
                static_cast<std::int32_t>(chapter.m_Links.size()) <= span.m_Link) {
                std::abort();
            }
            at += span.m_Length;
        }
        if (at != block.m_Text.m_Text.size()) {
            std::abort();
        }
    }
    return 0;
}
