#include "framework/commands/PreflightCheckDocumentCommand.h"

#include "framework/document/DOMVisitor.h"
#include "framework/document/PictureNode.h"
#include "framework/document/SpreadNode.h"
#include "framework/kernel/FileSystem.h"

namespace
{

CommandRegistration const s_Preflight(typeid(PreflightCheckDocumentCommand), "PreflightCheckDocumentCommand");

/// Placed picture files that can't be found, with their pages.
class PlacedPictureCheck : public DOMVisitorT<PlacedPictureCheck>
{
public:
    explicit PlacedPictureCheck(std::vector<PreflightResult> & results) : m_Results(results)
    {
        AddTerminatingTranslator<PictureNode>(&PlacedPictureCheck::OnPicture);
    }

private:
    void OnPicture(PictureNode & node)
    {
        if (!Kernel::FileSystem::Exists(node.GetPath())) {
            Kernel::JailCounted<SpreadNode> const spread = node.GetSpreadNode();
            m_Results.push_back({PreflightResult::Status::Error, PreflightResult::Problem::MissingPicture,
                                 node.GetPath(), spread ? spread->GetFirstPageIndex() : -1});
        }
    }

    std::vector<PreflightResult> & m_Results;
};

void CheckFlow(TextFlow const & flow, std::vector<PreflightResult> & results)
{
    Kernel::Counted<Story::Layout const> const layout = flow.GetLayout();
    if (!layout) {
        return;
    }
    using Kind = Story::LayoutItem::Problem::Kind;
    for (Story::LayoutItem::Problem const & problem : layout->GetProblems()) {
        Kernel::JailCounted<TextFrameNode> const frame = flow.FindFrame(problem.m_StoryOffset);
        int const page = frame ? frame->GetPageIndex() : -1;
        String const subject = Story::LayoutItem::None == problem.m_Text ? String() : layout->GetString(problem.m_Text);
        switch (problem.m_Kind) {
        case Kind::MissingFamily:
            results.push_back({PreflightResult::Status::Error, PreflightResult::Problem::MissingFont, subject, page});
            break;
        case Kind::MissingCharacter:
            results.push_back({PreflightResult::Status::Warning, PreflightResult::Problem::MissingFont, subject, page});
            break;
        case Kind::PictureMissing:
            results.push_back(
                {PreflightResult::Status::Error, PreflightResult::Problem::MissingPicture, subject, page});
            break;
        case Kind::Overset:
        case Kind::Clipped:
            results.push_back({PreflightResult::Status::Error, PreflightResult::Problem::OversetText, subject, page});
            break;
        case Kind::OverfullLine:
            results.push_back({PreflightResult::Status::Warning, PreflightResult::Problem::OversetText, subject, page});
            break;
        }
    }
}

}

Kernel::LocalisedString PreflightCheckDocumentCommand::GetDescription() const
{
    return {"Preflight", "Document Command"};
}

void PreflightCheckDocumentCommand::Do()
{
    DocumentController & document = *GetDocument();
    document.ComposeText(false, nullptr);
    std::vector<PreflightResult> results;
    for (auto const & [id, entry] : document.GetPictures().GetEntries()) {
        // The document holds the picture: its source may be gone, but when it is there it should be the same still.
        Kernel::TimeStamp time;
        if (!entry.m_SourcePath.Empty() && Kernel::FileSystem::GetModifiedTime(entry.m_SourcePath, time) &&
            time != entry.m_SourceTime) {
            results.push_back(
                {PreflightResult::Status::Warning, PreflightResult::Problem::ChangedPicture, entry.m_SourcePath, -1});
        }
    }
    PlacedPictureCheck(results).Visit(document.GetDocument());
    for (Kernel::Counted<TextFlow> const & flow : document.GetDocument()->GetTextFlows()) {
        CheckFlow(*flow, results);
    }
    if (PreflightForOperation::Export == m_Operation) {
        // Output shows everything that is wrong; what merely may look better is left out.
        std::erase_if(results,
                      [](PreflightResult const & result) { return PreflightResult::Status::Error != result.m_Status; });
    }
    document.SetPreflightResults(Kernel::MakeCounted<PreflightResults>(std::move(results)));
}

void PreflightCheckDocumentCommand::Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications)
{
    notifications.push_back(Kernel::MakeCounted<PreflightResultsUpdatedNotification>(Self()));
}
