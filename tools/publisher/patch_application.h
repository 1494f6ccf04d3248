#pragma once

#include <cstddef>
#include <string>

#include "patch/patch_applier.h"

// Applies the patch in patchDir ("patchinfo.xml" and its archives) to the
// installation in installDir the way the updater does: the archives are
// copied from their file:// locations into installDir's "tempPatch" while
// stage one prepares the files, then stage two applies them behind its
// progress record, stage one on up to workers workers. The work folders are
// removed at the end. Throws Exception when the patch cannot be applied.
void ApplyPatchFolder(const std::string& patchDir, const std::string& installDir,
                      size_t workers = DefaultStageOneWorkers());
