#include "tests/net/download_test_helpers.h"

std::string UncFormOf(const std::string& absolutePath) { return "/" + absolutePath; }

std::string AbsoluteLocation() { return "/patches/a.bin"; }

bool PlatformCopyReportsProgress() { return true; }
