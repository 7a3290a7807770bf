#include "framework/document/PreflightResults.h"

#include "framework/kernel/Format.h"

#include <algorithm>

char const * PreflightResult::NameOf(Problem problem)
{
    switch (problem) {
    case Problem::MissingPicture:
        return "missing-picture";
    case Problem::ChangedPicture:
        return "changed-picture";
    case Problem::LockedPicture:
        return "locked-picture";
    case Problem::PicturePreview:
        return "picture-preview";
    case Problem::PictureResolution:
        return "picture-resolution";
    case Problem::MissingFont:
        return "missing-font";
    case Problem::OversetText:
        return "overset-text";
    case Problem::ColourFormat:
        return "colour-format";
    case Problem::UnresolvedReference:
        return "unresolved-reference";
    case Problem::EmptyAnchorName:
        return "empty-anchor-name";
    case Problem::StaleTableOfContents:
        return "stale-toc";
    case Problem::StaleIndex:
        break;
    }
    return "stale-index";
}

char const * PreflightResult::NameOf(Status status)
{
    switch (status) {
    case Status::NotRun:
        return "not-run";
    case Status::Ok:
        return "ok";
    case Status::Warning:
        return "warning";
    case Status::Error:
        break;
    }
    return "error";
}

PreflightResults::Summary PreflightResults::GetSummary() const
{
    Summary summary;
    summary.m_Status = PreflightResult::Status::Ok;
    long errors = 0;
    long warnings = 0;
    for (PreflightResult const & result : m_Results) {
        summary.m_Status = std::max(summary.m_Status, result.m_Status);
        errors += PreflightResult::Status::Error == result.m_Status ? 1 : 0;
        warnings += PreflightResult::Status::Warning == result.m_Status ? 1 : 0;
    }
    summary.m_Text = m_Results.empty()
                         ? Kernel::LocalisedString("No problems found", "Preflight")
                         : Kernel::LocalisedString::CreateFakeFromString(Kernel::Format(
                               Kernel::LocalisedString("Errors: %1, warnings: %2", "Preflight"), errors, warnings));
    return summary;
}
