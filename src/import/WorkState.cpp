#include "import/WorkState.h"

#include "import/SourceText.h"

#include <cerrno>
#include <chrono>
#include <cstring>
#include <fcntl.h>
#include <fstream>
#include <nlohmann/json.hpp>
#include <sys/stat.h>
#include <unistd.h>

namespace Import
{

namespace
{

using Json = nlohmann::json;

/// Raised whenever a document made by an older program should be made anew.
constexpr int g_Version = 1;
constexpr char const * g_FileName = "import.json";

Json ToJson(FileStamp const & stamp)
{
    return {stamp.m_Size, stamp.m_Modified, stamp.m_Changed, stamp.m_Inode};
}

FileStamp StampFrom(Json const & json)
{
    return {json.at(0), json.at(1), json.at(2), json.at(3)};
}

Json ToJson(KnownFile const & file)
{
    return {{"stamp", ToJson(file.m_Stamp)}, {"hash", file.m_Hash}};
}

KnownFile FileFrom(Json const & json)
{
    return {StampFrom(json.at("stamp")), json.at("hash")};
}

Json ToJson(Message const & message)
{
    return {static_cast<int>(message.m_Severity),
            message.m_Kind,
            message.m_Place.m_File,
            message.m_Place.m_Line,
            message.m_Place.m_Column,
            message.m_Text};
}

Message MessageFrom(Json const & json)
{
    return {static_cast<Severity>(json.at(0).get<int>()), json.at(1), {json.at(2), json.at(3), json.at(4)}, json.at(5)};
}

Json ToJson(KnownChapter const & chapter)
{
    Json pictures = Json::object();
    for (auto const & [path, file] : chapter.m_Pictures) {
        pictures[path] = ToJson(file);
    }
    Json links = Json::array();
    for (KnownLink const & link : chapter.m_Links) {
        links.push_back({link.m_Target, link.m_Line});
    }
    Json messages = Json::array();
    for (Message const & message : chapter.m_Messages) {
        messages.push_back(ToJson(message));
    }
    return {{"document", chapter.m_Document},
            {"title", chapter.m_Title},
            {"facts", chapter.m_Facts},
            {"source", ToJson(chapter.m_Source)},
            {"pictures", pictures},
            {"anchors", chapter.m_Anchors},
            {"links", links},
            {"messages", messages},
            {"documentStamp", ToJson(chapter.m_DocumentStamp)}};
}

KnownChapter ChapterFrom(Json const & json)
{
    KnownChapter chapter;
    chapter.m_Document = json.at("document");
    chapter.m_Title = json.at("title");
    chapter.m_Facts = json.at("facts");
    chapter.m_Source = FileFrom(json.at("source"));
    for (auto const & [path, file] : json.at("pictures").items()) {
        chapter.m_Pictures.emplace(path, FileFrom(file));
    }
    chapter.m_Anchors = json.at("anchors").get<std::vector<std::string>>();
    for (Json const & link : json.at("links")) {
        chapter.m_Links.push_back({link.at(0), link.at(1)});
    }
    for (Json const & message : json.at("messages")) {
        chapter.m_Messages.push_back(MessageFrom(message));
    }
    chapter.m_DocumentStamp = StampFrom(json.at("documentStamp"));
    return chapter;
}

std::int64_t Nanoseconds(timespec const & time)
{
    return static_cast<std::int64_t>(time.tv_sec) * 1'000'000'000 + time.tv_nsec;
}

}

FileStamp FileStamp::Of(std::filesystem::path const & path)
{
    struct stat facts
    {
    };
    if (0 != stat(path.c_str(), &facts) || !S_ISREG(facts.st_mode)) {
        return {};
    }
    return {facts.st_size, Nanoseconds(facts.st_mtim), Nanoseconds(facts.st_ctim), facts.st_ino};
}

KnownFile LookAt(std::filesystem::path const & path)
{
    KnownFile file;
    file.m_Stamp = FileStamp::Of(path);
    if (!file.m_Stamp.Exists()) {
        return file;
    }
    std::ifstream stream(path, std::ios::binary);
    std::string const bytes{std::istreambuf_iterator<char>(stream), {}};
    file.m_Hash = stream.bad() || !stream.is_open() ? 0 : HashBytes(bytes);
    return file;
}

bool IsUnchanged(std::filesystem::path const & path, KnownFile & known, std::int64_t seen)
{
    FileStamp const stamp = FileStamp::Of(path);
    if (stamp == known.m_Stamp && (!stamp.Exists() || stamp.IsTrustworthy(seen))) {
        return true;
    }
    KnownFile const now = LookAt(path);
    if (now.m_Hash != known.m_Hash || now.m_Stamp.Exists() != known.m_Stamp.Exists()) {
        return false;
    }
    known.m_Stamp = now.m_Stamp;
    return true;
}

WorkState WorkState::Load(std::filesystem::path const & folder)
{
    WorkState state;
    std::ifstream stream(folder / g_FileName, std::ios::binary);
    if (!stream) {
        return state;
    }
    try {
        Json const json = Json::parse(stream);
        if (g_Version != json.at("version").get<int>()) {
            return state;
        }
        state.m_Saved = json.at("saved");
        state.m_OutputFacts = json.at("outputFacts");
        state.m_OutputFile = json.at("outputFile");
        state.m_OutputStamp = StampFrom(json.at("outputStamp"));
        state.m_BookStamp = StampFrom(json.at("bookStamp"));
        state.m_Pages = json.at("pages");
        for (auto const & [name, chapter] : json.at("chapters").items()) {
            state.m_Chapters.emplace(name, ChapterFrom(chapter));
        }
    } catch (Json::exception const &) {
        // A damaged memory is no memory: everything is imported again.
        return {};
    }
    return state;
}

bool WorkState::Save(std::filesystem::path const & folder, std::string & problem)
{
    m_Saved = std::chrono::duration_cast<std::chrono::nanoseconds>(std::chrono::system_clock::now().time_since_epoch())
                  .count();
    Json chapters = Json::object();
    for (auto const & [name, chapter] : m_Chapters) {
        chapters[name] = ToJson(chapter);
    }
    Json const json{{"version", g_Version},
                    {"saved", m_Saved},
                    {"outputFacts", m_OutputFacts},
                    {"outputFile", m_OutputFile},
                    {"outputStamp", ToJson(m_OutputStamp)},
                    {"bookStamp", ToJson(m_BookStamp)},
                    {"pages", m_Pages},
                    {"chapters", chapters}};
    std::string const text = json.dump(-1, ' ', false, Json::error_handler_t::replace);
    std::filesystem::path const target = folder / g_FileName;
    std::filesystem::path const beside = folder / (std::string(g_FileName) + ".new");
    int const file = open(beside.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0666);
    bool isGood = 0 <= file;
    for (std::size_t at = 0; isGood && at < text.size();) {
        ssize_t const step = write(file, text.data() + at, text.size() - at);
        isGood = 0 < step || (step < 0 && EINTR == errno);
        at += 0 < step ? static_cast<std::size_t>(step) : 0;
    }
    if (!isGood) {
        problem = std::strerror(errno);
    }
    if (0 <= file && 0 != close(file) && isGood) {
        problem = std::strerror(errno);
        isGood = false;
    }
    if (isGood && 0 != rename(beside.c_str(), target.c_str())) {
        problem = std::strerror(errno);
        isGood = false;
    }
    if (!isGood) {
        unlink(beside.c_str());
    }
    return isGood;
}

}
