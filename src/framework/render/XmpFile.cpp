#include "framework/render/XmpFile.h"

#include "framework/kernel/Assert.h"
#include "framework/kernel/FileSystem.h"
#include "framework/kernel/Format.h"

#include <exempi/xmp.h>
#include <memory>

namespace Renderer
{

namespace
{

struct StringDeleter
{
    void operator()(XmpStringPtr text) const { xmp_string_free(text); }
};
using StringPtr = std::unique_ptr<_XmpString, StringDeleter>;

struct XmpDeleter
{
    void operator()(XmpPtr xmp) const { xmp_free(xmp); }
};
using XmpHandle = std::unique_ptr<_Xmp, XmpDeleter>;

void StartToolkit()
{
    static bool const started = xmp_init();
    if (!started) {
        throw XmpException(
            Kernel::LocalisedString("The XMP toolkit could not be started.", "Output").ToString().ToStd());
    }
}

/// Text that the toolkit does not take for XMP, null; an empty description is XMP too.
XmpHandle Parse(String const & packet)
{
    bool const looksRight = packet.View().find("rdf:RDF") != std::string_view::npos;
    return XmpHandle(looksRight ? xmp_new(packet.Data(), packet.Length()) : nullptr);
}

}

struct XmpFile::State
{
    ~State()
    {
        if (m_File) {
            xmp_files_free(m_File);
        }
    }

    /// `sentence` has places for the path and the toolkit's error.
    [[noreturn]] void Fail(Kernel::LocalisedString const & sentence) const
    {
        throw XmpException(Kernel::Format(sentence, m_Path, xmp_get_error()).ToStd());
    }

    String m_Path;
    XmpFilePtr m_File = nullptr;
};

XmpFile::~XmpFile() = default;

bool XmpFile::Open(String const & path)
{
    KORVANE_ASSERT(!m_State);
    StartToolkit();
    auto state = std::make_shared<State>();
    state->m_Path = path;
    // The toolkit "opens" what is not there.
    if (!Kernel::FileSystem::Exists(path) || Kernel::FileSystem::IsFolder(path)) {
        return false;
    }
    state->m_File = xmp_files_new();
    if (!state->m_File || !xmp_files_open(state->m_File, path.c_str(), XMP_OPEN_FORUPDATE)) {
        return false;
    }
    m_State = std::move(state);
    return true;
}

String XmpFile::Read() const
{
    KORVANE_ASSERT(m_State);
    XmpHandle const xmp(xmp_files_get_new_xmp(m_State->m_File));
    if (!xmp) {
        return {};
    }
    StringPtr const text(xmp_string_new());
    if (!xmp_serialize(xmp.get(), text.get(), XMP_SERIAL_OMITPACKETWRAPPER, 0)) {
        m_State->Fail(Kernel::LocalisedString("The metadata of %1 can't be read (XMP toolkit error %2).", "Output"));
    }
    return xmp_string_cstr(text.get());
}

bool XmpFile::CanPut(String const & packet) const
{
    KORVANE_ASSERT(m_State);
    XmpHandle const xmp = Parse(packet);
    return xmp && xmp_files_can_put_xmp(m_State->m_File, xmp.get());
}

void XmpFile::Put(String const & packet)
{
    KORVANE_ASSERT(m_State);
    XmpHandle const xmp = Parse(packet);
    if (!xmp || !xmp_files_put_xmp(m_State->m_File, xmp.get())) {
        m_State->Fail(
            Kernel::LocalisedString("The metadata of %1 can't be replaced (XMP toolkit error %2).", "Output"));
    }
}

void XmpFile::Close()
{
    KORVANE_ASSERT(m_State);
    std::shared_ptr<State> const state = std::move(m_State);
    // Never by way of a temporary file of the toolkit's: it would lose the file's rights and owner.
    if (!xmp_files_close(state->m_File, XMP_CLOSE_NOOPTION)) {
        state->Fail(Kernel::LocalisedString("The metadata of %1 can't be written (XMP toolkit error %2).", "Output"));
    }
}

}
