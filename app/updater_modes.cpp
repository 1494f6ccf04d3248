// The three modes the game's uninstaller calls: removal of a download-
// manager component, of the player's saved games and settings, and the
// clean-up that removes what the uninstall record lists.
#include "app/temporary_files.h"
#include "app/updater.h"
#include "base/exception.h"
#include "base/file_operations.h"
#include "base/log.h"
#include "base/paths.h"
#include "base/record_names.h"
#include "state/processes.h"
#include "text/localization.h"
#include "ui/message_box.h"
#include "uninstall/uninstaller.h"

namespace {

// The product key the three modes work on, whatever the configuration.
const char* const kProductKey = "SOFTWARE\\Halvard\\Ironvale";

}  // namespace

// The component is found in the installation folder (never relative to
// wherever the program was started from); the game's own executable
// removes it.
int32_t Updater::RunComponentRemoval(const UpdaterArguments& args) {
    registryKeyPath = kProductKey;
    registry.Locate(registryKeyPath, args.sid);
    const std::string folder = registry.GetInstallDir();
    if (folder.empty()) return 1;
    const std::string component = PathJoin(folder, "corvid.dll");
    if (!FileExists(component)) return 1;
    RunProcess(PathJoin(folder, configuration.GetGameExecutable()),
               args.silent ? "-kdl_gl_remove -silent" : "-kdl_gl_remove", true);
    if (args.deleteCorvid) DiscardFile(component);
    return 1;
}

int32_t Updater::RunSettingsRemoval() {
    MessageBoxRequest question;
    question.text = Localize("INSTALLER_REMOVE_SAVES_AND_SETTINGS");
    question.caption = Localize("INSTALLER_GAME_NAME") + L" - " + Localize("INSTALLER_DIALOG_UNINSTALL");
    question.buttons = MessageButtons::YesNo;
    question.icon = MessageIcon::Question;
    question.systemModal = true;
    if (ShowMessageBox(question) == MessageAnswer::Yes) {
        const std::string documents = GetDocumentsFolder();
        if (!documents.empty()) DiscardDirectory(PathJoin(documents, "Ironvale"));
    }
    return 1;
}

int32_t Updater::RunUninstallCleanup() {
    registryKeyPath = kProductKey;
    registry.Locate(registryKeyPath, arguments.sid);
    const std::string folder = registry.GetInstallDir();
    if (folder.empty()) return 1;
    // What cannot go stays: the game's uninstaller goes on regardless.
    DiscardFile(PathJoin(folder, "corvid.dll"));
    DiscardFile(PathJoin(folder, "GL.ini"));
    DiscardDirectory(PathJoin(folder, "pb"));

    // Nothing below needs the installation data: without it, the game's
    // uninstaller must still get every recorded file removed.
    try {
        installationData.Load(folder);
    } catch (const Exception& error) {
        LOG(Error) << error.message << " Removing what the uninstall record lists all the same.";
    }
    const UpdateLayout layout = MakeUpdateLayout(configuration, folder);
    CleanTemporaryFiles(layout.patchFolder, layout.patchedFilesFolder);
    Uninstaller(PathJoin(folder, kUninstallRecordName)).Remove(folder);
    progressFile.SetDirectory(folder);
    DiscardFile(progressFile.GetRecordPath());
    DiscardFile(progressFile.GetAlternativeRecordPath());
    return 1;
}
