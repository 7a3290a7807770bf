#pragma once

#include "framework/kernel/Countable.h"
#include "framework/kernel/Counted.h"
#include "framework/kernel/LocalisedString.h"
#include "framework/kernel/StringT.h"

#include <vector>

/// One thing that a preflight check found.
struct PreflightResult
{
    enum class Status : int
    {
        NotRun = 0,
        Ok = 1,
        Warning = 2,
        Error = 3
    };
    enum class Problem : int
    {
        MissingPicture,
        ChangedPicture,
        MissingFont,
        OversetText
    };

    Status m_Status = Status::NotRun;
    Problem m_Problem = Problem::MissingPicture;
    /// The file, font or text concerned.
    String m_Subject;
    /// Index of the page where it shows, -1 if it shows nowhere.
    int m_PageIndex = -1;
};

/// For what a document is checked.
enum class PreflightForOperation : int
{
    Check = 0,
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

    [[nodiscard]] std::vector<PreflightResult> const & GetResults() const { return m_Results; }
    [[nodiscard]] Summary GetSummary() const;

private:
    std::vector<PreflightResult> m_Results;
};
