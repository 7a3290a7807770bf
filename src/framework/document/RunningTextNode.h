#pragma once

#include "framework/document/Node.h"

#include <vector>

/// What a piece of a running text shows.
enum class RunningTextField : std::uint8_t
{
    /// The piece's own text.
    Text,
    /// The page's formatted number.
    PageNumber,
    /// The title of the publication that the document is a part of; the document's own if there is none.
    PublicationTitle,
    /// The document's title.
    DocumentTitle
};

/// One piece of a running text. A plain value.
struct RunningTextPart
{
    RunningTextField m_Field = RunningTextField::Text;
    String m_Text;

    friend bool operator==(RunningTextPart const &, RunningTextPart const &) = default;
};

enum class RunningTextAlignment : std::uint8_t
{
    Left,
    Centre,
    Right
};

/// A line of text on a master whose fields are filled in for each page when it is drawn: a running head or a folio.
///
/// It is set in one line on the bottom of its rectangle, in a paragraph style of the document. A line that is too long
/// is cut at a word, with an ellipsis. A line whose fields are all empty shows nothing.
class RunningTextNode : public Node
{
public:
    RunningTextNode(Kernel::RectT<double> rect, std::vector<RunningTextPart> parts, RunningTextAlignment alignment,
                    String style)
        : m_Rect(rect),
          m_Parts(std::move(parts)),
          m_Style(std::move(style)),
          m_Alignment(alignment)
    {
    }

    [[nodiscard]] Kind GetKind() const override { return Kind::RunningText; }
    [[nodiscard]] Kernel::RectT<double> GetSpreadBaseBox(bool) const override { return m_Rect; }
    [[nodiscard]] std::vector<RunningTextPart> const & GetParts() const { return m_Parts; }
    [[nodiscard]] RunningTextAlignment GetAlignment() const { return m_Alignment; }
    /// Name of the paragraph style.
    [[nodiscard]] String const & GetStyle() const { return m_Style; }

private:
    Kernel::RectT<double> m_Rect;
    std::vector<RunningTextPart> m_Parts;
    String m_Style;
    RunningTextAlignment m_Alignment;
};
