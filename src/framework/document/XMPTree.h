#pragma once

#include "framework/kernel/Countable.h"
#include "framework/kernel/Counted.h"
#include "framework/kernel/StringT.h"

#include <vector>

/// XMP properties of one resource (ISO 16684-1), independent of any toolkit.
class XMPTree : public virtual Kernel::Countable
{
public:
    enum class Form : std::uint8_t
    {
        Text,
        /// `rdf:Bag`: several values, the order meaning nothing.
        Bag,
        /// `rdf:Seq`: several values in order.
        Sequence,
        /// `rdf:Alt` with one value, the default language's.
        LanguageAlternative
    };
    struct Property
    {
        /// Qualified name with one of the prefixes dc, xmp, pdf.
        String m_Name;
        Form m_Form = Form::Text;
        std::vector<String> m_Values;
    };

    void Add(String name, Form form, std::vector<String> values);
    [[nodiscard]] std::vector<Property> const & GetProperties() const { return m_Properties; }

    /// The tree as an `x:xmpmeta` element in UTF-8, without a packet wrapper. Characters that XML can't hold are left
    /// out.
    [[nodiscard]] String ToXML() const;

private:
    std::vector<Property> m_Properties;
};
