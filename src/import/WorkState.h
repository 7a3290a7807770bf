#pragma once

#include "import/Message.h"

#include <cstdint>
#include <filesystem>
#include <map>
#include <optional>
#include <string>
#include <vector>

namespace Import
{

/// What tells one state of a file from another without reading it: size, times and inode. Two stamps that are equal
/// mean the same content, unless the file was written within the same tick of the clock; see `IsTrustworthy`.
struct FileStamp
{
    std::int64_t m_Size = -1;
    std::int64_t m_Modified = 0;
    std::int64_t m_Changed = 0;
    std::uint64_t m_Inode = 0;

    /// Stamp of a file as it is now; a default one if there is none.
    static FileStamp Of(std::filesystem::path const & path);
    [[nodiscard]] bool Exists() const { return 0 <= m_Size; }
    /// The file had come to rest when the state of time `seen` (nanoseconds of the epoch) was taken.
    [[nodiscard]] bool IsTrustworthy(std::int64_t seen) const { return m_Changed + 50'000'000 < seen; }
    friend bool operator==(FileStamp const &, FileStamp const &) = default;
};

/// A source file as it was when it was last read.
struct KnownFile
{
    FileStamp m_Stamp;
    std::uint64_t m_Hash = 0;
};

/// A link as the check of all chapters needs it.
struct KnownLink
{
    std::string m_Target;
    int m_Line = 0;
};

/// What the work folder remembers of one chapter.
struct KnownChapter
{
    /// Name of the document in the work folder.
    std::string m_Document;
    std::string m_Title;
    /// Hash of the facts beside the source that its document was made from.
    std::uint64_t m_Facts = 0;
    KnownFile m_Source;
    /// By path as found from the chapter.
    std::map<std::string, KnownFile> m_Pictures;
    std::vector<std::string> m_Anchors;
    /// Each target once, with the line of its first use.
    std::vector<KnownLink> m_Links;
    std::vector<Message> m_Messages;
    /// The document's file when the last build ended.
    FileStamp m_DocumentStamp;
};

/// The memory of a work folder between runs: which sources its documents were made from. Losing it costs time only, as
/// everything is then imported again. A plain value, kept as JSON in "import.json".
struct WorkState
{
    /// Nanoseconds of the epoch when it was saved.
    std::int64_t m_Saved = 0;
    std::map<std::string, KnownChapter> m_Chapters;
    /// Hash of everything that the last finished output depended on beside the chapters, and its file.
    std::uint64_t m_OutputFacts = 0;
    std::string m_OutputFile;
    FileStamp m_OutputStamp;
    FileStamp m_BookStamp;
    int m_Pages = 0;

    /// Empty if there is none, or if it can't be read or is of another version.
    static WorkState Load(std::filesystem::path const & folder);
    /// Written beside and renamed; false with an error number's text in `problem` on failure.
    bool Save(std::filesystem::path const & folder, std::string & problem);
};

/// Whether a file is what `known` says. Looks at the stamp first and reads the file only in doubt, in which case the
/// stamp in `known` is brought up to date if the content is the same.
bool IsUnchanged(std::filesystem::path const & path, KnownFile & known, std::int64_t seen);
/// Stamp and hash of a file as it is now; a hash of 0 if it can't be read.
KnownFile LookAt(std::filesystem::path const & path);

}
