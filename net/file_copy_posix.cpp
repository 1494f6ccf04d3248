#include "net/file_copy.h"

bool CopyFileWithProgress(const std::string& source, const std::string& destination, const CopyProgress& progress) {
    return CopyFileFrom(source, destination, 0, progress, false);
}
