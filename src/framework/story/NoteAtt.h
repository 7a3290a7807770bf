#pragma once

#include "framework/kernel/Counted.h"

#include <cstdint>

namespace Kernel
{
class HashAccumulator;
}

namespace Story
{

class ByteReader;
class ByteWriter;

/// How a note is numbered and where it is set: the attribute of its reference in the text.
///
/// The first note of a kind in a document takes `GetStartNumberingAt`, and so does each whose restart flag is set; any
/// other takes the next number of its kind. Shared and immutable once it is set in a story: change a clone.
class NoteAtt : public virtual Kernel::Countable
{
public:
    enum Kind : int
    {
        Footnote = 1,
        Endnote = 2,
        Sidenote = 3
    };
    enum NumberingMode : int
    {
        InDocument = 0,
        ThroughBook = 5
    };
    /// Bits that name fields, for edits that touch only those.
    enum Fields : std::uint64_t
    {
        KindField = 1,
        RestartField = 2,
        NumberingModeField = 4,
        StartNumberingAtField = 8
    };

    [[nodiscard]] int GetKind() const { return m_Kind; }
    void SetKind(int kind) { m_Kind = kind; }
    [[nodiscard]] bool IsRestartNumbering() const { return m_IsRestartNumbering; }
    void SetIsRestartNumbering(bool restart) { m_IsRestartNumbering = restart; }
    [[nodiscard]] int GetStartNumberingAt() const { return m_StartNumberingAt; }
    void SetStartNumberingAt(int number) { m_StartNumberingAt = number; }
    /// `ThroughBook` runs on from chapter to chapter; any other begins again in each document.
    [[nodiscard]] int GetNumberingMode() const { return m_NumberingMode; }
    void SetNumberingMode(int mode) { m_NumberingMode = mode; }

    [[nodiscard]] virtual Kernel::Counted<NoteAtt> Clone() const { return Kernel::MakeCounted<NoteAtt>(*this); }
    /// Takes over from `other` the fields whose bits are set in `fields`.
    void CopyFields(NoteAtt const & other, std::uint64_t fields);
    [[nodiscard]] bool IsEqual(NoteAtt const & other) const;

    void Save(ByteWriter & out) const;
    [[nodiscard]] static Kernel::Counted<NoteAtt const> Load(ByteReader & in);
    void AccumulateHash(Kernel::HashAccumulator & hash) const;

private:
    int m_Kind = Endnote;
    int m_StartNumberingAt = 1;
    int m_NumberingMode = InDocument;
    bool m_IsRestartNumbering = false;
};

}
