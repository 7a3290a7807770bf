#pragma once

#include "framework/document/Node.h"
#include "framework/document/NodeInterfaces.h"

/// A picture file placed on a page, scaled to fit its rectangle, in the middle of it. Pictures in the text are part of
/// their story and have no node.
class PictureNode : public Node, public GUIDInterface, public ImageResourceInterface
{
public:
    /// `guid` empty: a new one.
    PictureNode(Kernel::RectT<double> rect, String path, String guid);

    [[nodiscard]] Kind GetKind() const override { return Kind::Picture; }
    [[nodiscard]] Kernel::RectT<double> GetSpreadBaseBox(bool) const override { return m_Rect; }
    [[nodiscard]] String const & GetGUID() const override { return m_Guid; }
    [[nodiscard]] Kernel::Counted<Kernel::DataSource const> GetDataSource() const override { return m_Source; }
    [[nodiscard]] String const & GetPath() const { return m_Source->GetPath(); }

private:
    Kernel::RectT<double> m_Rect;
    Kernel::Counted<Kernel::DataSource const> m_Source;
    String m_Guid;
};
