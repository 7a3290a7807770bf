#pragma once

#include "framework/kernel/Countable.h"
#include "framework/kernel/Counted.h"
#include "framework/kernel/LocalisedString.h"
#include "framework/kernel/StringT.h"

#include <vector>

/// One thing that a preflight check found: what is wrong, how bad it is, where it stands, and a sentence that says so.
struct PreflightResult
{
    enum class Status : int
    {
        NotRun = 0,
        Ok = 1,
        /// The output is whole, but may not be what was meant.
        Warning = 2,
        /// Something is missing from the output, or stands there that should not.
        Error = 3
    };

    enum class Problem : int
    {
        /// A picture's file is gone or can't be read; a marked box stands in its place.
        MissingPicture,
        /// The document holds the picture as it was; the file is another one by now.
        ChangedPicture,
        /// A placed PDF can't be opened without its password.
        LockedPicture,
        /// Pixels of placed PDFs, for previews, need a program that is not installed; output is not touched by it.
        PicturePreview,
        /// Fewer pixels to the inch than `LeastPictureDpi` at the size in which the picture is set.
        PictureResolution,
        /// A font is not installed, or does not have a character.
        MissingFont,
        /// Text without a place: below the last frame, in a cell that is too small, or beyond the measure.
        OversetText,
        /// The document's colour format is not the key chapter's: it is converted for output.
        ColourFormat,
        /// A reference leads to an anchor that is nowhere.
        UnresolvedReference,
        /// An anchor without a name: no reference can show it, and in bookmarks and contents its line is empty.
        EmptyAnchorName,
        StaleTableOfContents,
        StaleIndex
    };

    /// Resolution below which a picture looks coarse on paper, in pixels to the inch.
    static constexpr double LeastPictureDpi = 150;

    /// Words for machines, in no one's language: "missing-picture", "error".
    [[nodiscard]] static char const * NameOf(Problem problem);
    [[nodiscard]] static char const * NameOf(Status status);

    Status m_Status = Status::NotRun;
    Problem m_Problem = Problem::MissingPicture;
    /// The object: path of a picture, name of a font or anchor, address of a reference, first words of text.
    String m_Subject;
    /// Index of the page where it shows, from 0; -1 if it shows nowhere or concerns the whole document.
    int m_PageIndex = -1;
    /// What that page shows as its number; empty without a page.
    String m_Folio;
    /// One sentence that names the object and, where it helps, the remedy. Final: in the user's language already.
    Kernel::LocalisedString m_Message;
};

/// For what a document is checked.
enum class PreflightForOperation : int
{
    Check = 0,
    /// Output shows everything that is wrong: warnings are left out.
    Export = 1
};

/// What one preflight check found. Immutable once it hangs in a document.
class PreflightResults : public virtual Kernel::Countable
{
public:
    /// The worst status with a text for the chapter list.
    struct Summary
    {
        PreflightResult::Status m_Status = PreflightResult::Status::NotRun;
        Kernel::LocalisedString m_Text;
    };

    explicit PreflightResults(std::vector<PreflightResult> results) : m_Results(std::move(results)) {}

    /// In page order, what concerns the whole document first.
    [[nodiscard]] std::vector<PreflightResult> const & GetResults() const { return m_Results; }
    [[nodiscard]] Summary GetSummary() const;

private:
    std::vector<PreflightResult> m_Results;
};
