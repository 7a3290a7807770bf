#include "app/NameChaptersCommand.h"

#include "core/BookController.h"
#include "core/BookNotification.h"

namespace App
{

Kernel::LocalisedString NameChaptersCommand::GetDescription() const
{
    return Kernel::LocalisedString("Name chapters", "Book Commands");
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
