#include "framework/document/PreflightResults.h"

#include "framework/kernel/Format.h"

#include <algorithm>

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
