#pragma once

#include "commands/BookCommand.h"

#include <map>

namespace App
{

/// Gives chapters the names that people know them by, in place of those of their files. Chapters that are not named
/// here keep theirs.
class NameChaptersCommand : public Book::BookCommand
{
public:
    /// Names by the paths of the chapters' files.
    explicit NameChaptersCommand(std::map<String, String> names) : m_Names(std::move(names)) {}

    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;
    void Do() override;
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications) override;

private:
    std::map<String, String> m_Names;
    std::vector<Kernel::Counted<Book::BookChapter const>> m_Changed;
};

}
