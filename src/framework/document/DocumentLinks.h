#pragma once

#include "framework/kernel/StringT.h"

#include <map>

/// What a copy of a document says in place of the paths that the document names: for a copy that takes what it refers
/// to along. What is not here keeps its path.
struct DocumentLinks
{
    /// Of placed files, by the path that the document has for them.
    std::map<String, String> m_PlacedFiles;
    /// Of the files that the document's pictures were taken from, by the pictures' ids.
    std::map<String, String> m_Pictures;
};
