#pragma once

#include <string>

// Removes what a patch leaves in its work folders: the patched-files folder
// with everything in it, then in the patch folder every file whose name
// begins with "diff", "patch" or "tmp_" (archives, the description, the
// extracted delta) and the half-written replacements of the work files,
// then the patch folder itself when that left it empty. With keepDownloads,
// the archives the downloader keeps for a later run (and its records of
// them) stay; without, they go too. Every failure is ignored.
void CleanTemporaryFiles(const std::string& patchDir, const std::string& patchedDir, bool keepDownloads = false);

// What a run that did not reach stage two, or finished it, may have left for
// the next start: the work folders' contents as above, and the half-written
// replacements of the installation's records.
void RemoveLeftovers(const std::string& installDir, const std::string& patchDir, const std::string& patchedDir,
                     bool keepDownloads);
