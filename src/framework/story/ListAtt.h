#pragma once

#include "framework/kernel/Counted.h"
#include "framework/kernel/StringT.h"

#include <cstdint>

namespace Kernel
{
class HashAccumulator;
}

namespace Story
{

class ByteReader;
class ByteWriter;

/// Names fields of `ListAtt`, for edits that touch only those. A bit mask.
enum class ListAttFields : std::uint32_t
{
    Kind = 1u << 0,
    Level = 1u << 1,
    Name = 1u << 2,
    Format = 1u << 3,
    Bullet = 1u << 4,
    Suffix = 1u << 5,
    Group = 1u << 6,
    IsGlobal = 1u << 7,
    IsRestartNumbering = 1u << 9,
    StartNumberingAt = 1u << 12,
    All = 0xFFFFFFFFu
};

/// What makes a paragraph an item of a list. A paragraph that goes on inside an item has the kind `None`: it stands
/// under the item's text, without a marker.
///
/// Items of one name and level count on from each other through a story; `IsRestartNumbering` begins again at
/// `StartNumberingAt`. Levels count apart. A list whose global flag is set runs on through the chapters of a book.
/// Shared and immutable once it is set in a story: change a clone.
class ListAtt : public virtual Kernel::Countable
{
public:
    enum Kind : int
    {
        None = 0,
        Bulleted = 1,
        Numbered = 2
    };
    enum class NumberFormat : std::uint8_t
    {
        Decimal = 0,
        LowerLetter = 1,
        UpperLetter = 2,
        LowerRoman = 3,
        UpperRoman = 4
    };

    [[nodiscard]] int GetKind() const { return m_Kind; }
    void SetKind(int kind) { m_Kind = kind; }
    /// 0 is the outermost.
    [[nodiscard]] int GetLevel() const { return m_Level; }
    void SetLevel(int level) { m_Level = level; }
    [[nodiscard]] String const & GetName() const { return m_Name; }
    void SetName(String name) { m_Name = std::move(name); }
    [[nodiscard]] bool IsRestartNumbering() const { return m_IsRestartNumbering; }
    void SetIsRestartNumbering(bool restart) { m_IsRestartNumbering = restart; }
    [[nodiscard]] int GetStartNumberingAt() const { return m_StartNumberingAt; }
    void SetStartNumberingAt(int number) { m_StartNumberingAt = number; }
    [[nodiscard]] bool IsGlobal() const { return m_IsGlobal; }
    void SetIsGlobal(bool global) { m_IsGlobal = global; }
    /// 0 for lists of the text; other groups belong to generated lists and take no part in book numbering.
    [[nodiscard]] int GetGroup() const { return m_Group; }
    void SetGroup(int group) { m_Group = group; }
    [[nodiscard]] NumberFormat GetFormat() const { return m_Format; }
    void SetFormat(NumberFormat format) { m_Format = format; }
    /// Marker of a bulleted item, such as U+2022 or the boxes of a task list.
    [[nodiscard]] String const & GetBullet() const { return m_Bullet; }
    void SetBullet(String bullet) { m_Bullet = std::move(bullet); }
    /// What stands behind the number: "." or ")".
    [[nodiscard]] String const & GetSuffix() const { return m_Suffix; }
    void SetSuffix(String suffix) { m_Suffix = std::move(suffix); }

    [[nodiscard]] Kernel::Counted<ListAtt> Clone() const { return Kernel::MakeCounted<ListAtt>(*this); }
    /// Takes over from `other` the fields that `fields` names.
    void CopyFields(ListAtt const & other, ListAttFields fields);
    /// The marker of an item with this number, such as "iv." or the bullet.
    [[nodiscard]] String FormatMarker(int number) const;
    [[nodiscard]] bool IsEqual(ListAtt const & other) const;

    void Save(ByteWriter & out) const;
    [[nodiscard]] static Kernel::Counted<ListAtt const> Load(ByteReader & in);
    void AccumulateHash(Kernel::HashAccumulator & hash) const;

private:
    int m_Kind = None;
    int m_Level = 0;
    String m_Name;
    int m_StartNumberingAt = 1;
    int m_Group = 0;
    bool m_IsRestartNumbering = false;
    bool m_IsGlobal = false;
    NumberFormat m_Format = NumberFormat::Decimal;
    String m_Bullet = "\xE2\x80\xA2";
    String m_Suffix = ".";
};

/// "4", "d", "D", "iv", "IV". Letters go on after z with aa; numbers below 1, and Roman ones above 3999, are decimal.
[[nodiscard]] String FormatNumber(int number, ListAtt::NumberFormat format);

}
