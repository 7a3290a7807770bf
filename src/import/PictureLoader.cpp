#include "import/PictureLoader.h"

#include "framework/document/DocumentPictures.h"
#include "framework/kernel/FileSystem.h"
#include "framework/raster/Picture.h"
#include "import/SourceText.h"
#include "import/Text.h"

#include <algorithm>
#include <cstring>
#include <fstream>

namespace Import
{

namespace
{

using Renderer::RenderTree::PlacedDrawing;

/// Resolution of a picture that does not tell its own.
constexpr double g_DefaultDpi = 96;

std::string LoweredExtension(std::filesystem::path const & path)
{
    std::string extension = path.extension().string();
    std::transform(extension.begin(), extension.end(), extension.begin(),
                   [](unsigned char c) { return static_cast<char>(c < 0x80 ? std::tolower(c) : c); });
    return extension;
}

DocumentPictures::Entry EntryOf(std::string const & path, std::vector<unsigned char> const & bytes)
{
    DocumentPictures::Entry entry;
    entry.m_SourcePath = String(path);
    Kernel::FileSystem::GetModifiedTime(entry.m_SourcePath, entry.m_SourceTime);
    entry.m_Size = bytes.size();
    return entry;
}

/// Whether the file ends as its format wants it; a file cut short shows by this without being decoded.
bool HasEnd(std::vector<unsigned char> const & bytes, Raster::PictureKind kind)
{
    std::string_view const tail(reinterpret_cast<char const *>(bytes.data()) +
                                    (bytes.size() - std::min<std::size_t>(bytes.size(), 512)),
                                std::min<std::size_t>(bytes.size(), 512));
    return std::string_view::npos != (Raster::PictureKind::Png == kind ? tail.rfind("IEND") : tail.rfind("\xFF\xD9"));
}

}

PictureLoader::PictureLoader(std::filesystem::path const & chapter, std::string shownName, DocumentPictures & pictures,
                             std::map<std::string, KnownFile> & known, PasswordSource const & passwords,
                             MessageList & messages)
    : m_Folder(chapter.parent_path()),
      m_ShownName(std::move(shownName)),
      m_Pictures(pictures),
      m_Known(known),
      m_Passwords(passwords),
      m_Messages(messages)
{
}

PictureLoader::Loaded PictureLoader::Read(std::string const & path, Picture const & picture)
{
    if (std::string::npos != picture.m_Path.find("://")) {
        return {"",
                0,
                0,
                Kernel::LocalisedString("The picture %1 is on the web; save it beside the chapter", "Source"),
                "picture-remote",
                {},
                {}};
    }
    KnownFile & known = m_Known[path];
    known.m_Stamp = FileStamp::Of(path);
    if (!known.m_Stamp.Exists()) {
        return {"", 0, 0, Kernel::LocalisedString("The picture %1 is missing", "Source"), "picture-missing", {}, {}};
    }
    std::ifstream stream(path, std::ios::binary);
    auto const bytes = std::make_shared<std::vector<unsigned char>>(static_cast<std::size_t>(known.m_Stamp.m_Size));
    stream.read(reinterpret_cast<char *>(bytes->data()), known.m_Stamp.m_Size);
    if (!stream || stream.gcount() != known.m_Stamp.m_Size) {
        return {"", 0, 0, Kernel::LocalisedString("The picture %1 cannot be read", "Source"), "picture-unreadable",
                {}, {}};
    }
    known.m_Hash = HashBytes({reinterpret_cast<char const *>(bytes->data()), bytes->size()});
    return PlacedDrawing::KindOf(*bytes) ? ReadDrawing(bytes, path, picture) : ReadPixels(bytes, path, picture);
}

PictureLoader::Loaded PictureLoader::ReadDrawing(Raster::Picture::Bytes const & bytes, std::string const & path,
                                                 Picture const & picture)
{
    using Code = Raster::PictureProblem::Code;
    PlacedDrawing::Source source{bytes, String(path), picture.m_Page, String()};
    Raster::PictureProblem problem;
    auto drawing = PlacedDrawing::Open(source, problem);
    bool const isProtected = !drawing && Code::Locked == problem.m_Code;
    for (bool isWrong = false; !drawing && Code::Locked == problem.m_Code && m_Passwords; isWrong = true) {
        source.m_Password = String(m_Passwords(path, isWrong));
        if (source.m_Password.Empty()) {
            break;
        }
        problem = {};
        drawing = PlacedDrawing::Open(source, problem);
    }
    DocumentPictures::Entry entry = EntryOf(path, *bytes);
    entry.m_DrawingKind = PlacedDrawing::KindOf(*bytes);
    entry.m_IsProtected = isProtected;
    Loaded loaded;
    if (drawing || Code::Locked == problem.m_Code) {
        loaded.m_DataId = PictureReference{m_Pictures.Add(bytes, entry), picture.m_Page}.ToString().ToStd();
    }
    if (drawing) {
        loaded.m_Width = drawing->GetSize().width;
        loaded.m_Height = drawing->GetSize().height;
    } else if (Code::Locked == problem.m_Code) {
        // With its password it would look otherwise, so this state is never one to rely on.
        m_Known[path].m_Hash = 0;
        m_Known[path].m_Stamp = {};
        loaded.m_Problem = Kernel::LocalisedString(
            "The picture %1 is protected by a password, which --password %1=... gives", "Source");
        loaded.m_Kind = "picture-locked";
    } else {
        // The sentence names the file by its path; here the author's name for it is better.
        loaded.m_Problem = Kernel::LocalisedString("The picture %1 cannot be placed: it %2", "Source");
        loaded.m_What = problem.m_What;
        loaded.m_Detail = problem.m_Detail;
        loaded.m_Kind = Code::NoSuchPage == problem.m_Code ? "picture-page" : "picture-damaged";
    }
    return loaded;
}

PictureLoader::Loaded PictureLoader::ReadPixels(Raster::Picture::Bytes const & bytes, std::string const & path,
                                                Picture const & picture)
{
    std::string const extension = LoweredExtension(picture.m_Path);
    Raster::PictureProblem problem;
    auto const opened = Raster::Picture::FromBytes(bytes, String(picture.m_Path), problem);
    if (!opened) {
        bool const isOtherKind = Raster::PictureProblem::Code::UnknownKind == problem.m_Code;
        if (isOtherKind) {
            return {"",
                    0,
                    0,
                    Kernel::LocalisedString("The picture %1 is none of PNG, JPEG, PDF and SVG, whatever its name says",
                                            "Source"),
                    "picture-kind",
                    {},
                    {}};
        }
        return {"",
                0,
                0,
                Kernel::LocalisedString("The picture %1 cannot be placed: it %2", "Source"),
                "picture-damaged",
                problem.m_What,
                problem.m_Detail};
    }
    Raster::PictureInfo const & info = opened->GetInfo();
    if (!HasEnd(*bytes, info.m_Kind) && !opened->Decode(problem)) {
        return {
            "", 0, 0, Kernel::LocalisedString("The picture %1 is cut short or damaged", "Source"), "picture-damaged",
            {}, {}};
    }
    std::string const promised = ".jpeg" == extension ? ".jpg" : extension;
    std::string const actual = Raster::PictureKind::Png == info.m_Kind ? ".png" : ".jpg";
    if (promised != actual) {
        m_Messages.Warn("picture-kind", {m_ShownName, picture.m_Line},
                        Text("The picture %1 is a %2 under another name; it is set all the same.", "Source",
                             picture.m_Path, ".png" == actual ? "PNG" : "JPEG"));
    }

    Loaded loaded;
    loaded.m_DataId = m_Pictures.Add(bytes, EntryOf(path, *bytes)).ToStd();
    auto const points = [](int pixels, double dpi) { return pixels * 72.0 / (1 < dpi ? dpi : g_DefaultDpi); };
    loaded.m_Width = points(info.UprightWidth(), info.UprightDpiX());
    loaded.m_Height = points(info.UprightHeight(), info.UprightDpiY());
    return loaded;
}

Story::PictureGlyph::Fields PictureLoader::Load(Picture const & picture)
{
    std::string const path = (m_Folder / picture.m_Path).lexically_normal().string();
    auto known = m_Loaded.find({path, picture.m_Page});
    if (known == m_Loaded.end()) {
        known = m_Loaded.emplace(std::pair(path, picture.m_Page), Read(path, picture)).first;
    }
    Loaded const & loaded = known->second;
    Story::PictureGlyph::Fields fields;
    fields.m_Path = String(picture.m_Path);
    fields.m_AltText = String(picture.m_Alternative);
    fields.m_DataId = String(loaded.m_DataId);
    fields.m_NaturalWidth = loaded.m_Width;
    fields.m_NaturalHeight = loaded.m_Height;
    fields.m_WantedWidth = picture.m_Width;
    fields.m_WantedMeasurePart = picture.m_WidthShare;
    if (!loaded.m_Problem.Empty()) {
        fields.m_IsMissing = true;
        // This goes into the document, which must not depend on who looks at it: the untranslated text.
        fields.m_MissingReason = Kernel::Format(String(loaded.m_Problem.SourceText()), picture.m_Path,
                                                Kernel::Format(String(loaded.m_What.SourceText()), loaded.m_Detail)) +
                                 ".";
        m_Messages.Warn(
            loaded.m_Kind, {m_ShownName, picture.m_Line},
            Text("%1; a marked box stands in its place.", "Source",
                 Kernel::Format(loaded.m_Problem, picture.m_Path, Kernel::Format(loaded.m_What, loaded.m_Detail))));
    }
    return fields;
}

}
