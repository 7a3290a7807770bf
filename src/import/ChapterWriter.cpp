#include "import/Importer.h"

#include "framework/document/DocumentController.h"
#include "framework/document/DocumentNode.h"
#include "framework/document/DocumentSaveResult.h"
#include "framework/document/OpenDocumentFailedNotification.h"
#include "framework/story/Index.h"
#include "framework/story/StyleSheet.h"
#include "import/LinkTarget.h"
#include "import/PictureLoader.h"
#include "import/SaveFailure.h"
#include "import/SourceText.h"
#include "import/StoryWriter.h"
#include "import/Text.h"

#include <map>

namespace Import
{

namespace fs = std::filesystem;

namespace
{

/// The document of the work folder, to be filled anew. One that is there keeps its identity; one that can't be used is
/// replaced, with a warning.
Kernel::Counted<DocumentController> OpenOrMake(fs::path const & path, std::string const & shownName,
                                               MessageList & messages)
{
    auto document = Kernel::MakeCounted<DocumentController>();
    std::error_code error;
    if (!fs::exists(path, error)) {
        return document;
    }
    OpenDocumentFailedNotification failure(String(path.string()), false);
    if (document->LoadDocument(String(path.string()), false, false, LoadWhole, nullptr, failure, false)) {
        return document;
    }
    if (2 <= failure.GetResult() && failure.GetResult() <= 10) {
        messages.Error("document-locked", {shownName},
                       Text("The document %1 of the work folder cannot be changed: %2", "Source",
                            path.filename().string(), failure.GetReason()));
        return nullptr;
    }
    messages.Warn("document-damaged", {shownName},
                  Text("The document %1 of the work folder could not be used and is made anew: %2", "Source",
                       path.filename().string(), failure.GetReason()));
    return Kernel::MakeCounted<DocumentController>();
}

/// What the notes of a chapter are headed with in its language; English where we do not know better.
String NotesHeadingIn(std::string const & language)
{
    static std::map<std::string_view, char const *, std::less<>> const headings{
        {"ar", "ملاحظات"},   {"cs", "Poznámky"}, {"da", "Noter"},      {"de", "Anmerkungen"}, {"el", "Σημειώσεις"},
        {"es", "Notas"},     {"fi", "Viitteet"}, {"fr", "Notes"},      {"he", "הערות"},       {"hi", "टिप्पणियाँ"},
        {"hu", "Jegyzetek"}, {"it", "Note"},     {"ja", "注"},         {"nb", "Noter"},       {"nl", "Noten"},
        {"no", "Noter"},     {"pl", "Przypisy"}, {"pt", "Notas"},      {"ru", "Примечания"},  {"sv", "Noter"},
        {"tr", "Notlar"},    {"uk", "Примітки"}, {"vi", "Chú thích"},  {"zh", "注释"},
    };
    auto const known = headings.find(std::string_view(language).substr(0, language.find_first_of("-_")));
    return headings.end() == known ? String("Notes") : String(known->second);
}

DocumentSettings SettingsFor(BookPlan const & plan, Template const & look, std::string const & title,
                             std::string const & author, std::string const & language)
{
    DocumentSettings settings = look.m_Settings;
    settings.m_PublicationTitle = String(plan.m_Title);
    settings.m_Metadata.m_Title = String(title);
    settings.m_Metadata.m_Author = String(author);
    settings.m_Metadata.m_Language = String(language);
    settings.m_PageSetup.m_NotesHeading = NotesHeadingIn(language);
    Kernel::Counted<Story::StyleSheet> const styles = settings.m_Styles->Clone();
    Story::AttSet glyphAtts = styles->GetDefaultGlyphAtts();
    glyphAtts.SetString(Story::GlyphAtt::Language, String(language));
    styles->SetDefaults(std::move(glyphAtts), styles->GetDefaultParagraphAtts());
    settings.m_Styles = styles;
    return settings;
}

std::string JoinNames(std::vector<std::string> const & names)
{
    std::string text;
    for (std::string const & name : names) {
        text += (text.empty() ? "" : std::string(1, Story::IndexTopic::NameSeparator)) + name;
    }
    return text;
}

/// A topic with its parents; new ones get the identity that their name has in every chapter.
Kernel::JailCounted<Story::IndexTopic> EnsureTopic(Story::Index & index, std::vector<std::string> const & names)
{
    Kernel::JailCounted<Story::IndexTopic> topic;
    for (std::size_t depth = 1; depth <= names.size(); ++depth) {
        std::string const full = JoinNames({names.begin(), names.begin() + static_cast<std::ptrdiff_t>(depth)});
        topic = index.EnsureTopic(String(full));
        if (!topic->HasGUID()) {
            topic->SetGUID(String(MakeTopicGuid(full)));
        }
    }
    return topic;
}

void FillIndex(Story::Index & index, std::vector<IndexMark> const & marks)
{
    for (IndexMark const & mark : marks) {
        auto const topic = EnsureTopic(index, mark.m_Topic);
        if (!mark.m_See.empty()) {
            topic->AddCrossReference(EnsureTopic(index, mark.m_See));
        }
    }
}

/// The publication's first document stands for it where somebody looks for a file. The others get a preview only where
/// they have had one: drawing it takes longer than setting the chapter.
void KeepPreview(DocumentController & document, bool isFirst)
{
    if (isFirst || document.GetDocumentCacheBitmap(0, false)) {
        document.KeepCacheBitmap();
    }
}

bool SaveDocument(DocumentController & document, fs::path const & path, std::string const & shownName,
                  MessageList & messages)
{
    DocumentSaveResult result;
    document.SaveDocument(result, String(path.string()));
    document.ShutDownArchive();
    if (!result.IsSuccess()) {
        messages.Error("document-unsaved", {shownName}, DescribeSaveFailure(result, path.string()));
    }
    return result.IsSuccess();
}

}

bool Importer::IsUsable(KnownChapter const & known) const
{
    fs::path const path = m_Work / known.m_Document;
    FileStamp const stamp = FileStamp::Of(path);
    if (!stamp.Exists() || stamp == known.m_DocumentStamp) {
        return stamp.Exists();
    }
    auto const document = Kernel::MakeCounted<DocumentController>();
    OpenDocumentFailedNotification failure(String(path.string()), false);
    return document->LoadDocument(String(path.string()), false, true, LoadWhole, nullptr, failure, false);
}

bool Importer::WriteDocument(Job & job, ChapterText const & chapter) const
{
    PlannedChapter const & planned = *job.m_Planned;
    fs::path const path = m_Work / job.m_Known.m_Document;
    auto const document = OpenOrMake(path, planned.m_Name, job.m_Messages);
    if (!document) {
        return false;
    }
    PictureLoader pictures(planned.m_Path, planned.m_Name, document->GetPictures(), job.m_Known.m_Pictures,
                           m_Passwords, job.m_Messages);
    StoryContext const context{planned.m_Name, m_Names, planned.m_Part, planned.m_Number,
                               [&](Picture const & picture) { return pictures.Load(picture); }};
    auto const story = StoryWriter(chapter, m_Look, context).Write();

    std::string author;
    for (std::string const & name : chapter.m_FrontMatter.m_Authors) {
        author += (author.empty() ? "" : ", ") + name;
    }
    document->ReplaceContent(SettingsFor(m_Plan, m_Look, job.m_Known.m_Title,
                                         author.empty() ? m_Plan.AuthorsAsText() : author,
                                         chapter.m_FrontMatter.m_Language),
                             story);
    FillIndex(*document->GetDocument()->GetIndex(), chapter.m_IndexMarks);
    bool const isFirst = !m_Plan.m_HasTitlePage && job.m_Planned == &m_Plan.m_Chapters.front();
    KeepPreview(*document, isFirst);
    bool const isSaved = SaveDocument(*document, path, planned.m_Name, job.m_Messages);
    job.m_Known.m_DocumentStamp = FileStamp::Of(path);
    return isSaved;
}

std::uint64_t Importer::FactsOfTitlePage() const
{
    std::string const facts =
        m_Plan.m_Title + '\0' + m_Plan.m_Subtitle + '\0' + m_Plan.AuthorsAsText() + '\0' + m_Plan.m_Language;
    return HashBytes(facts, m_Look.m_Hash);
}

bool Importer::WriteTitleDocument(std::vector<ImportedChapter> & chapters, MessageList & messages)
{
    fs::path const path = m_Work / "title-page.kvdoc";
    KnownChapter & known = m_State.m_Chapters[""];
    std::uint64_t const hash = FactsOfTitlePage();
    bool const isCurrent = known.m_Facts == hash && IsUsable(known);
    if (!isCurrent) {
        auto const document = OpenOrMake(path, "title page", messages);
        if (!document) {
            return false;
        }
        DocumentSettings settings =
            SettingsFor(m_Plan, m_Look, m_Plan.m_Title, m_Plan.AuthorsAsText(), m_Plan.m_Language);
        settings.m_Metadata.m_Subject = String(m_Plan.m_Subtitle);
        if (!m_Look.m_TitleMaster.empty()) {
            settings.m_PageSetup.m_FirstMaster = String(m_Look.m_TitleMaster);
        }
        // The leaf of the title page is its own: the first chapter begins on a right-hand page of the printed book.
        settings.m_PageSetup.m_ChapterStart = ChapterStart::RightPage;
        // Its pages count for nothing and show no number: the first chapter begins with page 1.
        DocumentSection::Values section;
        section.m_RestartPageNumbering = true;
        section.m_Format = PageNumberFormat::None;
        settings.m_Sections = {section};
        document->ReplaceContent(settings, WriteTitlePage(m_Plan.m_Title, m_Plan.m_Subtitle, m_Plan.AuthorsAsText()));
        KeepPreview(*document, true);
        if (!SaveDocument(*document, path, "title page", messages)) {
            return false;
        }
        known.m_Facts = hash;
        known.m_Title = m_Plan.m_Title;
        known.m_Document = "title-page.kvdoc";
        known.m_DocumentStamp = FileStamp::Of(path);
    }
    chapters.push_back({"", m_Plan.m_Title, path, !isCurrent});
    return true;
}

}
