#include "framework/kernel/InStream.h"

#include "framework/kernel/FileIOException.h"
#include "framework/kernel/Format.h"

namespace Kernel
{

Counted<RawData const> InStream::ReadAll()
{
    std::uint64_t const rest = GetLength() - GetPosition();
    auto data = MakeCounted<RawData>(static_cast<std::size_t>(rest));
    std::size_t const got = Read(data->GetMutableData(), data->GetSize());
    if (got != rest) {
        throw FileIOException(FileIOException::Reason::ReadFailed, GetSourceName(),
                              Format(LocalisedString("%1 became shorter while it was read.", "File"), GetSourceName()));
    }
    return data;
}

}
