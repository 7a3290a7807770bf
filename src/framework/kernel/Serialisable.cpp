#include "framework/kernel/Serialisable.h"

#include "framework/kernel/FileStore.h"
#include "framework/kernel/OutSerialiserFile.h"

namespace Kernel
{

void Serialisable::AccumulateHash(HashAccumulator & hash) const
{
    CollectingFileStoreOut store(true);
    OutSerialiserMemory out(store, nullptr);
    auto const & bytes = out.WriteWhole(*this);
    hash.AddBytes(bytes.data(), bytes.size());
}

bool Serialisable::CompareMembers(Serialisable const & other, CompareContext const & context) const
{
    CollectingFileStoreOut store(true);
    OutSerialiserMemory mine(store, &context);
    OutSerialiserMemory others(store, &context);
    return mine.WriteWhole(*this) == others.WriteWhole(other);
}

bool Serialisable::Equals(NonCounted<Serialisable const> other, CompareContext const & context) const
{
    if (other.Get() == this) {
        return true;
    }
    return other && &other->GetObjectClassProperties() == &GetObjectClassProperties() &&
           CompareMembers(*other, context);
}

}
