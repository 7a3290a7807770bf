#include "framework/render/PdfObjectCopier.h"

#include <algorithm>
#include <string_view>

namespace Renderer::RenderTree
{

namespace
{

using Handle = QPDFObjectHandle;

/// Keys that lead out of what a page shows.
bool StaysBehind(std::string const & key, bool isStream)
{
    static constexpr std::string_view always[] = {"/Metadata",     "/PieceInfo", "/LastModified", "/StructParent",
                                                  "/StructParents", "/OPI",      "/Ref",          "/AF"};
    // Of a stream: where its bytes lie, in another file. libqpdf sets the length.
    static constexpr std::string_view ofStreams[] = {"/F", "/FFilter", "/FDecodeParms", "/Length", "/DL"};
    return std::end(always) != std::find(std::begin(always), std::end(always), key) ||
           (isStream && std::end(ofStreams) != std::find(std::begin(ofStreams), std::end(ofStreams), key));
}

bool IsOfDocument(Handle value)
{
    return value.isDictionaryOfType("/Page") || value.isDictionaryOfType("/Pages") ||
           value.isDictionaryOfType("/Catalog");
}

}

Handle PdfObjectCopier::Copy(Handle value)
{
    Handle const copy = Translate(value);
    while (!m_Pending.empty()) {
        Pending const next = m_Pending.back();
        m_Pending.pop_back();
        Handle from = next.m_From;
        Handle to = next.m_To;
        if (from.isStream()) {
            FillDictionary(from.getDict(), to.getDict(), true);
        } else if (from.isDictionary()) {
            FillDictionary(from, to, false);
        } else {
            for (int i = 0; i < from.getArrayNItems(); ++i) {
                to.appendItem(Translate(from.getArrayItem(i)));
            }
        }
    }
    return copy;
}

Handle PdfObjectCopier::Find(Handle value) const
{
    auto const known = m_Known.find(value.getObjGen());
    return known == m_Known.end() ? Handle::newNull() : known->second;
}

Handle PdfObjectCopier::Translate(Handle value)
{
    if (value.isIndirect()) {
        return Refer(value);
    }
    if (value.isDictionary() || value.isArray()) {
        Handle copy = value.isDictionary() ? Handle::newDictionary() : Handle::newArray();
        m_Pending.push_back({value, copy});
        return copy;
    }
    return value.isScalar() ? value.shallowCopy() : Handle::newNull();
}

Handle PdfObjectCopier::Refer(Handle value)
{
    auto const [place, isNew] = m_Known.try_emplace(value.getObjGen());
    if (!isNew) {
        return place->second;
    }
    Handle copy;
    if (value.isStream()) {
        std::shared_ptr<Buffer> const raw = value.getRawStreamData();
        copy = m_MakeStream({reinterpret_cast<char const *>(raw->getBuffer()), raw->getSize()});
        m_Pending.push_back({value, copy});
    } else if ((value.isDictionary() && !IsOfDocument(value)) || value.isArray()) {
        copy = m_Target.makeIndirectObject(value.isArray() ? Handle::newArray() : Handle::newDictionary());
        m_Pending.push_back({value, copy});
    } else {
        copy = value.isScalar() ? value.shallowCopy() : Handle::newNull();
    }
    m_Known[value.getObjGen()] = copy;
    return copy;
}

void PdfObjectCopier::FillDictionary(Handle from, Handle to, bool isStream)
{
    for (std::string const & key : from.getKeys()) {
        if (!StaysBehind(key, isStream)) {
            to.replaceKey(key, Translate(from.getKey(key)));
        }
    }
}

}
