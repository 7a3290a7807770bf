#include "framework/kernel/ContentHash.h"

#include "framework/kernel/DiskFault.h"
#include "framework/kernel/Hexadecimal.h"

#include <fcntl.h>
#include <nettle/sha2.h>
#include <unistd.h>
#include <vector>

namespace Kernel
{

namespace
{

int DigitValue(char c)
{
    if ('0' <= c && c <= '9') {
        return c - '0';
    }
    if ('a' <= c && c <= 'f') {
        return c - 'a' + 10;
    }
    return 'A' <= c && c <= 'F' ? c - 'A' + 10 : -1;
}

}

struct ContentHasher::State
{
    sha256_ctx m_Context;
};

ContentHasher::ContentHasher() : m_State(std::make_unique<State>())
{
    sha256_init(&m_State->m_Context);
}

ContentHasher::~ContentHasher() = default;

void ContentHasher::AddBytes(void const * data, std::size_t size)
{
    sha256_update(&m_State->m_Context, size, static_cast<std::uint8_t const *>(data));
}

ContentHash ContentHasher::Finish()
{
    ContentHash::Bytes bytes;
    sha256_digest(&m_State->m_Context, bytes.size(), bytes.data());
    return ContentHash(bytes);
}

ContentHash ContentHash::OfBytes(void const * data, std::size_t size)
{
    ContentHasher hasher;
    hasher.AddBytes(data, size);
    return hasher.Finish();
}

bool ContentHash::OfFile(String const & path, ContentHash & hash)
{
    if (DiskFault::Ask(DiskOperation::Open, path.c_str()) != 0) {
        return false;
    }
    int const file = ::open(path.c_str(), O_RDONLY | O_CLOEXEC);
    if (file < 0) {
        return false;
    }
    ContentHasher hasher;
    std::vector<char> buffer(256 * 1024);
    ssize_t got = 0;
    do {
        got = DiskFault::Ask(DiskOperation::Read, path.c_str()) != 0 ? -1 : ::read(file, buffer.data(), buffer.size());
        if (0 < got) {
            hasher.AddBytes(buffer.data(), static_cast<std::size_t>(got));
        }
    } while (0 < got);
    ::close(file);
    if (got < 0) {
        return false;
    }
    hash = hasher.Finish();
    return true;
}

bool ContentHash::FromString(String const & text, ContentHash & hash)
{
    Bytes bytes;
    if (text.Length() != bytes.size() * 2) {
        return false;
    }
    for (std::size_t i = 0; i < bytes.size(); ++i) {
        int const high = DigitValue(text.Data()[2 * i]);
        int const low = DigitValue(text.Data()[2 * i + 1]);
        if (high < 0 || low < 0) {
            return false;
        }
        bytes[i] = static_cast<std::uint8_t>(high << 4 | low);
    }
    hash = ContentHash(bytes);
    return true;
}

String ContentHash::ToString() const
{
    return ToHexadecimal(m_Bytes);
}

}
