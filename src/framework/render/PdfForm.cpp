#include "framework/render/PdfForm.h"

#include "framework/render/PdfText.h"

namespace Renderer::RenderTree
{

bool MakeForm(PdfSource::Page const & page, PdfSource::Content const & content, PdfObjectCopier & copier,
              QPDFObjectHandle stream)
{
    using Handle = QPDFObjectHandle;
    Handle dictionary = stream.getDict();
    std::string box = "[";
    for (double const value : {page.m_Box.left, page.m_Box.bottom, page.m_Box.right, page.m_Box.top}) {
        AppendNumber(box, value);
        box += ' ';
    }
    dictionary.replaceKey("/Type", Handle::newName("/XObject"));
    dictionary.replaceKey("/Subtype", Handle::newName("/Form"));
    dictionary.replaceKey("/BBox", Handle::parse(box + "]"));
    dictionary.replaceKey("/Matrix", Handle::parse(page.GetMatrix()));
    dictionary.replaceKey("/Resources",
                          Handle(page.m_Resources).isNull() ? Handle::newDictionary() : copier.Copy(page.m_Resources));
    if (!Handle(content.m_Filter).isNull()) {
        dictionary.replaceKey("/Filter", copier.Copy(content.m_Filter));
    }
    if (!Handle(content.m_Parameters).isNull()) {
        dictionary.replaceKey("/DecodeParms", copier.Copy(content.m_Parameters));
    }
    Handle group = Handle(page.m_Object).getKey("/Group");
    bool const isGroup = group.isDictionary() && group.getKey("/S").isNameAndEquals("/Transparency");
    if (isGroup) {
        dictionary.replaceKey("/Group", copier.Copy(group));
    }
    return isGroup;
}

}
