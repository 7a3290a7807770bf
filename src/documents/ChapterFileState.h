#pragma once

#include "framework/kernel/StringT.h"

namespace Book
{

/// What trying to open a chapter's file gives.
enum class ChapterFileState : int
{
    CanBeOpened = 0,
    OtherFailure = 3,
    AccessDenied = 4,
    /// The file is there and cannot be opened now.
    Busy = 5
};

/// Opens the file for reading and closes it again.
[[nodiscard]] ChapterFileState ProbeChapterFile(String const & path);

}
