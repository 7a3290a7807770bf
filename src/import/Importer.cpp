#include "import/Importer.h"

#include "import/LinkTarget.h"
#include "import/MarkdownReader.h"
#include "import/SourceText.h"
#include "import/Text.h"

#include <algorithm>
#include <set>
#include <thread>

namespace Import
{

namespace fs = std::filesystem;

namespace
{

/// Raised whenever the importer makes another document from the same sources.
constexpr std::uint64_t g_Generation = 2;
constexpr std::size_t g_Threads = 2;

/// Mixes facts into one number; the order counts.
class FactHash
{
public:
    FactHash & Add(std::string_view text)
    {
        m_Hash = HashBytes(text, m_Hash * 31 + 1);
        return *this;
    }
    FactHash & Add(std::uint64_t number)
    {
        return Add(std::string_view(reinterpret_cast<char const *>(&number), sizeof number));
    }
    [[nodiscard]] std::uint64_t Get() const { return m_Hash; }

private:
    std::uint64_t m_Hash = g_Generation;
};

std::string DocumentNameFor(std::string name)
{
    if (std::size_t const dot = name.find_last_of("./"); std::string::npos != dot && '.' == name[dot]) {
        name.resize(dot);
    }
    for (char & c : name) {
        c = '/' == c || '\\' == c ? '-' : c;
    }
    while (name.starts_with('.')) {
        name.erase(0, 1);
    }
    // File systems take 255 bytes at most, and a save needs room for an ending of its own.
    if (180 < name.size()) {
        std::size_t cut = 180;
        while (0x80 == (static_cast<unsigned char>(name[cut]) & 0xC0)) {
            --cut;
        }
        name.resize(cut);
    }
    return name.empty() ? "chapter" : name;
}

}

Importer::Importer(BookPlan const & plan, Template const & look, fs::path work, std::atomic<bool> const * abort)
    : m_Plan(plan),
      m_Look(look),
      m_Work(std::move(work)),
      m_Abort(abort),
      m_State(WorkState::Load(m_Work))
{
    for (PlannedChapter const & chapter : plan.m_Chapters) {
        m_Names.push_back(chapter.m_Name);
    }
    std::sort(m_Names.begin(), m_Names.end());
}

std::uint64_t Importer::FactsOf(PlannedChapter const & chapter) const
{
    FactHash hash;
    hash.Add(m_Look.m_Hash)
        .Add(m_Plan.m_Title)
        .Add(m_Plan.m_Language)
        .Add(m_Plan.m_Smart ? 1 : 0)
        .Add(m_Plan.AuthorsAsText());
    hash.Add(chapter.m_Name).Add(chapter.m_Title).Add(chapter.m_Part).Add(chapter.m_Number);
    return hash.Get();
}

std::uint64_t Importer::FactsOfLinks(PlannedChapter const & chapter, std::vector<KnownLink> const & links) const
{
    // Which chapter a link means depends on what chapters there are.
    FactHash hash;
    for (KnownLink const & link : links) {
        LinkTarget const target = ReadLinkTarget(link.m_Target, chapter.m_Name, m_Names);
        if (LinkTarget::Kind::Chapter == target.m_Kind) {
            hash.Add(target.m_Chapter);
        } else {
            hash.Add(static_cast<std::uint64_t>(target.m_Kind));
        }
    }
    return hash.Get();
}

bool Importer::IsCurrent(Job & job, std::uint64_t facts) const
{
    KnownChapter & known = job.m_Known;
    if (known.m_Facts != (facts ^ FactsOfLinks(*job.m_Planned, known.m_Links)) || !IsUsable(known) ||
        !IsUnchanged(job.m_Planned->m_Path, known.m_Source, m_State.m_Saved)) {
        return false;
    }
    for (auto & [path, file] : known.m_Pictures) {
        if (!IsUnchanged(path, file, m_State.m_Saved)) {
            return false;
        }
    }
    return true;
}

void Importer::Import(Job & job, std::uint64_t facts) const
{
    PlannedChapter const & planned = *job.m_Planned;
    KnownChapter & known = job.m_Known;
    // Looked at before it is read: a change in between shows in the next run.
    known.m_Source = LookAt(planned.m_Path);
    auto const text = ReadSourceText(planned.m_Path, planned.m_Name, job.m_Messages);
    if (!text) {
        return;
    }

    ChapterText const chapter =
        ReadMarkdown(*text, {planned.m_Name, m_Plan.m_Language, m_Plan.m_Smart}, job.m_Messages);
    known.m_Title = chapter.Title();
    if (known.m_Title.empty()) {
        known.m_Title = planned.m_Title.empty() ? fs::path(planned.m_Name).stem().string() : planned.m_Title;
    }
    known.m_Anchors.clear();
    for (Anchor const & anchor : chapter.m_Anchors) {
        known.m_Anchors.push_back(anchor.m_Id);
    }
    known.m_Links.clear();
    std::set<std::string_view> seen;
    for (Link const & link : chapter.m_Links) {
        if (seen.insert(link.m_Target).second) {
            known.m_Links.push_back({link.m_Target, link.m_Line});
        }
    }
    known.m_Facts = facts ^ FactsOfLinks(planned, known.m_Links);
    known.m_Pictures.clear();
    job.m_IsFresh = true;
    job.m_IsUsable = WriteDocument(job, chapter);
    known.m_Messages = job.m_Messages.All();
}

void Importer::RunJob(Job & job) const
{
    std::uint64_t const facts = FactsOf(*job.m_Planned);
    if (IsCurrent(job, facts)) {
        job.m_IsUsable = true;
        for (Message const & message : job.m_Known.m_Messages) {
            job.m_Messages.Add(message.m_Severity, message.m_Kind, message.m_Place, message.m_Text);
        }
        return;
    }
    Import(job, facts);
}

void Importer::NameDocuments(std::vector<Job> & jobs) const
{
    std::set<std::string> taken{"title-page.kvdoc"};
    for (Job const & job : jobs) {
        if (!job.m_Known.m_Document.empty()) {
            taken.insert(job.m_Known.m_Document);
        }
    }
    for (Job & job : jobs) {
        if (!job.m_Known.m_Document.empty()) {
            continue;
        }
        std::string const base = DocumentNameFor(job.m_Planned->m_Name);
        std::string name = base + ".kvdoc";
        for (int number = 2; !taken.insert(name).second; ++number) {
            name = base + "-" + std::to_string(number) + ".kvdoc";
        }
        job.m_Known.m_Document = name;
    }
}

void Importer::CheckLinks(std::vector<Job> & jobs, MessageList & messages) const
{
    std::map<std::string, std::set<std::string_view>> anchors;
    for (Job const & job : jobs) {
        auto & set = anchors[job.m_Planned->m_Name];
        set.insert(job.m_Known.m_Anchors.begin(), job.m_Known.m_Anchors.end());
    }
    for (Job const & job : jobs) {
        std::string const & name = job.m_Planned->m_Name;
        for (KnownLink const & link : job.m_Known.m_Links) {
            LinkTarget const target = ReadLinkTarget(link.m_Target, name, m_Names);
            Place const place{name, link.m_Line};
            if (LinkTarget::Kind::Unknown == target.m_Kind) {
                messages.Warn("link-file", place,
                              Text("The link to %1 leads to no chapter of the book; its text is set without a link.",
                                   "Source", link.m_Target));
            } else if (LinkTarget::Kind::Chapter == target.m_Kind && !target.m_Id.empty() &&
                       !anchors[target.m_Chapter].contains(target.m_Id)) {
                messages.Warn("link-anchor", place,
                              Text("The link to %1 leads nowhere: %2 has no anchor #%3.", "Source", link.m_Target,
                                   target.m_Chapter, target.m_Id));
            }
        }
    }
}

std::vector<Importer::Job> Importer::MakeJobs() const
{
    std::vector<Job> jobs(m_Plan.m_Chapters.size());
    for (std::size_t at = 0; at < jobs.size(); ++at) {
        jobs[at].m_Planned = &m_Plan.m_Chapters[at];
        if (auto const known = m_State.m_Chapters.find(jobs[at].m_Planned->m_Name); known != m_State.m_Chapters.end()) {
            jobs[at].m_Known = known->second;
        }
    }
    return jobs;
}

bool Importer::IsEverythingCurrent(MessageList & messages)
{
    auto const isTouched = [this](KnownChapter const & known) {
        return known.m_Document.empty() || !known.m_DocumentStamp.Exists() ||
               known.m_DocumentStamp != FileStamp::Of(m_Work / known.m_Document);
    };
    if (m_Plan.m_HasTitlePage) {
        auto const title = m_State.m_Chapters.find("");
        if (title == m_State.m_Chapters.end() || title->second.m_Facts != FactsOfTitlePage() ||
            isTouched(title->second)) {
            return false;
        }
    }
    std::vector<Job> jobs = MakeJobs();
    for (Job & job : jobs) {
        if (isTouched(job.m_Known) || !IsCurrent(job, FactsOf(*job.m_Planned))) {
            return false;
        }
    }
    for (Job const & job : jobs) {
        for (Message const & message : job.m_Known.m_Messages) {
            messages.Add(message.m_Severity, message.m_Kind, message.m_Place, message.m_Text);
        }
    }
    CheckLinks(jobs, messages);
    return true;
}

bool Importer::Run(std::vector<ImportedChapter> & chapters, MessageList & messages, Progress const & progress)
{
    std::error_code error;
    fs::create_directories(m_Work, error);
    if (error || !fs::is_directory(m_Work, error)) {
        messages.Error("work-folder", {m_Work.string()},
                       Text("The work folder cannot be made: %1.", "Source", error.message()));
        return false;
    }

    std::vector<Job> jobs = MakeJobs();
    NameDocuments(jobs);
    if (m_Plan.m_HasTitlePage && !WriteTitleDocument(chapters, messages)) {
        return false;
    }

    std::atomic<std::size_t> next = 0;
    std::mutex progressLock;
    int done = 0;
    auto const work = [&] {
        for (std::size_t at = next++; at < jobs.size() && !IsAborted(); at = next++) {
            RunJob(jobs[at]);
            std::lock_guard const lock(progressLock);
            if (progress) {
                progress(++done, static_cast<int>(jobs.size()));
            }
        }
    };
    {
        std::vector<std::jthread> helpers;
        for (std::size_t thread = 1; thread < std::min(g_Threads, jobs.size()); ++thread) {
            helpers.emplace_back(work);
        }
        work();
    }

    bool const isWhole = !IsAborted();
    for (Job & job : jobs) {
        for (Message const & message : job.m_Messages.All()) {
            messages.Add(message.m_Severity, message.m_Kind, message.m_Place, message.m_Text);
        }
        if (job.m_IsUsable) {
            chapters.push_back(
                {job.m_Planned->m_Name, job.m_Known.m_Title, m_Work / job.m_Known.m_Document, job.m_IsFresh});
            m_State.m_Chapters[job.m_Planned->m_Name] = job.m_Known;
        }
    }
    if (isWhole) {
        CheckLinks(jobs, messages);
        std::erase_if(m_State.m_Chapters, [&](auto const & entry) {
            return !std::binary_search(m_Names.begin(), m_Names.end(), entry.first) && !entry.first.empty();
        });
    }
    std::string problem;
    if (!m_State.Save(m_Work, problem)) {
        messages.Error("work-folder", {m_Work.string()},
                       Text("The work folder cannot be written: %1.", "Source", problem));
        return false;
    }
    return isWhole;
}

}
