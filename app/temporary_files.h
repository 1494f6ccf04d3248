#pragma once

#include <string>

// Removes what a patch leaves in its work folders: the patched-files folder
// with everything in it, then in the patch folder every file whose name
// begins with "diff", "patch" or "tmp_" (archives, the description, the
// extracted delta), then the patch folder itself when that left it empty.
// With keepDownloads, the archives the downloader keeps for a later run
// (and its records of them) stay; without, they go too. Every failure is
// ignored.
void CleanTemporaryFiles(const std::string& patchDir, const std::string& patchedDir, bool keepDownloads = false);
