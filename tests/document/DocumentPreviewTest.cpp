#include "framework/commands/ComposeTextCommand.h"
#include "framework/commands/StoryCommands.h"
#include "framework/document/DocumentSaveResult.h"
#include "framework/document/Selection.h"
#include "framework/document/SpreadPreview.h"
#include "framework/kernel/Archive.h"
#include "framework/kernel/ArchiveThumbnails.h"
#include "framework/raster/PngEncoder.h"
#include "support/DocumentBuilder.h"
#include "support/TemporaryFolder.h"

#include <gtest/gtest.h>

#include <algorithm>

using Kernel::Counted;
using Kernel::MakeCounted;
using Raster::Format;

namespace
{

Counted<DocumentController> Document(Format format)
{
    DocumentBuilder builder;
    builder.Paragraphs(12);
    builder.Settings().m_Format = format;
    return builder.Build();
}

/// The preview in a document's file; null if there is none.
Counted<Kernel::RawData const> PreviewIn(String const & path)
{
    auto opened = Kernel::Archive::OpenResult::Success;
    auto const archive =
        Kernel::Archive::Open(path, Kernel::Archive::OpenMode::ReadUnlocked, DocumentController::FileType, opened);
    char const * const item = Kernel::ArchiveThumbnails::GetItemName(Kernel::ArchiveThumbnails::FileType::Png);
    return archive && archive->HasItem(item) ? archive->ReadItem(item) : nullptr;
}

bool AreSame(Counted<Kernel::RawData const> const & a, Counted<Kernel::RawData const> const & b)
{
    return std::ranges::equal(a->GetSpan(), b->GetSpan());
}

void InsertInFront(DocumentController & document, char const * text)
{
    document.EnqueueCommandAndWait(
        MakeCounted<InsertTextCommand>(text, MakeCounted<Selection>(document.GetDocument()->GetMainFlow(), 0, 0)));
    document.EnqueueCommandAndWait(MakeCounted<ComposeTextCommand>(false, nullptr));
}

}

TEST(DocumentPreviewTest, ASavedDocumentShowsItsFirstSpreadAndWhoeverLooksLaterNeedNotDrawIt)
{
    TemporaryFolder const folder;
    for (Format const format : {Format::Rgba8, Format::Cmyka8, Format::Laba16}) {
        String const path = folder / (std::to_string(static_cast<int>(format)) + ".kvdoc");
        auto const document = Document(format);
        DocumentSaveResult result;
        document->SaveDocument(result, path);
        ASSERT_TRUE(result.IsSuccess()) << result.GetText();
        EXPECT_FALSE(PreviewIn(path)) << "nobody will look for it";

        document->KeepCacheBitmap();
        InsertInFront(*document, "A word. ");
        document->SaveDocument(result, path);
        auto const first = PreviewIn(path);
        ASSERT_TRUE(first);
        InsertInFront(*document, "Another word, and one more. ");
        document->SaveDocument(result, path);
        auto const second = PreviewIn(path);
        ASSERT_TRUE(second);
        EXPECT_FALSE(AreSame(first, second)) << "it shows what was saved";
        document->ShutDownArchive();

        // A book's pass has the document in no window: it gets the picture from the file, as the document's own.
        auto const loaded = LoadTestDocument(path, nullptr);
        auto const picture = loaded->GetDocumentCacheBitmap(0, false);
        ASSERT_TRUE(picture);
        EXPECT_EQ(picture->GetFormat(), format);
        EXPECT_EQ(std::max(picture->GetWidth(), picture->GetHeight()), SpreadPreview::PngSide);
        auto const again = SpreadPreview::EncodeFirst(*picture, loaded);
        ASSERT_TRUE(again);
        if (format == Format::Rgba8) {
            EXPECT_TRUE(AreSame(again, second)) << "nothing is lost on the way";
        }
        EXPECT_FALSE(loaded->GetDocumentCacheBitmap(1, false));

        // What it changes and saves, and what is copied, keeps the picture, though nobody draws it anew.
        InsertInFront(*loaded, "Changed by a pass. ");
        loaded->SaveDocument(result, path);
        ASSERT_TRUE(result.IsSuccess()) << result.GetText();
        ASSERT_TRUE(PreviewIn(path));
        EXPECT_TRUE(AreSame(PreviewIn(path), second));
        String const copy = path + ".copy";
        loaded->SaveCopy(result, copy);
        ASSERT_TRUE(PreviewIn(copy));
        loaded->ShutDownArchive();
    }
}

TEST(DocumentPreviewTest, APictureThatIsNoneOfOursIsNone)
{
    auto const decode = [](std::string const & bytes) {
        auto const data = MakeCounted<Kernel::RawData>(bytes.size());
        std::copy(bytes.begin(), bytes.end(), data->GetMutableData());
        return SpreadPreview::Decode(*data, Format::Rgba8, {});
    };
    auto const large = MakeCounted<Raster::DynamicBitmap>();
    large->Create(600, 20, Format::Rgba8, Raster::MipmapMode::None, Raster::HardwareCachePolicy::Default);
    auto const data = MakeCounted<Raster::CompressedRasterData>();
    ASSERT_TRUE(Raster::PNGBase(data, 600, 20, Raster::ExportOptions())
                    .Write(*large, nullptr,
                           Raster::ICCManager::GetInstance().GetDefaultProfileForFormat(Format::Rgba8),
                           Raster::RenderingIntent::Perceptual, false));
    auto const png = data->RelinquishOwnership();
    std::string const whole(png->GetData(), png->GetData() + png->GetSize());
    auto const sound = MakeCounted<Raster::DynamicBitmap>();
    sound->Create(300, 500, Format::Rgba8, Raster::MipmapMode::None, Raster::HardwareCachePolicy::Default);
    auto const preview = SpreadPreview::Encode(*sound, 300, 500, false, nullptr, {});
    ASSERT_TRUE(preview);
    std::string const bytes(preview->GetData(), preview->GetData() + preview->GetSize());
    EXPECT_TRUE(decode(bytes));
    EXPECT_FALSE(decode(""));
    EXPECT_FALSE(decode("no picture"));
    EXPECT_FALSE(decode(bytes.substr(0, bytes.size() / 2))) << "cut off";
    EXPECT_FALSE(decode(whole)) << "larger than any preview";
}
