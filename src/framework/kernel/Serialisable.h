#pragma once

#include "framework/kernel/ClassProperties.h"
#include "framework/kernel/Counted.h"
#include "framework/kernel/HashAccumulator.h"

/// What a comparison of two objects leaves out. This one leaves out nothing.
class CompareContext
{
public:
    virtual ~CompareContext() = default;
    /// Fields of this tag do not count, such as the ids that every object has for itself.
    [[nodiscard]] virtual bool IgnoresField(Kernel::IDTag) const { return false; }
};

namespace Kernel
{

class FileStore;
class InSerialiser;
class OutSerialiser;

/// An object that can be written into a tagged stream and made again from it.
class Serialisable : public virtual Countable
{
public:
    /// Writes the fields. A class calls its base's first.
    virtual void Save(OutSerialiser & out) const = 0;
    /// Reads the fields; `version` is the class version in the file. A field that is missing keeps what the constructor
    /// gave it. False says that the object is of no use.
    virtual bool Load(InSerialiser const & in, FileStore & store, unsigned short version) = 0;
    /// Adds the object's value to a hash. By default the value is what `Save` writes.
    virtual void AccumulateHash(HashAccumulator & hash) const;
    [[nodiscard]] virtual ClassProperties const & GetObjectClassProperties() const = 0;
    /// Same value as `other`, which is of the same class. By default the values are what `Save` writes.
    [[nodiscard]] virtual bool CompareMembers(Serialisable const & other, CompareContext const & context) const;

    /// Same class and same value. Null equals nothing.
    [[nodiscard]] bool Equals(NonCounted<Serialisable const> other, CompareContext const & context) const;
};

/// An immutable value that many objects refer to; a stream holds it once.
class SharedSerialisable : public Serialisable
{
};

}
