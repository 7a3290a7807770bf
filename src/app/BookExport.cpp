#include "app/BookExport.h"

#include "app/BookSettings.h"
#include "app/Interruption.h"
#include "framework/document/VantraController.h"
#include "framework/kernel/FileSystem.h"
#include "framework/kernel/Progress.h"
#include "import/Text.h"
#include "output/ExportBookCommand.h"
#include "output/ExportBookCompleteNotification.h"

#include <algorithm>
#include <map>
#include <set>

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

/// What to say of a result that has no text of its own.
std::string DescribeQuietResult(ExportResult result, std::string const & cause)
{
    if (Interruption::IsRaised()) {
        return Text("Interrupted; the PDF was not written.", "Program");
    }
    if (!cause.empty()) {
        return Text("The PDF was not written: %1", "Program", WithRemedy(cause));
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
        messages.Error("export-failed", {target.string()}, DescribeQuietResult(ExportResultAborted, {}));
        return false;
    }
    auto const & records = complete->GetRecs();
    if (std::all_of(records.begin(), records.end(), [](auto const & record) { return IsSuccess(record.m_Result); })) {
        TellWarnings(command->GetWarnings(), messages);
        return true;
    }
    std::string const cause = command->GetError().ToStd();
    String text;
    String title;
    if (complete->GetErrorStrings(text, title)) {
        std::string sentence = title.ToStd() + ": " + (cause.empty() ? text.ToStd() : cause);
        for (std::size_t at = sentence.find('\n'); std::string::npos != at; at = sentence.find('\n')) {
            sentence.replace(at, 1, at + 1 < sentence.size() ? " " : "");
        }
        messages.Error("export-failed", {}, sentence);
    } else {
        messages.Error("export-failed", {target.string()}, DescribeQuietResult(records.front().m_Result, cause));
    }
    return false;
}

std::string WithRemedy(std::string const & cause)
{
    std::string const folder = Kernel::FileSystem::GetTemporaryFolder().ToStd();
    // The folder itself, or a file that lies there only for a while: the target may lie in it too.
    bool const isTemporary = cause.find(folder + ":") != std::string::npos ||
                             cause.find(folder + ".") != std::string::npos ||
                             cause.find(folder + "/korvane-") != std::string::npos;
    return !isTemporary ? cause
                        : cause + " " +
                              Text("Make room in %1, or set TMPDIR to another folder for temporary files.", "Program",
                                   folder);
}

void TellWarnings(std::vector<Renderer::RenderTree::Warning> const & warnings, Import::MessageList & messages)
{
    struct Told
    {
        Renderer::RenderTree::Warning const * m_Warning;
        std::set<int> m_Pages;
    };
    std::vector<Told> all;
    std::map<std::pair<String, String>, std::size_t> places;
    for (Renderer::RenderTree::Warning const & warning : warnings) {
        auto const [place, isNew] = places.try_emplace({warning.m_Path, warning.m_Text}, all.size());
        if (isNew) {
            all.push_back({&warning, {}});
        }
        if (0 < warning.m_Page) {
            all[place->second].m_Pages.insert(warning.m_Page);
        }
    }
    for (Told const & told : all) {
        std::string text = told.m_Warning->m_Text.ToStd();
        if (!told.m_Pages.empty()) {
            text += " " + Import::CountText("This is on page %2, counted from the first.",
                                            "This is on %1 pages, the first of them page %2, counted from the first.",
                                            "Program", told.m_Pages.size(), *told.m_Pages.begin());
        }
        messages.Warn("output", {told.m_Warning->m_Path.ToStd()}, text);
    }
}

}
