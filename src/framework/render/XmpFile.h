#pragma once

#include <memory>
#include <stdexcept>

#include "framework/kernel/StringT.h"

namespace Renderer
{

/// The XMP toolkit could not do what it was asked; the text names the file.
class XmpException : public std::runtime_error
{
public:
    using std::runtime_error::runtime_error;
};

/// The XMP packet of a finished file, through the XMP toolkit (ISO 16684-1). Open, read or put, close. The toolkit is
/// started once a process, at first use. One thread an object.
class XmpFile
{
public:
    XmpFile() = default;
    /// Closes without writing.
    ~XmpFile();
    XmpFile(XmpFile const &) = delete;
    XmpFile & operator=(XmpFile const &) = delete;

    /// Opens for updating, the file's format found out from its content. False if the toolkit can't handle the file or
    /// it isn't there.
    [[nodiscard]] bool Open(String const & path);

    /// The packet as RDF text, empty if the file has none. Throws XmpException.
    [[nodiscard]] String Read() const;

    /// True if this packet would go into the file. `packet` must be XMP: anything else is refused here, as the toolkit
    /// would wipe the file's metadata.
    [[nodiscard]] bool CanPut(String const & packet) const;
    /// Replaces the packet; it is written by Close. Throws XmpException.
    void Put(String const & packet);
    /// Writes and closes. Throws XmpException; the file is closed all the same.
    void Close();

private:
    struct State;
    std::shared_ptr<State> m_State;
};

}
