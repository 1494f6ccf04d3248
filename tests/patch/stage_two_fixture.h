#pragma once

#include <map>
#include <string>

// A stage-two batch on real folders that needs no archives: the prepared
// files are put straight into the patched-files folder, as stage one would
// have left them. The batch deletes files and folders, deletes a folder and
// creates it anew under the same name, creates nested folders, and moves
// replacements and new files in.
struct StageTwoBatch {
    std::string installation;  // the game's folder (also holds PPF.xml)
    std::string patchFolder;   // installation/tempPatch
    std::string patchedFiles;  // patchFolder/patched
    std::string patchInfo;     // patchFolder/patchinfo.xml
};

// Where the batch keeps the installed version ("1", "-1" while stage two
// works, "2" when done).
constexpr char kVersionFile[] = "version";

// Lays the batch out below root (which must exist and be empty).
StageTwoBatch MakeStageTwoBatch(const std::string& root);

// Runs stage two as the updater does: a fresh record before the batch (or
// the recovered one when a record is there), the applier, and the record
// removed at the end. An exception thrown by view (a simulated crash) ends
// the run early and gives false.
class IStatusView;
bool RunStageTwo(const StageTwoBatch& batch, IStatusView* view);

// Number of recorded actions (deletions and folder actions) in the batch.
int StageTwoActionCount();

// Relative path (with '/') to content of every file, and "<dir>" for every
// folder, below folder, leaving out the updater's tempPatch folder and the
// version file.
std::map<std::string, std::string> ListTree(const std::string& folder);

// The installation as the finished batch leaves it (without tempPatch).
std::map<std::string, std::string> ExpectedTree();
