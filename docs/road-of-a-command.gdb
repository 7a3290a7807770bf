# Prints the stations of docs/road-of-a-command.md as a command passes them, each with the thread that it is on:
#
#     gdb -q -x docs/road-of-a-command.gdb --args build/release/src/app/korvane add BOOK.kvbook CHAPTER.kvdoc
#
# To stop at one and look around, write "break" in place of "dprintf" and leave out what follows the name.

set pagination off
set print thread-events off
# The library is loaded by then, and its names are known.
break main
run
delete

dprintf Book::BookCollection::EnqueueCommand,        "[%d] BookCollection::EnqueueCommand\n", $_thread
dprintf Book::BookCollection::EnqueueCommandAndWait, "[%d] BookCollection::EnqueueCommandAndWait\n", $_thread
dprintf DomainController::PerformCommand,            "[%d] DomainController::PerformCommand\n", $_thread
dprintf Book::AddChapterCommand::Do,                 "[%d]   AddChapterCommand::Do\n", $_thread
dprintf Book::BookController::AddChapter,            "[%d]     BookController::AddChapter\n", $_thread
dprintf Book::BookController::LoadChapterDocument,   "[%d]       BookController::LoadChapterDocument\n", $_thread
dprintf DocumentController::LoadDocument,            "[%d]         DocumentController::LoadDocument\n", $_thread
dprintf Book::BookController::ReleaseChapterDocument, "[%d]       BookController::ReleaseChapterDocument\n", $_thread
dprintf Book::AddChapterCommand::Notify,             "[%d]   AddChapterCommand::Notify\n", $_thread
dprintf Book::BookCollection::UpdatePageNumbers,     "[%d] BookCollection::UpdatePageNumbers\n", $_thread
dprintf Book::UpdateNumbersCommand::Do,              "[%d]   UpdateNumbersCommand::Do\n", $_thread
dprintf VantraController::WaitUntilIdle,             "[%d] VantraController::WaitUntilIdle\n", $_thread

continue
quit
