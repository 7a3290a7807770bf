#pragma once

#include "framework/document/DocumentController.h"

#include <map>
#include <optional>
#include <set>
#include <vector>

/// One preflight check of one document: looks at it, asks those who know the publication, and gives what it found.
/// Used by one thread, in this order of calls.
class PreflightChecker
{
public:
    /// Borrows the document.
    explicit PreflightChecker(DocumentController & document) : m_Document(document) {}

    /// All that the document tells itself. Needs its lock, and an up-to-date layout. `expected` is the colour format of
    /// the publication, if there is one.
    void CheckDocument(std::optional<enum Raster::Format> expected);
    /// References into other documents, and whether generated parts are up to date. To be called without the document's
    /// writer lock.
    void AskPublication();
    /// What was found, in page order, but for what is less bad than `least`. The checker is empty afterwards.
    [[nodiscard]] std::vector<PreflightResult> TakeResults(PreflightResult::Status least);

private:
    /// A reference that this document does not resolve itself.
    struct OuterReference
    {
        String m_Uid;
        String m_Target;
        int m_PageIndex;
    };

    using Status = PreflightResult::Status;
    using Problem = PreflightResult::Problem;

    void Add(Status status, Problem problem, String subject, int page, String const & message);
    void CheckStoryPictures(TextFlow const & flow, Story::Story const & story, std::optional<std::size_t> outerOffset);
    void CheckLayoutPictures(TextFlow const & flow);
    void CheckPixels(Kernel::Counted<Raster::Picture const> const & picture, Raster::PictureProblem const & problem,
                     double width, double height, int page);
    /// `problem` is empty if the drawing can be had.
    void CheckDrawing(String const & path, Raster::PictureProblem const & problem, int page);
    void AddLocked(String const & path, int page);
    void CheckSourceFiles();
    void CheckPlacedPictures();
    void CheckText(TextFlow const & flow);
    void CheckReferences(TextFlow const & flow);
    void CheckAnchors();
    void AddUnresolved(String const & target, int page);

    DocumentController & m_Document;
    std::vector<PreflightResult> m_Results;
    std::vector<OuterReference> m_OuterReferences;
    std::set<String> m_OwnAnchors;
    /// The first page that each picture of the text shows on, by id.
    std::map<String, int> m_PicturePages;
    bool m_HasPdf = false;
};
