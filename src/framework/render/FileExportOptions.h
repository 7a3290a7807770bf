#pragma once

#include <cstdint>
#include <optional>

#include "framework/kernel/Serialisable.h"
#include "framework/kernel/StringT.h"
#include "framework/render/PrintersMarks.h"

namespace Renderer
{

/// What an output file is to be like. Filled in, then put into a `Kernel::Consolidated` and only read. The class tells
/// the format: ask with `Kernel::CountedCast` or `dynamic_cast`.
class FileExportOptions : public Kernel::SharedSerialisable
{
public:
    /// The file extension without its dot.
    [[nodiscard]] virtual String GetExtension() const = 0;

    /// Pages go beyond their trimmed edge by the document's bleed.
    [[nodiscard]] bool GetIncludeBleed() const { return m_IncludeBleed; }
    void SetIncludeBleed(bool include) { m_IncludeBleed = include; }

    /// The document's metadata go into the finished file.
    [[nodiscard]] bool GetEmbedMetadata() const { return m_EmbedMetadata; }
    void SetEmbedMetadata(bool embed) { m_EmbedMetadata = embed; }

    void Save(Kernel::OutSerialiser & out) const override;
    bool Load(Kernel::InSerialiser const & in, Kernel::FileStore & store, unsigned short version) override;
    [[nodiscard]] static Kernel::ClassProperties const & GetTypeClassProperties();

private:
    static Kernel::ClassProperties const ms_ClassProperties;

    bool m_IncludeBleed = false;
    bool m_EmbedMetadata = true;
};

/// PDF output.
class FileExportOptionsPDF : public FileExportOptions
{
public:
    /// The switches with the values that they have in new options.
    struct Settings
    {
        bool m_Hyperlinks = true;
        bool m_Bookmarks = true;
        bool m_PageLabels = true;
        /// Outline entries down to this level are shown open; 0 shows none open.
        int m_OpenBookmarkLevels = 0;
        PrintersMarksOptions m_PrintersMarks;
        /// Pictures with more pixels to the inch than this are reduced to it; 0 for no limit. JPEG files that are within
        /// the limit are taken over untouched.
        double m_PictureDpiLimit = 0;
        /// A warning for pictures below this; 0 for none.
        double m_PictureDpiWarning = 0;
        /// Pictures of 16 bits a channel keep them; otherwise they are reduced to 8.
        bool m_Keep16Bit = true;
        /// Names the document's profile as the printing condition that the file is meant for.
        bool m_OutputIntent = true;
        /// BCP 47 language of the file, empty if it is not to be named.
        String m_Language;
        /// Seconds since 1970 that stand for now in the file, so that the same book gives the same bytes. Unset: the
        /// clock.
        std::optional<std::int64_t> m_FixedTime;
    };

    [[nodiscard]] String GetExtension() const override { return "pdf"; }
    [[nodiscard]] Settings const & GetSettings() const { return m_Settings; }
    void SetSettings(Settings const & settings) { m_Settings = settings; }

    [[nodiscard]] bool GetHyperlinks() const { return m_Settings.m_Hyperlinks; }
    [[nodiscard]] bool GetBookmarks() const { return m_Settings.m_Bookmarks; }
    [[nodiscard]] PrintersMarksOptions const & GetPrintersMarks() const { return m_Settings.m_PrintersMarks; }

    void Save(Kernel::OutSerialiser & out) const override;
    bool Load(Kernel::InSerialiser const & in, Kernel::FileStore & store, unsigned short version) override;
    [[nodiscard]] Kernel::ClassProperties const & GetObjectClassProperties() const override;
    [[nodiscard]] static Kernel::ClassProperties const & GetTypeClassProperties();

private:
    static Kernel::ClassProperties const ms_ClassProperties;

    Settings m_Settings;
};

}
