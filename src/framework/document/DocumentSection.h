#pragma once

#include "framework/kernel/Countable.h"
#include "framework/kernel/Counted.h"
#include "framework/kernel/StringT.h"

/// How the pages of a section show their numbers.
enum class PageNumberFormat : std::uint8_t
{
    Decimal,
    RomanLower,
    RomanUpper,
    /// The pages count, but show no number.
    None
};

/// A run of pages that share their numbering. An immutable value: a change puts another object in its place.
///
/// The sections of a document cover its pages without gaps; the first starts at page index 0 and always sets its own
/// number.
class DocumentSection : public virtual Kernel::Countable
{
public:
    struct Values
    {
        /// Zero-based index in the document of its first page.
        unsigned int m_StartPageIndex = 0;
        /// Number of that page. Where the section runs on from the one before, the document keeps this in step.
        unsigned int m_StartNumberingAt = 1;
        /// Sets its own number rather than running on.
        bool m_RestartPageNumbering = false;
        bool m_IncludeOnExport = true;
        PageNumberFormat m_Format = PageNumberFormat::Decimal;
        /// Stands before the number.
        String m_Prefix;

        friend bool operator==(Values const &, Values const &) = default;
    };

    explicit DocumentSection(Values values) : m_Values(std::move(values)) {}

    [[nodiscard]] Values const & GetValues() const { return m_Values; }
    [[nodiscard]] unsigned int GetStartPageIndex() const { return m_Values.m_StartPageIndex; }
    [[nodiscard]] unsigned int GetStartNumberingAt() const { return m_Values.m_StartNumberingAt; }
    [[nodiscard]] bool RestartPageNumbering() const { return m_Values.m_RestartPageNumbering; }
    [[nodiscard]] bool GetIncludeOnExport() const { return m_Values.m_IncludeOnExport; }
    [[nodiscard]] PageNumberFormat GetFormat() const { return m_Values.m_Format; }
    [[nodiscard]] String const & GetPrefix() const { return m_Values.m_Prefix; }

    /// Nobody has customised it: numbered from 1 in decimals, without prefix, output like the rest.
    [[nodiscard]] bool HasDefaultValues() const;

    /// The label of the section's page with that number. Roman numerals run from 1 to 3999; beyond, decimals are used.
    [[nodiscard]] String FormatNumber(unsigned int number) const;

private:
    Values m_Values;
};
