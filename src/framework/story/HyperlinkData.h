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

/// Where a piece of text leads when it is clicked. Immutable and shared by the runs of one link, so that a link that
/// breaks over lines is one link with several rectangles.
class HyperlinkData : public virtual Kernel::Countable
{
public:
    /// The numbers are written in files.
    enum class Type : std::int32_t
    {
        Page = 0,         ///< A page of this document: `GetPageIndex`.
        Anchor = 1,       ///< An anchor, in this document or another of the book: `GetAnchorUid`, or the endnotes.
        Web = 2,          ///< `GetPath`.
        File = 3,         ///< `GetPath`, `IncludeFileOnExport`.
        Mail = 4,         ///< `GetPath`, without "mailto:".
        Section = 5,      ///< `GetSectionIndex`.
        ChapterPage = 100 ///< `GetChapterIndex` and `GetPageIndex`.
    };

    struct Fields
    {
        Type m_Type = Type::Web;
        /// Address, file or mail address, as the type says.
        String m_Path;
        /// Uid of the anchor, empty as long as the target is not resolved.
        String m_AnchorUid;
        /// The target as the author wrote it, such as "other.md#id"; kept for messages and for resolving again.
        String m_TargetText;
        std::int32_t m_PageIndex = 0;
        std::int32_t m_SectionIndex = 0;
        std::int32_t m_ChapterIndex = 0;
        bool m_IsActive = true;
        bool m_IsEndnotes = false;
        bool m_IncludeFileOnExport = false;
        friend bool operator==(Fields const &, Fields const &) = default;
    };

    HyperlinkData() = default;
    explicit HyperlinkData(Fields fields) : m_Fields(std::move(fields)) {}

    [[nodiscard]] static Kernel::Counted<HyperlinkData const> ToWeb(String const & address);
    [[nodiscard]] static Kernel::Counted<HyperlinkData const> ToAnchor(String const & uid, String const & targetText);

    [[nodiscard]] Type GetType() const { return m_Fields.m_Type; }
    [[nodiscard]] String const & GetPath() const { return m_Fields.m_Path; }
    [[nodiscard]] String const & GetAnchorUid() const { return m_Fields.m_AnchorUid; }
    [[nodiscard]] String const & GetTargetText() const { return m_Fields.m_TargetText; }
    [[nodiscard]] int GetPageIndex() const { return m_Fields.m_PageIndex; }
    [[nodiscard]] int GetSectionIndex() const { return m_Fields.m_SectionIndex; }
    [[nodiscard]] int GetChapterIndex() const { return m_Fields.m_ChapterIndex; }
    /// An inactive link is kept in the text but leads nowhere in output.
    [[nodiscard]] bool IsActive() const { return m_Fields.m_IsActive; }
    /// An anchor link that leads to the book's collated endnotes.
    [[nodiscard]] bool IsEndnotes() const { return m_Fields.m_IsEndnotes; }
    [[nodiscard]] bool IncludeFileOnExport() const { return m_Fields.m_IncludeFileOnExport; }
    [[nodiscard]] Fields const & GetFields() const { return m_Fields; }

    void Save(ByteWriter & out) const;
    [[nodiscard]] static Kernel::Counted<HyperlinkData const> Load(ByteReader & in);
    void AccumulateHash(Kernel::HashAccumulator & hash) const;

private:
    Fields m_Fields;
};

}
