#pragma once

#include "framework/kernel/StringT.h"

#include <memory>

struct UCollator;

namespace Kernel
{

/// Order of texts as a reader of a language expects it (CLDR rules, UCA), for lists that people look things up in.
/// A collator may be used by several threads at once. Copies are cheap and order alike.
class Collator
{
public:
    /// For a language tag such as "de" or "en-GB"; empty means the language-neutral root order, and so does a language
    /// that is not known.
    explicit Collator(String const & language);

    /// Below, at or above zero as `a` comes before, with or after `b`. Texts that the language does not tell apart are
    /// 0.
    [[nodiscard]] int Compare(String const & a, String const & b) const;
    /// For sorted containers and `std::sort`.
    bool operator()(String const & a, String const & b) const { return Compare(a, b) < 0; }

    /// Runs of digits order by their value: "chapter 9" before "chapter 10". Before it is copied or shared.
    void SetNumericOrder();

private:
    std::shared_ptr<UCollator> m_Collator;
};

}
