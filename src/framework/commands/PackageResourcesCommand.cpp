#include "framework/commands/PackageResourcesCommand.h"

#include "framework/document/DocumentControllerSession.h"
#include "framework/document/DOMVisitor.h"
#include "framework/document/PictureNode.h"
#include "framework/document/RunningTextNode.h"
#include "framework/document/TextFlow.h"
#include "framework/kernel/FileSystem.h"
#include "framework/kernel/Format.h"
#include "framework/kernel/Path.h"
#include "framework/kernel/PathTraitsDos.h"
#include "framework/render/SvgReader.h"
#include "framework/story/StyleSheet.h"
#include "framework/typeset/FontLibrary.h"

#include <algorithm>
#include <set>

namespace
{

CommandRegistration const s_Resources(typeid(PackageResourcesCommand), "PackageResourcesCommand");

/// OpenType specification, OS/2 table, fsType: bits 1 to 3 say how a font may be used by others, none of them that it
/// may be installed for good; bit 9 that only its bitmaps may go along. Where several of the first are set, as older
/// fonts have it, the most generous one counts.
bool MayGoAlong(Typeset::FontFace const & face)
{
    constexpr unsigned UsageBits = 0x000E;
    constexpr unsigned Editable = 0x0008;
    constexpr unsigned BitmapsOnly = 0x0200;
    unsigned const flags = face.GetEmbeddingFlags();
    return ((flags & UsageBits) == 0 || (flags & Editable) != 0) && (flags & BitmapsOnly) == 0;
}

/// Collects the placed files of a tree, and the styles of its running texts.
class PlacedThings : public DOMVisitorT<PlacedThings>
{
public:
    explicit PlacedThings(DocumentPictures const & pictures) : m_Pictures(pictures)
    {
        AddTerminatingTranslator<PictureNode>(&PlacedThings::OnPicture);
        AddTerminatingTranslator<RunningTextNode>(&PlacedThings::OnRunningText);
    }
    std::vector<String> m_Files;
    std::vector<String> m_Styles;

private:
    void OnPicture(PictureNode & node)
    {
        // One that carries the password for a picture of the text has that one's id: the document holds the file.
        if (!m_Pictures.FindEntry(node.GetGUID())) {
            m_Files.push_back(node.GetPath());
        }
    }
    void OnRunningText(RunningTextNode & node) { m_Styles.push_back(node.GetStyle()); }

    DocumentPictures const & m_Pictures;
};

class FontGatherer
{
public:
    explicit FontGatherer(PackageManagerInfo & info) : m_Info(info) {}

    void AddFace(Typeset::FontFace const & face, bool isUsed)
    {
        m_Info.AddFont({face.GetFamily(), face.GetPath(), face.GetData().size(), MayGoAlong(face), isUsed});
    }
    void AddFormat(Story::GlyphFormat const & format, bool isUsed)
    {
        Typeset::FontMatch const match =
            Typeset::FontLibrary::GetInstance().Find(format.m_Families, format.m_Weight, format.m_Italic, format.m_Size);
        if (!match.m_FamilyFound && !format.m_Families.empty()) {
            m_Info.AddFont({format.m_Families.front(), String(), 0, false, isUsed});
        }
        if (match.m_Face) {
            AddFace(*match.m_Face, isUsed);
        }
    }
    void AddFlow(TextFlow const & flow)
    {
        Kernel::Counted<Story::Layout const> const layout = flow.GetLayout();
        for (auto const & problem : layout ? layout->GetProblems() : std::span<Story::LayoutItem::Problem const>()) {
            if (problem.m_Kind == Story::LayoutItem::Problem::Kind::MissingFamily) {
                m_Info.AddFont({layout->GetString(problem.m_Text), String(), 0, false, true});
            }
        }
        if (layout && flow.EnsureGlyphData()) {
            for (Story::LayoutFont const & font : layout->GetFonts()) {
                if (font.m_Face) {
                    AddFace(*font.m_Face, true);
                }
            }
            return;
        }
        for (TextFlow::FontStamp const & stamp : flow.GetFonts()) {
            if (auto const face = Typeset::FontLibrary::GetInstance().FromFile(stamp.m_Path, 0)) {
                AddFace(*face, true);
            }
        }
    }
    /// Those that a style alone names.
    void AddStyles(Story::StyleSheet const & sheet)
    {
        AddFormat(sheet.ResolveParagraphStyle({}).m_Glyph, false);
        for (Story::TextStyle const & style : sheet.GetParagraphStyles()) {
            AddFormat(sheet.ResolveParagraphStyle(style.m_Name).m_Glyph, false);
        }
        for (Story::TextStyle const & style : sheet.GetCharacterStyles()) {
            Story::GlyphFormat format = sheet.ResolveParagraphStyle({}).m_Glyph;
            format.Apply(sheet.ResolveCharacterStyle(style.m_Name));
            AddFormat(format, false);
        }
    }

private:
    PackageManagerInfo & m_Info;
};

/// The file's name in its folder, with one for what has none.
String NameOf(String const & path, String const & otherwise)
{
    String const name = Kernel::Path::GetFileName(path);
    return name.Empty() || Kernel::Path::GetFileNameWithoutExtension(name).Empty() ? otherwise : name;
}

}

void PackageResourcesCommand::GetDocumentInfo(Kernel::Counted<DocumentController const> const & document,
                                              PackageManagerInfo & info)
{
    DocumentControllerSession const session(document);
    info.AddDocument(document->GetPath());
    for (auto const & [id, entry] : document->GetPictures().GetEntries()) {
        info.AddPicture({entry.m_SourcePath, id, entry.m_Size, static_cast<bool>(document->GetPictures().GetBytes(id))});
    }
    PlacedThings placed(document->GetPictures());
    placed.Visit(document->GetDocument());
    for (String const & path : placed.m_Files) {
        std::uint64_t size = 0;
        bool const isPresent = Kernel::FileSystem::GetSize(path, size) && !Kernel::FileSystem::IsFolder(path);
        info.AddPicture({path, String(), isPresent ? size : 0, isPresent});
    }
    FontGatherer fonts(info);
    for (Kernel::Counted<TextFlow> const & flow : document->GetDocument()->GetTextFlows()) {
        fonts.AddFlow(*flow);
    }
    Kernel::Counted<Story::StyleSheet const> const sheet = document->GetDocument()->GetStyleSheet();
    for (String const & style : placed.m_Styles) {
        fonts.AddFormat(sheet->ResolveParagraphStyle(style).m_Glyph, true);
    }
    fonts.AddStyles(*sheet);
}

Kernel::LocalisedString PackageResourcesCommand::GetDescription() const
{
    return Kernel::LocalisedString("Package resources", "Document Command");
}

void PackageResourcesCommand::Do()
{
    if (!m_Folder.Empty() && !Kernel::FileSystem::IsFolder(m_Folder)) {
        m_Problems.push_back(Kernel::Format(
            Kernel::LocalisedString("The folder \"%1\" does not exist. Make it first.", "Package"), m_Folder));
        return;
    }
    PackageManagerInfo info;
    GetDocumentInfo(Self(), info);
    if (m_WantPictures) {
        for (PackageManagerInfo::Picture const & picture : info.GetPictures()) {
            CollectPicture(picture);
        }
    }
    if (m_WantFonts) {
        for (PackageManagerInfo::Font const & font : info.GetFonts()) {
            if (font.m_IsUsed || m_WantUnusedFonts) {
                CollectFont(font);
            }
        }
    }
}

void PackageResourcesCommand::CollectPicture(PackageManagerInfo::Picture const & picture)
{
    DocumentPictures const & pictures = GetDocument()->GetPictures();
    Raster::PictureProblem unread;
    Raster::Picture::Bytes const bytes =
        picture.m_Id.Empty() ? Raster::ReadPictureFile(picture.m_Path, unread) : pictures.GetBytes(picture.m_Id);
    if (!bytes) {
        TellUnreadPicture(picture.m_Path);
        return;
    }
    std::vector<PackageFolder::File> const files =
        GatherDrawing({NameOf(picture.m_Path, "picture"), bytes}, picture.m_Path);
    String problem;
    String const name = files.size() == 1 ? m_Pictures.Put(files.front().m_Name, *bytes, problem)
                                          : m_Pictures.PutTogether(files, problem);
    if (name.Empty()) {
        m_Problems.push_back(problem);
        return;
    }
    String const link = Kernel::Format("./%1/%2", PictureFolder, name);
    if (!picture.m_Path.Empty()) {
        m_Links.m_PlacedFiles[picture.m_Path] = link;
    }
    if (!picture.m_Id.Empty()) {
        m_Links.m_Pictures[picture.m_Id] = link;
        // As old as the file that it was taken from, so that it does not pass for a changed one.
        Kernel::FileSystem::SetModifiedTime(
            Kernel::PathTraitsDos::Append(Kernel::PathTraitsDos::Append(m_Folder, PictureFolder), name),
            pictures.GetEntries().at(picture.m_Id).m_SourceTime);
    }
}

std::vector<PackageFolder::File> PackageResourcesCommand::GatherDrawing(PackageFolder::File const & first,
                                                                        String const & path)
{
    using Renderer::RenderTree::PlacedDrawing;
    String const folder = Kernel::Path::GetFolderWithSeparator(path);
    std::string const within = Kernel::FileSystem::GetCanonicalPath(folder).ToStd() + "/";
    std::vector<PackageFolder::File> files{first};
    std::set<String> names{first.m_Name, Kernel::Path::GetFileName(path)};
    // One that came from no file has no neighbours.
    for (std::size_t i = 0; i < files.size() && !path.Empty(); ++i) {
        if (PlacedDrawing::KindOf(*files[i].m_Bytes) != PlacedDrawing::Kind::Svg) {
            continue;
        }
        String const below = Kernel::Path::GetFolderWithSeparator(files[i].m_Name);
        for (String const & link : Renderer::RenderTree::FindSvgLinks(*files[i].m_Bytes)) {
            String const name = below + link;
            String const file = folder + name;
            if (!names.insert(name).second || !Kernel::FileSystem::Exists(file) || Kernel::FileSystem::IsFolder(file) ||
                !Kernel::FileSystem::GetCanonicalPath(file).View().starts_with(within)) {
                continue;
            }
            Raster::PictureProblem unread;
            if (Raster::Picture::Bytes const bytes = Raster::ReadPictureFile(file, unread)) {
                files.push_back({name, bytes});
            } else {
                TellUnreadPicture(file);
            }
        }
    }
    return files;
}

void PackageResourcesCommand::TellUnreadPicture(String const & path)
{
    m_Problems.push_back(Kernel::Format(
        Kernel::LocalisedString("The picture \"%1\" can't be read, so it was not collected.", "Package"), path));
}

void PackageResourcesCommand::CollectFont(PackageManagerInfo::Font const & font)
{
    if (font.m_Path.Empty()) {
        m_Problems.push_back(Kernel::Format(
            Kernel::LocalisedString("The font \"%1\" is not on this machine, so it was not collected.", "Package"),
            font.m_Family));
        return;
    }
    if (!font.m_MayCollect) {
        m_Problems.push_back(Kernel::Format(
            Kernel::LocalisedString("The font \"%1\" was not collected: its licence flag forbids giving copies of it "
                                    "away. Install it on the other machine.",
                                    "Package"),
            font.m_Family));
        return;
    }
    Raster::PictureProblem unread;
    Raster::Picture::Bytes const bytes = Raster::ReadPictureFile(font.m_Path, unread);
    String problem = Kernel::Format(
        Kernel::LocalisedString("The font file \"%1\" can't be read, so it was not collected.", "Package"),
        font.m_Path);
    if (!bytes || m_Fonts.Put(NameOf(font.m_Path, "font"), *bytes, problem).Empty()) {
        m_Problems.push_back(problem);
    }
}
