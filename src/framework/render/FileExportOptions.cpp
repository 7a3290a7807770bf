#include "framework/render/FileExportOptions.h"

#include "framework/kernel/InSerialiser.h"
#include "framework/kernel/OutSerialiser.h"

namespace Renderer
{

Kernel::ClassProperties const FileExportOptions::ms_ClassProperties(Kernel::ClassUID("FExO"), nullptr, 1, {}, nullptr);
static Kernel::ClassPropertiesBase::Init const s_FileExportOptionsInit(FileExportOptions::GetTypeClassProperties());

Kernel::ClassProperties const FileExportOptionsPDF::ms_ClassProperties(
    Kernel::ClassUID("FExP"),
    [] { return Kernel::Counted<Kernel::Serialisable>(Kernel::MakeCounted<FileExportOptionsPDF>()); }, 1, {},
    &FileExportOptions::GetTypeClassProperties());
static Kernel::ClassPropertiesBase::Init const s_FileExportOptionsPDFInit(
    FileExportOptionsPDF::GetTypeClassProperties());

Kernel::ClassProperties const & FileExportOptions::GetTypeClassProperties()
{
    return ms_ClassProperties;
}

void FileExportOptions::Save(Kernel::OutSerialiser & out) const
{
    out.SaveType("Bled", m_IncludeBleed);
    out.SaveType("Meta", m_EmbedMetadata);
}

bool FileExportOptions::Load(Kernel::InSerialiser const & in, Kernel::FileStore &, unsigned short)
{
    in.LoadType("Bled", m_IncludeBleed);
    in.LoadType("Meta", m_EmbedMetadata);
    return true;
}

Kernel::ClassProperties const & FileExportOptionsPDF::GetObjectClassProperties() const
{
    return ms_ClassProperties;
}

Kernel::ClassProperties const & FileExportOptionsPDF::GetTypeClassProperties()
{
    return ms_ClassProperties;
}

void FileExportOptionsPDF::Save(Kernel::OutSerialiser & out) const
{
    FileExportOptions::Save(out);
    out.SaveType("Link", m_Settings.m_Hyperlinks);
    out.SaveType("Mark", m_Settings.m_Bookmarks);
    out.SaveType("Labl", m_Settings.m_PageLabels);
    out.SaveType("Open", m_Settings.m_OpenBookmarkLevels);
    out.SaveType("Crop", m_Settings.m_PrintersMarks.m_CropMarks);
    out.SaveType("Regi", m_Settings.m_PrintersMarks.m_RegistrationMarks);
    out.SaveType("MkOf", m_Settings.m_PrintersMarks.m_Offset);
    out.SaveType("MkLn", m_Settings.m_PrintersMarks.m_Length);
    out.SaveType("MkWd", m_Settings.m_PrintersMarks.m_LineWidth);
    out.SaveType("DpiL", m_Settings.m_PictureDpiLimit);
    out.SaveType("DpiW", m_Settings.m_PictureDpiWarning);
    out.SaveType("Deep", m_Settings.m_Keep16Bit);
    out.SaveType("Intn", m_Settings.m_OutputIntent);
    out.SaveType("Lang", m_Settings.m_Language);
    if (m_Settings.m_FixedTime) {
        out.SaveType("Time", *m_Settings.m_FixedTime);
    }
}

bool FileExportOptionsPDF::Load(Kernel::InSerialiser const & in, Kernel::FileStore & store, unsigned short version)
{
    in.LoadType("Link", m_Settings.m_Hyperlinks);
    in.LoadType("Mark", m_Settings.m_Bookmarks);
    in.LoadType("Labl", m_Settings.m_PageLabels);
    in.LoadType("Open", m_Settings.m_OpenBookmarkLevels);
    in.LoadType("Crop", m_Settings.m_PrintersMarks.m_CropMarks);
    in.LoadType("Regi", m_Settings.m_PrintersMarks.m_RegistrationMarks);
    in.LoadType("MkOf", m_Settings.m_PrintersMarks.m_Offset);
    in.LoadType("MkLn", m_Settings.m_PrintersMarks.m_Length);
    in.LoadType("MkWd", m_Settings.m_PrintersMarks.m_LineWidth);
    in.LoadType("DpiL", m_Settings.m_PictureDpiLimit);
    in.LoadType("DpiW", m_Settings.m_PictureDpiWarning);
    in.LoadType("Deep", m_Settings.m_Keep16Bit);
    in.LoadType("Intn", m_Settings.m_OutputIntent);
    in.LoadType("Lang", m_Settings.m_Language);
    std::int64_t time = 0;
    if (in.LoadType("Time", time)) {
        m_Settings.m_FixedTime = time;
    }
    return FileExportOptions::Load(in, store, version);
}

}
