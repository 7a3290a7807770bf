#include "framework/document/PictureNode.h"

#include "framework/kernel/Uuid.h"

PictureNode::PictureNode(Kernel::RectT<double> rect, String path, String guid)
    : m_Rect(rect),
      m_Source(Kernel::MakeCounted<Kernel::DataSource>(std::move(path))),
      m_Guid(guid.Empty() ? Kernel::Uuid().ToString() : std::move(guid))
{
}
