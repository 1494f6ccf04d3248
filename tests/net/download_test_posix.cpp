#include <string>

// Two leading slashes make a UNC location here.
std::string UncFormOf(const std::string& absolutePath) { return "/" + absolutePath; }

bool PlatformCopyReportsProgress() { return true; }
