#include "app/version_text.h"

const char* const kPatchBaseVersion = "515195";

std::string PatchName(const std::string& baseVersion, const std::string& latestVersion) {
    return "patch_" + baseVersion + "_" + latestVersion;
}

std::string BuildName(const std::string& latestVersion) { return "build_" + latestVersion; }
