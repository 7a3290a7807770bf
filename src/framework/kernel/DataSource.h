#pragma once

#include "framework/kernel/Countable.h"
#include "framework/kernel/StringT.h"

namespace Kernel
{

/// Where the bytes of a placed file come from. Immutable; the object is the identity: two nodes that show one source share
/// it.
class DataSource : public virtual Countable
{
public:
    explicit DataSource(String path) : m_Path(std::move(path)) {}

    [[nodiscard]] String const & GetPath() const { return m_Path; }

private:
    String m_Path;
};

}
