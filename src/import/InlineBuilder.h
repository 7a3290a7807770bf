#pragma once

#include "import/ChapterText.h"
#include "import/SmartTypography.h"

#include <optional>
#include <string_view>
#include <vector>

namespace Import
{

/// Gathers the text of one paragraph with its looks, links and objects, and lets it be edited before it is final.
/// Line ends of the source are kept as U+000A until `Finish`.
class InlineBuilder
{
public:
    void SetMarks(Mark marks) { m_Marks = marks; }
    void SetLink(std::int32_t link) { m_Link = link; }
    [[nodiscard]] std::int32_t GetLink() const { return m_Link; }

    /// Appends text in the present look. Verbatim text is exempt from every later edit.
    void Append(std::u16string_view text, bool isVerbatim);
    void Append(char16_t character);
    void AddObject(ObjectKind kind, std::uint32_t index);
    /// Inserts an object that occupies nothing.
    void AddObjectAt(std::uint32_t position, ObjectKind kind, std::uint32_t index);
    /// A source line that starts at the present position.
    void StartLine(int line);

    [[nodiscard]] std::u16string const & Text() const { return m_Text; }
    [[nodiscard]] std::uint32_t Position() const { return static_cast<std::uint32_t>(m_Text.size()); }
    [[nodiscard]] bool Empty() const { return m_Text.empty() && m_Objects.empty(); }
    [[nodiscard]] bool HasObjectsOf(ObjectKind kind) const;
    [[nodiscard]] std::vector<InlineObject> const & Objects() const { return m_Objects; }
    [[nodiscard]] bool IsVerbatim(std::size_t position) const;
    [[nodiscard]] std::vector<bool> VerbatimMask() const;
    [[nodiscard]] int LineAt(std::size_t position) const;

    /// Adds looks to the stretch [start, end).
    void AddMarks(std::uint32_t start, std::uint32_t end, Mark marks);
    /// Applies edits, which must be in order and apart; looks and objects move along. An object inside of removed text
    /// goes to its end.
    void Apply(std::vector<TextEdit> const & edits);

    /// Turns line ends into spaces (or into nothing between ideographs), trims both ends, and gives the result out.
    InlineText Finish();

private:
    struct Run
    {
        std::uint32_t m_Start = 0;
        Mark m_Marks = Mark::None;
        std::int32_t m_Link = -1;
        bool m_IsVerbatim = false;
    };

    void StartRun(bool isVerbatim);
    [[nodiscard]] Run const * RunAt(std::size_t position) const;

    std::u16string m_Text;
    std::vector<Run> m_Runs;
    std::vector<InlineObject> m_Objects;
    std::vector<std::pair<std::uint32_t, int>> m_Lines;
    Mark m_Marks = Mark::None;
    std::int32_t m_Link = -1;
};

}
