#include "app/updater.h"

#include "base/log.h"

Updater::Updater() { configuration.SetDefaults(); }

int32_t Updater::Run(const UpdaterArguments& args) {
    arguments = args;
    // The modes (component removal, settings removal, uninstall clean-up
    // and the update itself) arrive with the updater run; until then a run
    // ends here as a mode that ran to its end.
    LOG_AS("Updater", Info) << "No updater mode is available in this build yet.";
    return 1;
}
