#include "framework/commands/SaveDocumentAsPackageCommand.h"

#include "framework/commands/PackageResourcesCommand.h"
#include "framework/kernel/Path.h"

namespace
{

CommandRegistration const s_Package(typeid(SaveDocumentAsPackageCommand), "SaveDocumentAsPackageCommand");

}

Kernel::LocalisedString SaveDocumentAsPackageCommand::GetDescription() const
{
    return Kernel::LocalisedString("Save document as package", "Document Command");
}

void SaveDocumentAsPackageCommand::Do()
{
    Kernel::Counted<PackageResourcesCommand> const resources = Kernel::MakeCounted<PackageResourcesCommand>(
        Kernel::Path::GetFolder(m_Path), m_WantPictures, m_WantFonts, m_WantUnusedFonts);
    resources->PostDequeueWithMutableController(GetDocument());
    resources->Do();
    m_Problems = resources->GetProblems();
    GetDocument()->SaveCopy(m_Result, m_Path, resources->GetLinks());
}
