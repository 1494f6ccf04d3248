#pragma once

#include <cstdint>

// The overall progress (0..1000) while archives are fetched: each of the
// totalFiles archives owns an equal share; the doneFiles complete ones fill
// theirs, and the one being fetched fills the part of its share that
// bytesDone is of bytesTotal. No archives to fetch counts as complete.
int32_t OverallProgress(int32_t doneFiles, int32_t totalFiles, uint32_t bytesDone, uint32_t bytesTotal);
