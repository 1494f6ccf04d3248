#include "base/file_journal.h"

#include <atomic>

namespace {

std::atomic<IFileJournal*> journal{nullptr};

}  // namespace

void SetFileJournal(IFileJournal* value) { journal = value; }

IFileJournal* GetFileJournal() { return journal; }
