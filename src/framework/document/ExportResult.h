#pragma once

/// How writing a file ended. Values below 2 are success.
enum ExportResult : int
{
    ExportResultOk = 0,
    ExportResultOkWithRemarks = 1,
    ExportResultAborted = 2,
    ExportResultFailed = 3,
    ExportResultAccessDenied = 4,
    ExportResultPermissionDenied = 5,
    ExportResultOutOfSpace = 6,
    ExportResultWriteFailed = 7,
    ExportResultChangesNotAllowed = 8,
    ExportResultFolderNotCreated = 9,
    ExportResultFileNotCreated = 10,
    ExportResultMetadataFailed = 11
};

[[nodiscard]] constexpr bool IsSuccess(ExportResult result)
{
    return result < ExportResultAborted;
}
