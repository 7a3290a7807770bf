// Random sequences of structure commands, on a real book of real files and on a plain list that says what they mean.

#ifdef KORVANE_HAS_RAPIDCHECK

#include "commands/AddChapterCommand.h"
#include "commands/DeleteChaptersCommand.h"
#include "commands/MoveChaptersCommand.h"
#include "commands/ReplaceChapterCommand.h"
#include "commands/SetKeyChapterCommand.h"
#include "core/BookCollection.h"
#include "core/BookNotification.h"
#include "support/BookBuilder.h"
#include "support/NotificationRecorder.h"

#include <algorithm>
#include <gtest/gtest.h>
#include <rapidcheck.h>
#include <sstream>

using namespace Book;
using Kernel::Counted;
using Kernel::MakeCounted;

namespace
{

/// A file that chapters are made of, and what its first section says.
struct File
{
    char const * m_Name;
    bool m_Exists;
    bool m_IsDefault;
    int m_Start;
};

constexpr File Files[] = {{"a", true, true, 1},  {"b", true, true, 1},  {"c", true, false, 5},
                          {"d", true, false, 2}, {"e", true, false, 9}, {"lost", false, true, 0}};
constexpr int FileCount = static_cast<int>(std::size(Files));

struct Entry
{
    int m_File;
    int m_Start = 0;
    bool m_IsKey = false;
    /// Tells an entry from another one of the same file.
    int m_Id = 0;
};

/// What the commands mean. Each gives what is told, in order.
class Model
{
public:
    using Told = std::vector<std::string>;
    std::vector<Entry> m_Entries;
    bool m_IsDirty = false;

    Told Add(int file, int before)
    {
        if (Find([&](Entry const & entry) { return entry.m_File == file; }) >= 0) {
            return {"Changed", "Structure -"};
        }
        std::size_t const at = before < 0 ? m_Entries.size() : static_cast<std::size_t>(before);
        Entry entry = Make(file);
        bool const adopts = Files[file].m_Exists && (!Files[file].m_IsDefault || at == 0);
        entry.m_Start = adopts ? Files[file].m_Start : 0;
        entry.m_IsKey = m_Entries.empty();
        m_Entries.insert(m_Entries.begin() + static_cast<std::ptrdiff_t>(at), entry);
        m_IsDirty = true;
        return {"Changed", std::string("Structure ") + Files[file].m_Name};
    }

    Told Remove(std::vector<int> const & ids)
    {
        Told told{"Changed"};
        for (int const id : ids) {
            int const place = PlaceOf(id);
            std::size_t const next = place < 0 ? m_Entries.size() : static_cast<std::size_t>(place) + 1;
            if (next >= m_Entries.size()) {
                break;
            }
            if (std::find(ids.begin(), ids.end(), m_Entries[next].m_Id) == ids.end()) {
                told.push_back(std::string("Structure ") + Files[m_Entries[next].m_File].m_Name);
                break;
            }
        }
        for (int const id : ids) {
            int const place = PlaceOf(id);
            if (place < 0) {
                continue;
            }
            bool const wasKey = m_Entries[static_cast<std::size_t>(place)].m_IsKey;
            m_Entries.erase(m_Entries.begin() + place);
            m_IsDirty = true;
            if (wasKey && !m_Entries.empty()) {
                MoveKey(m_Entries.front().m_Id);
            }
        }
        if (!m_Entries.empty()) {
            m_Entries.front().m_Start = Files[m_Entries.front().m_File].m_Start;
        }
        return told;
    }

    Told Move(int before, std::vector<int> const & ids)
    {
        auto const isMoved = [&](Entry const & entry) {
            return std::find(ids.begin(), ids.end(), entry.m_Id) != ids.end();
        };
        int const firstMoved = Find(isMoved);
        int const place = PlaceOf(before);
        bool const isTowardsFront = place >= 0 && !ids.empty() && (firstMoved < 0 || place < firstMoved);
        std::vector<Entry> rest = m_Entries;
        std::vector<Entry> block;
        bool areAllHere = true;
        for (int const id : ids) {
            auto const found =
                std::find_if(rest.begin(), rest.end(), [&](Entry const & entry) { return entry.m_Id == id; });
            if (found == rest.end()) {
                areAllHere = false;
                break;
            }
            block.push_back(*found);
            rest.erase(found);
        }
        if (areAllHere) {
            auto const at =
                std::find_if(rest.begin(), rest.end(), [&](Entry const & entry) { return entry.m_Id == before; });
            rest.insert(at, block.begin(), block.end());
            int const oldFirst = m_Entries.empty() ? -1 : m_Entries.front().m_Id;
            bool const beganAtOne = !m_Entries.empty() && m_Entries.front().m_Start == 1;
            m_Entries = rest;
            if (!m_Entries.empty() && m_Entries.front().m_Id != oldFirst && beganAtOne) {
                m_Entries.front().m_Start = 1;
                m_Entries[static_cast<std::size_t>(PlaceOf(oldFirst))].m_Start = 0;
            }
            m_IsDirty = true;
        }
        std::string from = "-";
        if (isTowardsFront) {
            from = m_Names[ids.front()];
        } else if (!m_Entries.empty()) {
            from = m_Names[m_Entries.front().m_Id];
        }
        return {"Changed", "Structure " + from};
    }

    Told Replace(int id, int file)
    {
        int const place = PlaceOf(id);
        if (place < 0) {
            return {"Changed", "Structure -"};
        }
        Entry entry = Make(file);
        entry.m_IsKey = m_Entries[static_cast<std::size_t>(place)].m_IsKey;
        m_Entries[static_cast<std::size_t>(place)] = entry;
        m_IsDirty = true;
        return {"Changed", std::string("Structure ") + Files[file].m_Name};
    }

    Told SetKey(int id)
    {
        int const old = KeyPlace();
        Told told{"Chapter " + m_Names[id]};
        if (old >= 0) {
            told.push_back("Chapter " + m_Names[m_Entries[static_cast<std::size_t>(old)].m_Id]);
        }
        MoveKey(id);
        return told;
    }

    [[nodiscard]] std::string Describe() const
    {
        std::ostringstream text;
        for (Entry const & entry : m_Entries) {
            text << Files[entry.m_File].m_Name << ':' << entry.m_Start << (entry.m_IsKey ? "*" : "") << ' ';
        }
        return text.str() + (m_IsDirty ? "dirty" : "clean");
    }

private:
    Entry Make(int file)
    {
        m_Names.push_back(Files[file].m_Name);
        return {file, 0, false, static_cast<int>(m_Names.size()) - 1};
    }
    template <typename TTest>
    [[nodiscard]] int Find(TTest const & test) const
    {
        auto const found = std::find_if(m_Entries.begin(), m_Entries.end(), test);
        return found == m_Entries.end() ? -1 : static_cast<int>(found - m_Entries.begin());
    }
    [[nodiscard]] int PlaceOf(int id) const
    {
        return Find([&](Entry const & entry) { return entry.m_Id == id; });
    }
    /// The flagged chapter whose file is there, or else the first whose file is there.
    [[nodiscard]] int KeyPlace() const
    {
        int const key = Find([](Entry const & entry) { return entry.m_IsKey && Files[entry.m_File].m_Exists; });
        return key >= 0 ? key : Find([](Entry const & entry) { return Files[entry.m_File].m_Exists; });
    }
    void MoveKey(int id)
    {
        if (int const old = KeyPlace(); old >= 0) {
            m_Entries[static_cast<std::size_t>(old)].m_IsKey = false;
        }
        if (int const place = PlaceOf(id); place >= 0) {
            m_Entries[static_cast<std::size_t>(place)].m_IsKey = true;
        }
        m_IsDirty = true;
    }

    /// By id, also of entries that have gone.
    struct Names : std::vector<std::string>
    {
        std::string const & operator[](int id) const { return at(static_cast<std::size_t>(id)); }
    } m_Names;
};

struct Step
{
    enum class Kind
    {
        Add,
        Remove,
        Move,
        Replace,
        SetKey
    };
    Kind m_Kind;
    int m_File;
    /// Places among all chapters that there ever were, so that some of them are no longer in the book; -1 is nobody.
    std::vector<int> m_Chapters;
    int m_Other;
};

std::ostream & operator<<(std::ostream & out, Step const & step)
{
    static constexpr char const * Names[] = {"add", "remove", "move", "replace", "key"};
    out << Names[static_cast<int>(step.m_Kind)] << " file " << Files[step.m_File].m_Name << " chapters";
    for (int const chapter : step.m_Chapters) {
        out << ' ' << chapter;
    }
    return out << " other " << step.m_Other;
}

rc::Gen<Step> AnyStep()
{
    // Numbers of full range, however short the sequences are.
    auto const number = [](int from, int to) { return rc::gen::resize(100, rc::gen::inRange(from, to)); };
    return rc::gen::build<Step>(
        rc::gen::set(&Step::m_Kind, rc::gen::weightedElement<Step::Kind>({{4, Step::Kind::Add},
                                                                         {2, Step::Kind::Remove},
                                                                         {3, Step::Kind::Move},
                                                                         {2, Step::Kind::Replace},
                                                                         {2, Step::Kind::SetKey}})),
        rc::gen::set(&Step::m_File, number(0, FileCount)),
        rc::gen::set(&Step::m_Chapters, rc::gen::resize(3, rc::gen::container<std::vector<int>>(number(0, 100)))),
        rc::gen::set(&Step::m_Other, number(-1, 100)));
}

/// The real book beside its model, with every chapter that there ever was.
class Comparison
{
public:
    Comparison(BookBuilder & builder, std::vector<String> const & paths)
        : m_Builder(builder), m_Paths(paths), m_Book(builder.NewBook())
    {
    }
    ~Comparison() { m_Builder.CloseBook(m_Book); }

    void Do(Step const & step)
    {
        m_Book->SetIsDirty(false);
        m_Model.m_IsDirty = false;
        m_Recorder.Clear();
        std::vector<int> ids;
        std::vector<Counted<BookChapter const>> chapters;
        for (int const wish : step.m_Chapters) {
            int const id = m_Chapters.empty() ? -1 : wish % static_cast<int>(m_Chapters.size());
            if (id >= 0 && std::find(ids.begin(), ids.end(), id) == ids.end()) {
                ids.push_back(id);
                chapters.push_back(Chapter(id));
            }
        }
        int const other = m_Chapters.empty() || step.m_Other < 0 ? -1 : step.m_Other % static_cast<int>(m_Chapters.size());
        Model::Told told;
        Counted<BookCommand> command;
        switch (step.m_Kind) {
        case Step::Kind::Add:
            command = MakeCounted<AddChapterCommand>(std::vector<String>{Path(step.m_File)}, Chapter(other));
            told = m_Model.Add(step.m_File, m_Book->IndexFromChapter(Chapter(other)));
            break;
        case Step::Kind::Remove:
            command = MakeCounted<DeleteChaptersCommand>(chapters);
            told = m_Model.Remove(ids);
            break;
        case Step::Kind::Move:
            command = MakeCounted<MoveChaptersCommand>(Chapter(other), chapters);
            told = m_Model.Move(other, ids);
            break;
        case Step::Kind::Replace:
            // A path is in a book once; commands leave it to their callers to see to that.
            if (ids.empty() || m_Book->ContainsChapter(Path(step.m_File))) {
                return;
            }
            command = MakeCounted<ReplaceChapterCommand>(chapters[0], Path(step.m_File));
            told = m_Model.Replace(ids[0], step.m_File);
            break;
        case Step::Kind::SetKey:
            if (ids.empty()) {
                return;
            }
            command = MakeCounted<SetKeyChapterCommand>(chapters[0]);
            told = m_Model.SetKey(ids[0]);
            break;
        }
        BookBuilder::Run(m_Book, command);
        NoteNewChapters();
        RC_ASSERT(Describe() == m_Model.Describe());
        RC_ASSERT(Told() == told);
        CheckLookUps();
    }

private:
    [[nodiscard]] String const & Path(int file) const { return m_Paths[static_cast<std::size_t>(file)]; }
    [[nodiscard]] Counted<BookChapter const> Chapter(int id) const
    {
        return id < 0 ? nullptr : m_Chapters[static_cast<std::size_t>(id)];
    }

    /// Real chapters get their numbers in the order in which the model gives them.
    void NoteNewChapters()
    {
        BookController::ConstChapterList all;
        m_Book->GetChapters(all);
        for (auto const & chapter : all) {
            if (std::find(m_Chapters.begin(), m_Chapters.end(), chapter) == m_Chapters.end()) {
                m_Chapters.push_back(chapter);
            }
        }
    }
    [[nodiscard]] std::string Describe() const
    {
        std::ostringstream text;
        BookController::ConstChapterList all;
        m_Book->GetChapters(all);
        for (auto const & chapter : all) {
            text << chapter->GetName().ToStd() << ':' << chapter->GetStartFromPage() << (chapter->IsKey() ? "*" : "")
                 << ' ';
        }
        return text.str() + (m_Book->IsDirty() ? "dirty" : "clean");
    }
    [[nodiscard]] Model::Told Told()
    {
        Model::Told told;
        for (auto const & notification : m_Recorder.All<BookNotification>()) {
            if (auto const structure = Kernel::CountedCast<BookStructureChangedNotification>(notification)) {
                told.push_back("Structure " + NameOf(structure->GetChapter()));
            } else if (auto const changed = Kernel::CountedCast<ChapterChangedNotification>(notification)) {
                told.push_back("Chapter " + NameOf(changed->GetChapters().at(0)));
            } else {
                told.push_back("Changed");
            }
        }
        return told;
    }
    static std::string NameOf(Counted<BookChapter const> const & chapter)
    {
        return chapter ? chapter->GetName().ToStd() : "-";
    }
    /// The look-ups agree with the list, from both sides.
    void CheckLookUps() const
    {
        BookController::ConstChapterList all;
        m_Book->GetChapters(all);
        RC_ASSERT(m_Book->ChapterCount() == static_cast<int>(all.size()));
        for (std::size_t index = 0; index < all.size(); ++index) {
            RC_ASSERT(m_Book->IndexFromChapter(all[index]) == static_cast<int>(index));
            RC_ASSERT(m_Book->GetMutableChapter(all[index]) == all[index]);
            RC_ASSERT(Counted<BookChapter const>(m_Book->GetChapterFromPath(all[index]->GetPath())) == all[index]);
            BookController::ConstChapterList after;
            m_Book->GetChaptersAfter(after, all[index]);
            RC_ASSERT(after.size() == all.size() - index - 1);
            RC_ASSERT(m_Book->GetNextChapter(all[index]) == (after.empty() ? nullptr : after[0]));
            RC_ASSERT(m_Book->GetPreviousChapter(all[index]) == (index == 0 ? nullptr : all[index - 1]));
        }
        for (auto const & chapter : m_Chapters) {
            bool const isHere = std::find(all.begin(), all.end(), chapter) != all.end();
            RC_ASSERT(static_cast<bool>(m_Book->GetMutableChapter(chapter)) == isHere);
        }
    }

    BookBuilder & m_Builder;
    std::vector<String> const & m_Paths;
    Counted<BookController> const m_Book;
    NotificationRecorder m_Recorder;
    Model m_Model;
    std::vector<Counted<BookChapter const>> m_Chapters;
};

}

TEST(BookModelTest, CommandsInAnyOrderDoAndTellWhatTheListSays)
{
    BookCollection::GetInstance().SetUpdatePageNumbersAutomatically(false);
    {
        BookBuilder builder;
        std::vector<String> paths;
        for (File const & file : Files) {
            std::string const name = std::string(file.m_Name) + ".kvdoc";
            ChapterSketch sketch;
            sketch.m_Section.m_StartNumberingAt = static_cast<unsigned int>(file.m_Start);
            sketch.m_Section.m_RestartPageNumbering = !file.m_IsDefault;
            paths.push_back(file.m_Exists ? builder.WriteChapter(name, sketch) : builder.GetFolder() / name);
        }
        EXPECT_TRUE(rc::check("a book follows its model", [&] {
            auto const steps = *rc::gen::resize(20, rc::gen::container<std::vector<Step>>(AnyStep()));
            Comparison comparison(builder, paths);
            for (Step const & step : steps) {
                comparison.Do(step);
            }
        }));
    }
    BookCollection::GetInstance().SetUpdatePageNumbersAutomatically(true);
}

#endif
