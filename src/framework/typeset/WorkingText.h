#pragma once

#include "framework/typeset/ParagraphInput.h"
#include "framework/typeset/ShapeCache.h"

#include <algorithm>
#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace Typeset
{

/// A run of the text that is shaped.
struct WorkRun
{
    std::uint32_t m_End = 0;
    std::uint32_t m_Style = 0;
    std::uint32_t m_Object = 0xFFFFFFFF; ///< The object whose text this is, or whose box this U+FFFC is.
    bool m_ScaledCapitals = false;
};

/// The paragraph's text as it is shaped and broken: without what sets nothing, with objects' texts in their places,
/// capitals applied. Plain text is used where it stands; the rest is copied, with a map back.
class WorkingText
{
public:
    void Prepare(ParagraphInput const & input, std::vector<ResolvedStyle *> const & styles, ShapeCache & cache);

    [[nodiscard]] std::u16string_view GetText() const noexcept { return m_Text; }
    [[nodiscard]] std::vector<WorkRun> const & GetRuns() const noexcept { return m_Runs; }
    /// All flags of CharacterInfo that occur in the text.
    [[nodiscard]] unsigned GetFlags() const noexcept { return m_Flags; }

    /// Offset in the paragraph's text.
    [[nodiscard]] std::uint32_t ToSource(std::size_t position) const noexcept
    {
        return m_Map.empty() ? static_cast<std::uint32_t>(position) : m_Map[position];
    }

    /// Offset in the paragraph's text after what the code unit before the position stands for. (Several may stand for
    /// one: an object's text, "SS" for a capital sharp s.)
    [[nodiscard]] std::uint32_t ToSourceEnd(std::size_t position) const noexcept
    {
        return m_Map.empty() || position == 0 ? ToSource(position)
                                              : std::max(m_Map[position], m_Map[position - 1] + 1);
    }

    /// Places for a hyphen that the text itself gives (U+00AD), ascending.
    [[nodiscard]] std::vector<std::uint32_t> const & GetSoftHyphens() const noexcept { return m_SoftHyphens; }
    /// Places where the line must not be broken, ascending.
    [[nodiscard]] std::vector<std::uint32_t> const & GetTies() const noexcept { return m_Ties; }

    /// One of the characters that end a line. Line separators are all the same here: U+2028.
    static constexpr char16_t LineSeparator = u'\u2028';

private:
    void Copy(ParagraphInput const & input, std::vector<ResolvedStyle *> const & styles, ShapeCache & cache);
    void CopyStretch(ParagraphInput const & input, std::size_t start, std::size_t end, TextStyle const & style,
                     bool scalesCapitals, WorkRun run, ShapeCache & cache);
    void AppendRun(WorkRun run);
    void UpperCase(std::size_t start, String const & language);

    std::u16string_view m_Text;
    std::vector<WorkRun> m_Runs;
    std::vector<std::uint32_t> m_SoftHyphens;
    std::vector<std::uint32_t> m_Ties;
    unsigned m_Flags = 0;

    std::u16string m_Copy;
    std::vector<std::uint32_t> m_Map;
};

}
