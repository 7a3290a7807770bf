#include "app/BookExport.h"

#include "app/BookSettings.h"
#include "app/Interruption.h"
#include "framework/document/VantraController.h"
#include "framework/kernel/Progress.h"
#include "import/Text.h"
#include "output/ExportBookCommand.h"
#include "output/ExportBookCompleteNotification.h"

namespace App
{

using Import::Text;

namespace
{

Kernel::Consolidated<Renderer::FileExportOptions> MakeOptions(Book::BookController const & book,
                                                              PdfWishes const & wishes)
{
    BookSettings settings = BookSettings::Of(book);
    if (settings.m_Pdf.m_Language.Empty()) {
        settings.m_Pdf.m_Language = String(wishes.m_Language);
    }
    if (0 <= wishes.m_FixedTime) {
        settings.m_Pdf.m_FixedTime = wishes.m_FixedTime;
    }
    settings.m_Pdf.m_PrintersMarks.m_CropMarks = wishes.m_HasMarks.value_or(settings.m_Pdf.m_PrintersMarks.m_CropMarks);
    // Marks without the bleed would stand round pages that can't be cut to them.
    settings.m_IncludesBleed =
        wishes.m_IncludesBleed.value_or(settings.m_IncludesBleed) || wishes.m_HasMarks.value_or(false);
    settings.m_EmbedsMetadata = wishes.m_EmbedsMetadata.value_or(settings.m_EmbedsMetadata);
    return settings.MakeExportOptions();
}

/// One sentence for results that have no text of their own; empty for those that have.
std::string DescribeQuietResult(ExportResult result)
{
    if (Interruption::IsRaised()) {
        return Text("Interrupted; the PDF was not written.", "Program");
    }
    if (ExportResultAborted == result) {
        return Text(
            "The export stopped half-way, so the PDF was not written: there may be no room left for its temporary "
            "file.",
            "Program");
    }
    return Text("The PDF could not be made.", "Program");
}

}

bool ExportBook(BookSession & session, Listener & listener, std::filesystem::path const & target,
                PdfWishes const & wishes, Import::MessageList & messages)
{
    listener.Forget();
    auto const command = Kernel::MakeCounted<Book::ExportBookCommand>(
        session.GetChapters(), String(target.string()), MakeOptions(*session.GetBook(), wishes),
        Kernel::SizeT<double>(), false, false, false, true, nullptr);
    session.Run(command);
    VantraController::GetInstance().WaitUntilIdle();
    messages.Append(listener.TakeMessages());

    auto const complete = listener.GetExport();
    if (!complete) {
        messages.Error("export-failed", {target.string()}, DescribeQuietResult(ExportResultAborted));
        return false;
    }
    bool isGood = true;
    for (auto const & record : complete->GetRecs()) {
        for (Renderer::RenderTree::Warning const & warning : record.m_Warnings) {
            messages.Warn("output", {warning.m_Path.ToStd()}, warning.m_Text.ToStd());
        }
        isGood = isGood && IsSuccess(record.m_Result);
    }
    if (isGood) {
        return true;
    }
    String text;
    String title;
    if (complete->GetErrorStrings(text, title)) {
        std::string sentence = title.ToStd() + ": " + text.ToStd();
        for (std::size_t at = sentence.find('\n'); std::string::npos != at; at = sentence.find('\n')) {
            sentence.replace(at, 1, at + 1 < sentence.size() ? " " : "");
        }
        messages.Error("export-failed", {}, sentence);
    } else {
        messages.Error("export-failed", {target.string()}, DescribeQuietResult(complete->GetRecs().front().m_Result));
    }
    return false;
}

}
