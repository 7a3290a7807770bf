#include "app/BookExport.h"

#include "app/Interruption.h"
#include "framework/document/VantraController.h"
#include "framework/kernel/Progress.h"
#include "framework/render/FileExportOptions.h"
#include "output/ExportBookCommand.h"
#include "output/ExportBookCompleteNotification.h"

namespace App
{

namespace
{

Kernel::Consolidated<Renderer::FileExportOptions> MakeOptions(PdfWishes const & wishes)
{
    auto const options = Kernel::MakeCounted<Renderer::FileExportOptionsPDF>();
    Renderer::FileExportOptionsPDF::Settings settings;
    settings.m_Language = String(wishes.m_Language);
    if (0 <= wishes.m_FixedTime) {
        settings.m_FixedTime = wishes.m_FixedTime;
    }
    if (wishes.m_HasMarks) {
        settings.m_PrintersMarks.m_CropMarks = true;
    }
    options->SetSettings(settings);
    options->SetIncludeBleed(wishes.m_IncludesBleed || wishes.m_HasMarks);
    options->SetEmbedMetadata(wishes.m_EmbedsMetadata);
    return Kernel::Consolidated<Renderer::FileExportOptions>(
        Kernel::Counted<Renderer::FileExportOptions const>(options));
}

/// One sentence for results that have no text of their own; empty for those that have.
std::string DescribeQuietResult(ExportResult result)
{
    if (Interruption::IsRaised()) {
        return "Interrupted; the PDF was not written.";
    }
    if (ExportResultAborted == result) {
        return "The export stopped half-way, so the PDF was not written: there may be no room left for its temporary "
               "file.";
    }
    return "The PDF could not be made.";
}

}

bool ExportBook(BookSession & session, Listener & listener, std::filesystem::path const & target,
                PdfWishes const & wishes, Import::MessageList & messages)
{
    listener.Forget();
    auto const command = Kernel::MakeCounted<Book::ExportBookCommand>(session.GetChapters(), String(target.string()),
                                                                      MakeOptions(wishes), Kernel::SizeT<double>(),
                                                                      false, false, false, true, nullptr);
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
