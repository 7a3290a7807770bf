#include "framework/kernel/Uuid.h"

#include "framework/kernel/Entropy.h"

namespace Kernel
{

Uuid::Uuid()
{
    Entropy::Fill(m_Bytes.data(), m_Bytes.size());
    m_Bytes[6] = static_cast<std::uint8_t>((m_Bytes[6] & 0x0F) | 0x40);
    m_Bytes[8] = static_cast<std::uint8_t>((m_Bytes[8] & 0x3F) | 0x80);
}

String Uuid::ToString() const
{
    static constexpr char Digits[] = "0123456789abcdef";
    char text[36];
    char * at = text;
    for (std::size_t i = 0; i < m_Bytes.size(); ++i) {
        if (i == 4 || i == 6 || i == 8 || i == 10) {
            *at++ = '-';
        }
        *at++ = Digits[m_Bytes[i] >> 4];
        *at++ = Digits[m_Bytes[i] & 0x0F];
    }
    return String(text, sizeof(text));
}

}
