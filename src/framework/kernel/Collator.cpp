#include "framework/kernel/Collator.h"

#include "framework/kernel/Assert.h"

#include <unicode/ucol.h>
#include <unicode/uloc.h>

namespace Kernel
{

Collator::Collator(String const & language)
{
    char locale[ULOC_FULLNAME_CAPACITY] = "";
    UErrorCode status = U_ZERO_ERROR;
    uloc_forLanguageTag(language.c_str(), locale, sizeof(locale), nullptr, &status);
    if (U_FAILURE(status)) {
        locale[0] = 0;
    }
    status = U_ZERO_ERROR;
    // An empty name would mean the default locale of the process.
    m_Collator.reset(ucol_open(locale[0] == 0 ? "root" : locale, &status), &ucol_close);
    KORVANE_ASSERT_MESSAGE(U_SUCCESS(status) && m_Collator, "ICU has no collation data");
}

int Collator::Compare(String const & a, String const & b) const
{
    UErrorCode status = U_ZERO_ERROR;
    UCollationResult const result = ucol_strcollUTF8(m_Collator.get(), a.Data(), static_cast<std::int32_t>(a.Length()),
                                                     b.Data(), static_cast<std::int32_t>(b.Length()), &status);
    return result == UCOL_LESS ? -1 : result == UCOL_GREATER ? 1 : 0;
}

void Collator::SetNumericOrder()
{
    UErrorCode status = U_ZERO_ERROR;
    ucol_setAttribute(m_Collator.get(), UCOL_NUMERIC_COLLATION, UCOL_ON, &status);
    KORVANE_ASSERT(U_SUCCESS(status));
}

}
