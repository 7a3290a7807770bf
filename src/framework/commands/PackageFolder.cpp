#include "framework/commands/PackageFolder.h"

#include "framework/kernel/FileOutStream.h"
#include "framework/kernel/FileSystem.h"
#include "framework/kernel/Format.h"
#include "framework/kernel/Path.h"
#include "framework/kernel/PathTraitsDos.h"

#include <algorithm>
#include <unicode/normalizer2.h>
#include <unicode/unistr.h>

namespace
{

using Bytes = std::span<std::uint8_t const>;

bool Holds(String const & path, Bytes bytes)
{
    std::uint64_t size = 0;
    if (Kernel::FileSystem::IsFolder(path) || !Kernel::FileSystem::GetSize(path, size) || size != bytes.size()) {
        return false;
    }
    Raster::PictureProblem unread;
    Raster::Picture::Bytes const present = Raster::ReadPictureFile(path, unread);
    return present && std::ranges::equal(*present, bytes);
}

bool Write(String const & path, Bytes bytes, String & problem)
{
    if (String const folder = Kernel::Path::GetFolder(path); !Kernel::FileSystem::CreateFolders(folder)) {
        problem = Kernel::Format(Kernel::LocalisedString("The folder \"%1\" can't be made: %2.", "Package"), folder,
                                 Kernel::GetSystemErrorText(errno));
        return false;
    }
    Kernel::File::OpenUnmanagedResult made{};
    auto const stream = Kernel::FileOutStream::Create(path.c_str(), Kernel::File::ShareMode::Shared, made, &problem);
    if (!stream) {
        return false;
    }
    try {
        stream->Write(bytes.data(), bytes.size());
        if (stream->Close()) {
            return true;
        }
        problem = Kernel::Format(Kernel::LocalisedString("\"%1\" can't be written.", "Package"), path);
    } catch (Kernel::Exception const & exception) {
        problem = exception.GetMessage();
    }
    return false;
}

/// "name.ext", "name-2.ext", "name-3.ext".
String Numbered(String const & name, int number)
{
    if (number == 1) {
        return name;
    }
    String const extension = Kernel::Path::GetExtension(name);
    String const stem = Kernel::Path::GetFileNameWithoutExtension(name);
    return Kernel::Format("%1-%2", stem, number) + (extension.Empty() ? String() : "." + extension);
}

}

String PackageFolder::Fold(String const & name)
{
    UErrorCode error = U_ZERO_ERROR;
    icu::Normalizer2 const * const folding = icu::Normalizer2::getNFKCCasefoldInstance(error);
    icu::UnicodeString const text =
        icu::UnicodeString::fromUTF8(icu::StringPiece(name.Data(), static_cast<std::int32_t>(name.Length())));
    std::string folded;
    if (U_SUCCESS(error)) {
        folding->normalize(text, error).toUTF8String(folded);
    }
    return U_SUCCESS(error) ? String(folded) : name;
}

String PackageFolder::FindTaken(String const & name)
{
    if (!m_IsListed) {
        std::vector<String> names;
        Kernel::FileSystem::ListFolder(m_Folder, names);
        for (String const & present : names) {
            m_Names.emplace(Fold(present), present);
        }
        m_IsListed = true;
    }
    auto const found = m_Names.find(Fold(name));
    return found == m_Names.end() ? String() : found->second;
}

String PackageFolder::Put(String const & name, Bytes bytes, String & problem)
{
    for (int number = 1;; ++number) {
        String const candidate = Numbered(name, number);
        String const taken = FindTaken(candidate);
        if (taken.Empty()) {
            if (!Write(Kernel::PathTraitsDos::Append(m_Folder, candidate), bytes, problem)) {
                return {};
            }
            m_Names.emplace(Fold(candidate), candidate);
            return candidate;
        }
        if (Holds(Kernel::PathTraitsDos::Append(m_Folder, taken), bytes)) {
            return taken;
        }
    }
}

String PackageFolder::PutTogether(std::vector<File> const & files, String & problem)
{
    String const name = Kernel::Path::GetFileNameWithoutExtension(files.front().m_Name);
    for (int number = 1;; ++number) {
        String const candidate = number == 1 ? name : Kernel::Format("%1-%2", name, number);
        String const taken = FindTaken(candidate);
        String const folder = Kernel::PathTraitsDos::Append(m_Folder, taken.Empty() ? candidate : taken);
        auto const pathOf = [&folder](File const & file) { return Kernel::PathTraitsDos::Append(folder, file.m_Name); };
        if (taken.Empty()) {
            m_Names.emplace(Fold(candidate), candidate);
            for (File const & file : files) {
                if (!Write(pathOf(file), *file.m_Bytes, problem)) {
                    return {};
                }
            }
        } else if (!std::ranges::all_of(files, [&](File const & file) { return Holds(pathOf(file), *file.m_Bytes); })) {
            continue;
        }
        return Kernel::PathTraitsDos::Append(taken.Empty() ? candidate : taken, files.front().m_Name);
    }
}
