#pragma once

#include "framework/document/ExportResult.h"
#include "framework/kernel/Counted.h"
#include "framework/kernel/LocalisedString.h"
#include "framework/render/FileExportOptions.h"
#include "framework/render/Warning.h"

#include <vector>

/// What is told of an export that has ended.
class ExportCompleteNotification
{
public:
    /// One file of it.
    struct Rec
    {
        String m_Path;
        Kernel::Counted<Renderer::FileExportOptions const> m_Options;
        std::vector<Kernel::LocalisedString> m_Messages;
        std::vector<Renderer::RenderTree::Warning> m_Warnings;
        ExportResult m_Result = ExportResultOk;
        bool m_IsSave = false;
    };
};
