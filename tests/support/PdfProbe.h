#pragma once

#include "framework/kernel/StringT.h"

#include <memory>
#include <string>
#include <vector>

class QPDF;

/// Looks into a finished PDF file: through libqpdf, and through the programs that readers are made of.
class PdfProbe
{
public:
    explicit PdfProbe(String const & path);
    ~PdfProbe();

    /// What `qpdf --check` has to complain of; empty if nothing.
    [[nodiscard]] std::string Check() const;

    [[nodiscard]] int PageCount() const;
    /// The content stream of a page (from 1), unpacked.
    [[nodiscard]] std::string Content(int page) const;
    /// An object by path from the catalogue or, with a leading number, from a page: "Lang", "2/TrimBox",
    /// "OutputIntents/0/S". References are followed. As PDF text; "null" if there is none.
    [[nodiscard]] std::string Value(std::string const & path) const;
    /// The bytes of a stream at such a path.
    [[nodiscard]] std::string Stream(std::string const & path) const;

    /// The labels that readers show, one a page.
    [[nodiscard]] std::vector<std::string> Labels() const;
    /// One line an entry, two spaces a level: "Title -> page 3 (72, 500)"; "+" before open entries with children.
    [[nodiscard]] std::string Outline() const;
    /// One line a link: rectangle and where it leads.
    [[nodiscard]] std::string Links(int page) const;

    /// What `pdftotext` extracts from a page, in reading order and without form feeds.
    [[nodiscard]] std::string Text(int page) const;
    /// What `pdffonts` lists, one line a font: name, type, "emb", "sub", "uni".
    [[nodiscard]] std::string Fonts() const;
    /// A page drawn by `pdftoppm` at 72 pixels to the inch.
    struct Image
    {
        int m_Width = 0;
        int m_Height = 0;
        std::string m_Rgb;
        /// Red, green and blue of a pixel as 0xRRGGBB.
        [[nodiscard]] unsigned At(int x, int y) const;
    };
    [[nodiscard]] Image Draw(int page) const;

    [[nodiscard]] QPDF & GetPdf() const { return *m_Pdf; }

private:
    [[nodiscard]] std::string Target(void * annotationOrItem) const;

    String m_Path;
    std::unique_ptr<QPDF> m_Pdf;
};

/// The standard output of a shell command, with what it says on the error stream.
[[nodiscard]] std::string RunCommand(std::string const & command);
