#pragma once

#include "framework/kernel/Counted.h"
#include "framework/kernel/StringT.h"

#include <mutex>

namespace Kernel
{
class HashAccumulator;
}

namespace Story
{

class ByteReader;
class ByteWriter;

/// A named place. It has identity: whoever found it holds the same object, and sees a uid that it is given later.
///
/// Owned by the anchor glyph (or by whoever made it, for an anchor of another document). `SetUid` belongs to commands
/// under the document's writer lock; every getter is safe on any thread.
class AnchorData : public virtual Kernel::Countable
{
public:
    AnchorData() = default;
    AnchorData(String name, bool isPDFBookmark, bool isTOCEntry, String uid)
        : m_Name(std::move(name)), m_Uid(std::move(uid)), m_IsPDFBookmark(isPDFBookmark), m_IsTOCEntry(isTOCEntry)
    {
    }
    /// `level` is the outline level of a heading, from 1; 0 for other places.
    AnchorData(String name, bool isPDFBookmark, bool isTOCEntry, String uid, int level)
        : AnchorData(std::move(name), isPDFBookmark, isTOCEntry, std::move(uid))
    {
        m_Level = level;
    }

    [[nodiscard]] String GetName() const { return m_Name; }
    /// Identity across chapters; empty until it is given one.
    [[nodiscard]] String GetUid() const;
    void SetUid(String const & uid);
    [[nodiscard]] bool IsPDFBookmark() const { return m_IsPDFBookmark; }
    [[nodiscard]] bool IsTOCEntry() const { return m_IsTOCEntry; }
    [[nodiscard]] int GetLevel() const { return m_Level; }

    void Save(ByteWriter & out) const;
    [[nodiscard]] static Kernel::Counted<AnchorData> Load(ByteReader & in);
    void AccumulateHash(Kernel::HashAccumulator & hash) const;

private:
    mutable std::mutex m_UidLock;
    String m_Name;
    String m_Uid;
    bool m_IsPDFBookmark = false;
    bool m_IsTOCEntry = false;
    int m_Level = 0;
};

}
