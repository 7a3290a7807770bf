#pragma once

#include "framework/kernel/StringT.h"

#include <cstdint>
#include <vector>

/// What documents need beside their own files, each thing once: gathered before a package is made, to show it or to
/// collect it. A value of one thread.
class PackageManagerInfo
{
public:
    struct Picture
    {
        /// The file as the document names it; may be empty for a picture that it holds.
        String m_Path;
        /// Id of a picture that the document holds; empty for a file that is only placed.
        String m_Id;
        /// Bytes; 0 if it can't be had.
        std::uint64_t m_Size = 0;
        /// Its bytes can be had, from the document or from its file.
        bool m_IsPresent = false;
        friend bool operator==(Picture const &, Picture const &) = default;
    };
    struct Font
    {
        String m_Family;
        /// Empty if the machine lacks the font: another one stands in for it.
        String m_Path;
        std::uint64_t m_Size = 0;
        /// Its embedding flag lets a copy go to another machine to be worked with there.
        bool m_MayCollect = false;
        /// Text on the pages is set in it; otherwise only a style names it.
        bool m_IsUsed = false;
    };

    /// Adds what is not there yet; a font that is used in one document is used.
    void AddDocument(String const & path);
    void AddPicture(Picture picture);
    void AddFont(Font font);

    [[nodiscard]] std::vector<String> const & GetDocuments() const { return m_Documents; }
    [[nodiscard]] std::vector<Picture> const & GetPictures() const { return m_Pictures; }
    [[nodiscard]] std::vector<Font> const & GetFonts() const { return m_Fonts; }

private:
    std::vector<String> m_Documents;
    std::vector<Picture> m_Pictures;
    std::vector<Font> m_Fonts;
};
