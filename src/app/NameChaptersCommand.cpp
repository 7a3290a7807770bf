#include "app/NameChaptersCommand.h"

#include "core/BookController.h"
#include "core/BookNotification.h"

namespace App
{

Kernel::LocalisedString NameChaptersCommand::GetDescription() const
{
    constexpr char text[] = "Name chapters";
    constexpr char context[] = "Book Commands";
    return Kernel::LocalisedString(text, sizeof text - 1, context, sizeof context - 1);
}

void NameChaptersCommand::Do()
{
    auto const book = GetBookController();
    for (auto const & [path, name] : m_Names) {
        auto const chapter = book->GetChapterFromPath(path);
        if (chapter && chapter->GetName() != name) {
            chapter->SetName(name);
            book->SetIsDirty(true);
            m_Changed.emplace_back(chapter);
        }
    }
}

void NameChaptersCommand::Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications)
{
    if (!m_Changed.empty()) {
        Tell<Book::ChapterChangedNotification>(notifications, m_Changed);
    }
}

}
