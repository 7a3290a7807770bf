#include "framework/commands/PackageResourcesCommand.h"

#include "framework/document/DocumentControllerSession.h"
#include "framework/document/DOMVisitor.h"
#include "framework/document/PictureNode.h"
#include "framework/document/RunningTextNode.h"
#include "framework/document/TextFlow.h"
#include "framework/kernel/FileInStream.h"
#include "framework/kernel/FileOutStream.h"
#include "framework/kernel/FileSystem.h"
#include "framework/kernel/Format.h"
#include "framework/kernel/MemoryStreams.h"
#include "framework/kernel/Path.h"
#include "framework/kernel/PathTraitsDos.h"
#include "framework/story/StyleSheet.h"
#include "framework/typeset/FontLibrary.h"

#include <algorithm>
#include <optional>

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
    PlacedThings()
    {
        AddTerminatingTranslator<PictureNode>(&PlacedThings::OnPicture);
        AddTerminatingTranslator<RunningTextNode>(&PlacedThings::OnRunningText);
    }
    std::vector<String> m_Files;
    std::vector<String> m_Styles;

private:
    void OnPicture(PictureNode & node) { m_Files.push_back(node.GetPath()); }
    void OnRunningText(RunningTextNode & node) { m_Styles.push_back(node.GetStyle()); }
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

/// A file's bytes; none if it can't be read.
Kernel::Counted<Kernel::RawData const> ReadFile(String const & path)
{
    auto const stream = Kernel::FileInStream::Open(path.c_str(), false);
    if (!stream) {
        return nullptr;
    }
    try {
        return stream->ReadAll();
    } catch (Kernel::Exception const &) {
        return nullptr;
    }
}

/// Puts the bytes in the folder, under the name or, where that is another file's, under a numbered one; gives the file's
/// name, or none, with the reason in `problem`.
String PutInFolder(String const & folder, String const & name, std::span<std::uint8_t const> bytes, String & problem)
{
    if (!Kernel::FileSystem::CreateFolders(folder)) {
        problem = Kernel::Format(Kernel::LocalisedString("The folder \"%1\" can't be made: %2.", "Package"), folder,
                                 Kernel::GetSystemErrorText(errno));
        return {};
    }
    String const stem = Kernel::Path::GetFileNameWithoutExtension(name);
    String const extension = Kernel::Path::GetExtension(name);
    String const suffix = extension.Empty() ? String() : "." + extension;
    for (int number = 1;; ++number) {
        String const candidate = (number == 1 ? stem : Kernel::Format("%1-%2", stem, number)) + suffix;
        String const path = Kernel::PathTraitsDos::Append(folder, candidate);
        if (Kernel::FileSystem::Exists(path)) {
            Kernel::Counted<Kernel::RawData const> const present = ReadFile(path);
            if (present && std::ranges::equal(present->GetSpan(), bytes)) {
                return candidate;
            }
            continue;
        }
        Kernel::File::OpenUnmanagedResult made{};
        auto const stream =
            Kernel::FileOutStream::Create(path.c_str(), Kernel::File::ShareMode::Shared, made, &problem);
        if (!stream) {
            return {};
        }
        try {
            stream->Write(bytes.data(), bytes.size());
            if (stream->Close()) {
                return candidate;
            }
            problem = Kernel::Format(Kernel::LocalisedString("\"%1\" can't be written.", "Package"), path);
        } catch (Kernel::Exception const & exception) {
            problem = exception.GetMessage();
        }
        return {};
    }
}

String NameIn(char const * folder, String const & file)
{
    return Kernel::Format("./%1/%2", folder, file);
}

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
    PlacedThings placed;
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
    String const folder = Kernel::PathTraitsDos::Append(m_Folder, PictureFolder);
    String problem;
    String name;
    if (!picture.m_Id.Empty()) {
        DocumentPictures const & pictures = GetDocument()->GetPictures();
        if (Raster::Picture::Bytes const bytes = pictures.GetBytes(picture.m_Id)) {
            name = PutInFolder(folder, NameOf(picture.m_Path, "picture"), {bytes->data(), bytes->size()}, problem);
        }
        if (!name.Empty()) {
            auto const entries = pictures.GetEntries();
            m_Links.m_Pictures[picture.m_Id] = NameIn(PictureFolder, name);
            // As old as the file that it was taken from, so that it does not pass for a changed one.
            Kernel::FileSystem::SetModifiedTime(Kernel::PathTraitsDos::Append(folder, name),
                                                entries.at(picture.m_Id).m_SourceTime);
            return;
        }
    } else if (Kernel::Counted<Kernel::RawData const> const bytes = ReadFile(picture.m_Path)) {
        name = PutInFolder(folder, NameOf(picture.m_Path, "picture"), bytes->GetSpan(), problem);
        if (!name.Empty()) {
            m_Links.m_PlacedFiles[picture.m_Path] = NameIn(PictureFolder, name);
            return;
        }
    }
    m_Problems.push_back(
        problem.Empty()
            ? Kernel::Format(Kernel::LocalisedString("The picture \"%1\" can't be read, so it was not collected.",
                                                     "Package"),
                             picture.m_Path)
            : problem);
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
    String problem;
    Kernel::Counted<Kernel::RawData const> const bytes = ReadFile(font.m_Path);
    if (!bytes) {
        problem = Kernel::Format(
            Kernel::LocalisedString("The font file \"%1\" can't be read, so it was not collected.", "Package"),
            font.m_Path);
    } else if (!PutInFolder(Kernel::PathTraitsDos::Append(m_Folder, FontFolder), NameOf(font.m_Path, "font"),
                            bytes->GetSpan(), problem)
                    .Empty()) {
        return;
    }
    m_Problems.push_back(problem);
}
