#pragma once

#include "commands/BookCommand.h"
#include "framework/kernel/Counted.h"

namespace Story
{
class Index;
}

namespace Book
{

/// Makes a chapter's topic tree the book's master index and brings the other open chapters in step with it.
class SetMasterIndexCommand : public BookCommand
{
    KORVANE_BOOK_COMMAND(SetMasterIndexCommand);

public:
    explicit SetMasterIndexCommand(Kernel::Counted<Story::Index const> index);

    Kernel::LocalisedString GetDescription() const override;
    void Do() override;

protected:
    SetMasterIndexCommand();

private:
    Kernel::Counted<Story::Index const> m_Index;
};

}
