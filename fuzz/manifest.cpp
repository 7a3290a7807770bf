#include "import/BookPlan.h"
#include "import/SourceText.h"
#include "import/Template.h"

#include <cstdint>

/// Any text is tried as a manifest, as a table of contents and as a template.
extern "C" int LLVMFuzzerTestOneInput(std::uint8_t const * data, std::size_t size)
{
    using namespace Import;
    MessageList messages;
    auto const text = DecodeSourceText(std::string(reinterpret_cast<char const *>(data), size), "fuzz.toml", messages);
    if (!text) {
        return 0;
    }
    BookPlan plan;
    plan.m_Folder = "/nonexistent";
    ReadManifestText(*text, "fuzz.toml", plan, messages);
    ReadSummaryText(*text, "SUMMARY.md", plan, messages);
    ReadTemplateText(*text, "fuzz.toml", messages);
    return 0;
}
