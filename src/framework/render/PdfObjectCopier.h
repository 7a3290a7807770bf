#pragma once

#include <functional>
#include <map>
#include <string>
#include <vector>

#include "framework/render/Qpdf.h"

namespace Renderer::RenderTree
{

/// Takes objects from a PDF file into another one, with all that they refer to; each object once, however often `Copy` is
/// called. Works through a list instead of calling itself, so that no chain of references is too long for it.
///
/// What belongs to the other document and not to the look of a page stays behind: the page tree, metadata, private data
/// of programs, structure, and streams or pictures that lie in files elsewhere.
class PdfObjectCopier
{
public:
    using Handle = QPDFObjectHandle;
    /// Makes a stream of the target with these bytes; its dictionary is filled in afterwards.
    using StreamMaker = std::function<Handle(std::string bytes)>;

    PdfObjectCopier(QPDF & target, StreamMaker makeStream) : m_Target(target), m_MakeStream(std::move(makeStream)) {}

    /// The value in terms of the target. Throws what libqpdf throws for objects that can't be read.
    Handle Copy(Handle value);
    /// The target's object for an indirect one of the source; null if it was not copied.
    [[nodiscard]] Handle Find(Handle value) const;

private:
    /// An object of the source whose content has to be filled in.
    struct Pending
    {
        Handle m_From;
        Handle m_To;
    };

    Handle Translate(Handle value);
    Handle Refer(Handle value);
    void FillDictionary(Handle from, Handle to, bool isStream);

    QPDF & m_Target;
    StreamMaker m_MakeStream;
    std::map<QPDFObjGen, Handle> m_Known;
    std::vector<Pending> m_Pending;
};

}
